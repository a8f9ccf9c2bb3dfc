// SPDX-License-Identifier: BSD-2-Clause
// Text for messages.
#include "simulator/base/Text.h"

#include <algorithm>

namespace kvlsim {

std::string oneLine(std::string text) {
    std::ranges::replace_if(text, isControl, '?');
    return text;
}

std::string inQuotes(std::string_view text) {
    constexpr std::size_t longest = 60;
    std::string result(1, '"');
    result += oneLine(std::string(text.substr(0, longest)));
    result += text.size() > longest ? "...\"" : "\"";
    return result;
}

void appendToList(std::string& list, std::string_view word) {
    if (!list.empty()) list += ", ";
    list += word;
}

} // namespace kvlsim
