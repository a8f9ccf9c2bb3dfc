// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Times.h"

#include <cstdlib>
#include <ctime>
#include <string>

#include <gtest/gtest.h>

namespace {

using namespace std::chrono_literals;
using kvloam::readDate;
using kvloam::Seconds;

std::int64_t secondsOf(char const* text) {
    auto const date = readDate(text);
    return date ? date->time_since_epoch().count() : -1;
}

TEST(TimesTest, DatesAreReadWithFractionsAndOffsets) {
    EXPECT_EQ(secondsOf("1970-01-01T00:00:00Z"), 0);
    EXPECT_EQ(secondsOf("2026-11-22T17:20:03Z"), 1795368003);
    EXPECT_EQ(secondsOf("2026-11-22T17:20:03.250Z"), 1795368003);
    EXPECT_EQ(secondsOf("2026-11-22T18:20:03+01:00"), 1795368003);
    EXPECT_EQ(secondsOf("2026-11-22t15:50:03-01:30"), 1795368003);
}

TEST(TimesTest, WhatIsNoDateIsNotRead) {
    for (char const* text :
         {"", "yesterday", "2026-11-22", "2026-11-22T17:20Z", "2026-13-01T00:00:00Z",
          "2026-02-30T00:00:00Z", "2026-11-22T24:00:00Z", "2026-11-22T17:20:03",
          "2026-11-22T17:20:03.Z", "2026-11-22T17:20:03Zx", "2026-11-22T17:20:03+1:00",
          "2026-11-22T17:20:03+24:00", "+026-11-22T17:20:03Z", "2026-1 -22T17:20:03Z"})
        EXPECT_FALSE(readDate(text)) << text;
}

TEST(TimesTest, SpansHaveOneUnit) {
    EXPECT_EQ(kvloam::spanText(0s), "0 s");
    EXPECT_EQ(kvloam::spanText(-5s), "0 s");
    EXPECT_EQ(kvloam::spanText(119s), "119 s");
    EXPECT_EQ(kvloam::spanText(120s), "2 min");
    EXPECT_EQ(kvloam::spanText(7199s), "119 min");
    EXPECT_EQ(kvloam::spanText(2h), "2 h");
    EXPECT_EQ(kvloam::spanText(47h), "47 h");
    EXPECT_EQ(kvloam::spanText(48h), "2 d");
}

TEST(TimesTest, DatesAreShownInLocalTimeWithTheirAge) {
    setenv("TZ", "XYZ-2", 1); // two hours ahead of UTC
    tzset();
    auto const date = *readDate("2026-11-22T23:00:00Z");
    EXPECT_EQ(kvloam::localDate(date), "2026-11-23 01:00:00");
    EXPECT_EQ(kvloam::localTime(date), "01:00");
    EXPECT_EQ(kvloam::dateWithAge(date, date + 5min), "2026-11-23 01:00:00 (5 min ago)");
    unsetenv("TZ");
    tzset();
}

} // namespace
