// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Summary.h"

#include <algorithm>
#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/cli/Samples.h"

namespace {

using kvloam::Overview;
using kvloam::readAnswer;
using kvloam::Screen;
using testing::HasSubstr;

Overview sampleOverview() {
    return {readAnswer(samples::kHealth), readAnswer(samples::kBoards), readAnswer(samples::kLines),
            readAnswer(samples::kAlarms)};
}

std::string print(Overview const& overview, Screen const& screen = {}) {
    std::ostringstream out;
    kvloam::printOverview({out, screen, kvloam::timeOf(overview.health)}, overview);
    return out.str();
}

TEST(SummaryTest, EverythingIsCounted) {
    EXPECT_THAT(print(sampleOverview()),
                testing::StartsWith("host    gw1\n"
                                    "agent   version 0.1.0, up 2 h, read 0.4 s ago\n"
                                    "boards  2: 1 started, 1 failed\n"
                                    "lines   2: 1 without alarm, 1 with alarm\n"
                                    "alarms  2: 1 critical, 1 minor\n"));
}

TEST(SummaryTest, WhatIsWrongIsListed) {
    std::string const text = print(sampleOverview());
    EXPECT_THAT(text, HasSubstr("\nAlarms\n"));
    EXPECT_THAT(text, HasSubstr("\nBoards that are not started\n"));
    EXPECT_THAT(text, HasSubstr("Z70002"));
    EXPECT_THAT(text, HasSubstr("LossOfSignal"));
    EXPECT_EQ(text.find("NoAlarm"), std::string::npos);
}

TEST(SummaryTest, WhereNothingIsWrongTheCountsAreAll) {
    auto overview = sampleOverview();
    overview.alarms = readAnswer(samples::kNoAlarms);
    overview.boards = readAnswer(samples::answer("\"boards\":[" + samples::kGoodBoard + "]"));
    overview.lines = readAnswer(samples::answer("\"lines\":[]"));
    EXPECT_EQ(print(overview), "host    gw1\n"
                               "agent   version 0.1.0, up 2 h, read 0.4 s ago\n"
                               "boards  1: 1 started\n"
                               "lines   none\n"
                               "alarms  none\n");
}

TEST(SummaryTest, TheAgentsOwnTroubleIsNamed) {
    auto overview = sampleOverview();
    overview.health["health"]["masterState"] = "lost";
    overview.health["health"]["persistence"] = "failing";
    overview.health["health"]["notificationsDropped"] = 3;
    EXPECT_THAT(print(overview),
                HasSubstr("SNMP master lost, persistence failing, 3 notifications dropped\n"));
}

TEST(SummaryTest, ItFitsTheScreen) {
    auto overview = sampleOverview();
    auto& alarms = overview.alarms["alarms"];
    for (int i = 0; i < 100; ++i)
        alarms.push_back(kvloam::Json(alarms.front()));
    Screen screen;
    screen.width = 80;
    for (std::size_t height : {5U, 12U, 24U, 50U}) {
        screen.height = height;
        std::string const text = print(overview, screen);
        EXPECT_LE(static_cast<std::size_t>(std::ranges::count(text, '\n')),
                  std::max<std::size_t>(height, 8));
    }
    EXPECT_THAT(print(overview, screen), HasSubstr("more, see: kvloam alarms\n"));
}

} // namespace
