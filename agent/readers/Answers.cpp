// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Answers.h"

#include <cinttypes>
#include <cstdio>
#include <ctime>
#include <initializer_list>

namespace kvloamd {

std::string printable(std::string_view text) {
    std::string served(text.substr(0, kLongestText));
    for (char& character : served)
        if (character < ' ' || character > '~') character = '?';
    return served;
}

std::string dateOctets(long seconds) {
    if (seconds <= 0) return {};
    std::time_t const time = seconds;
    std::tm local{};
    if (localtime_r(&time, &local) == nullptr || local.tm_year + 1900 > 9999) return {};
    int const year = local.tm_year + 1900;
    long const offset = local.tm_gmtoff < 0 ? -local.tm_gmtoff : local.tm_gmtoff;
    std::string octets;
    for (long const octet :
         {static_cast<long>(year / 256), static_cast<long>(year % 256),
          static_cast<long>(local.tm_mon + 1), static_cast<long>(local.tm_mday),
          static_cast<long>(local.tm_hour), static_cast<long>(local.tm_min),
          static_cast<long>(local.tm_sec), 0L, static_cast<long>(local.tm_gmtoff < 0 ? '-' : '+'),
          offset / 3600, offset / 60 % 60})
        octets.push_back(static_cast<char>(octet));
    return octets;
}

std::string addressText(long address) {
    if (address == -1) return {};
    std::uint64_t const value =
        address < 0 ? static_cast<std::uint32_t>(address) : static_cast<std::uint64_t>(address);
    char text[24];
    std::snprintf(text, sizeof text, "0x%08" PRIx64, value);
    return text;
}

} // namespace kvloamd
