// SPDX-License-Identifier: BSD-2-Clause
// Texts for a terminal: what may be sent to it, and how much room it takes there.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace kvloam {

/// `text` as one line that is safe to print, in UTF-8. Line ends and tabs become blanks; other
/// control characters, those that change the direction of writing, and what is not UTF-8 become
/// "?". Agents and their boards choose texts; they must not control the terminal.
std::string printable(std::string_view text);
/// The same in ASCII, for terminals without UTF-8.
std::string printableAscii(std::string_view text);

/// How many columns of a terminal `text` takes. Requires: it is printable.
std::size_t width(std::string_view text);
/// `text` in at most `columns` columns. A text that does not fit ends with `mark`. Requires: both
/// are printable, and `mark` is one column wide.
std::string cut(std::string_view text, std::size_t columns, std::string_view mark);

} // namespace kvloam
