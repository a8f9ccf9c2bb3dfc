// SPDX-License-Identifier: BSD-2-Clause
// Text for messages.
#include "simulator/base/Text.h"

#include <algorithm>

namespace kvlsim {

namespace {

char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

/// How many letters must be inserted, removed, changed or swapped with the next; case is ignored.
std::size_t distance(std::string_view one, std::string_view other) {
    std::vector<std::vector<std::size_t>> steps(one.size() + 1,
                                                std::vector<std::size_t>(other.size() + 1));
    for (std::size_t i = 0; i <= one.size(); ++i) {
        for (std::size_t j = 0; j <= other.size(); ++j) {
            std::size_t& least = steps[i][j];
            if (i == 0 || j == 0) {
                least = i + j;
                continue;
            }
            bool const same = lower(one[i - 1]) == lower(other[j - 1]);
            least = std::min(
                {steps[i - 1][j] + 1, steps[i][j - 1] + 1, steps[i - 1][j - 1] + (same ? 0 : 1)});
            if (i > 1 && j > 1 && lower(one[i - 1]) == lower(other[j - 2]) &&
                lower(one[i - 2]) == lower(other[j - 1]))
                least = std::min(least, steps[i - 2][j - 2] + 1);
        }
    }
    return steps[one.size()][other.size()];
}

} // namespace

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

std::string nearestWord(std::string_view word, std::vector<std::string> const& words) {
    constexpr std::size_t longest = 64;
    if (word.size() > longest) return {};
    std::size_t least = word.size() > 4 ? 2 : 1;
    std::string nearest;
    for (auto const& each : words) {
        if (each.size() > word.size() + least || word.size() > each.size() + least) continue;
        std::size_t const steps = distance(word, each);
        if (steps > least || (steps == least && !nearest.empty())) continue;
        least = steps;
        nearest = each;
    }
    return nearest;
}

} // namespace kvlsim
