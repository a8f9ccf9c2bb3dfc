// SPDX-License-Identifier: BSD-2-Clause
#include "PingInterval.h"

#include <cstdio>
#include <cstring>

#include <charconv>

#include "z7/Z7BoardFactory.h"

int readPingInterval(char const* text) {
    if (text == nullptr) return Z7BoardFactory::kDefaultPingInterval;
    char const* const end = text + std::strlen(text);
    int seconds = 0;
    auto const [rest, error] = std::from_chars(text, end, seconds);
    if (error == std::errc() && rest == end && seconds >= 0) return seconds;
    std::fprintf(stderr,
                 "z7sim: %s is \"%s\"; write a number of whole seconds, 0 for no pings. "
                 "Boards are pinged every %d seconds.\n",
                 kPingIntervalVariable, text, Z7BoardFactory::kDefaultPingInterval);
    return Z7BoardFactory::kDefaultPingInterval;
}
