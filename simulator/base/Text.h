// SPDX-License-Identifier: BSD-2-Clause
// Text for messages: one line, quoted, in lists.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace kvlsim {

/// Whether this byte is an ASCII control character.
constexpr bool isControl(char c) {
    return static_cast<unsigned char>(c) < 0x20 || c == 0x7f;
}

/// `text` with its control characters replaced.
std::string oneLine(std::string text);

/// `text` quoted, cut to a readable length and with control characters replaced, fit for one line.
std::string inQuotes(std::string_view text);

/// Appends an item to a list such as "one, two".
void appendToList(std::string& list, std::string_view word);

/// The one of `words` that `word` was probably meant to be; empty when none is near enough.
std::string nearestWord(std::string_view word, std::vector<std::string> const& words);

} // namespace kvlsim
