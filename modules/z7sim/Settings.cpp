// SPDX-License-Identifier: BSD-2-Clause
#include "Settings.h"

#include <cstdio>
#include <cstring>

#include <charconv>
#include <limits>
#include <optional>
#include <string>

#include "z7/Z7BoardFactory.h"

namespace {

std::optional<int> wholeNumber(char const* text, int least, int most) {
    char const* const end = text + std::strlen(text);
    int number = 0;
    auto const [rest, error] = std::from_chars(text, end, number);
    if (error != std::errc() || rest != end || number < least || number > most) return {};
    return number;
}

/// One of the `FailureTimes`. `effect`: what holds without the variable.
int readTime(char const* variable, char const* text, int least, int most, int usual,
             char const* effect) {
    if (text == nullptr) return usual;
    if (auto const time = wholeNumber(text, least, most)) return *time;
    std::fprintf(
        stderr,
        "z7sim: %s is \"%s\"; write a whole number of seconds from %d to %d. %s %d seconds.\n",
        variable, text, least, most, effect, usual);
    return usual;
}

} // namespace

int readPingInterval(char const* text) {
    if (text == nullptr) return Z7BoardFactory::kDefaultPingInterval;
    if (auto const seconds = wholeNumber(text, 0, std::numeric_limits<int>::max())) return *seconds;
    std::fprintf(stderr,
                 "z7sim: %s is \"%s\"; write a number of whole seconds, 0 for no pings. "
                 "Boards are pinged every %d seconds.\n",
                 kPingIntervalVariable, text, Z7BoardFactory::kDefaultPingInterval);
    return Z7BoardFactory::kDefaultPingInterval;
}

FailureTimes readFailureTimes(char const* declaration, char const* clearing) {
    constexpr FailureTimes usual;
    return {readTime(kFailureDeclarationVariable, declaration, FailureTimes::kShortestDeclaration,
                     FailureTimes::kLongestDeclaration, usual.declaration,
                     "Defects become failures after"),
            readTime(kFailureClearingVariable, clearing, 0, FailureTimes::kLongestClearing,
                     usual.clearing, "Failures end after")};
}
