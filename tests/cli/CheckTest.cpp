// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Check.h"

#include <algorithm>
#include <regex>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/cli/Samples.h"

namespace {

using kvloam::check;
using kvloam::CheckLimits;
using kvloam::Overview;
using kvloam::PluginState;
using kvloam::readAnswer;
using testing::HasSubstr;

Overview sample(std::string const& alarms) {
    return {readAnswer(samples::kHealth), readAnswer(samples::kBoards), readAnswer(samples::kLines),
            readAnswer(alarms)};
}

std::string alarm(std::string const& severity) {
    return samples::answer(R"("alarms":[{"severity":")" + severity +
                           R"(","kind":"k","resource":"r","text":"t"}])");
}

TEST(CheckTest, WithoutAlarmsAllIsGood) {
    auto const result = check(sample(samples::kNoAlarms), {});
    EXPECT_EQ(result.state, PluginState::Ok);
    EXPECT_EQ(result.text,
              "KVLOAM OK: no alarms, 2 boards, 2 lines | boards=2;;;0 boards_failed=1;;;0 "
              "boards_not_started=0;;;0 lines=2;;;0 lines_failed=1;;;0 alarms=0;;;0 "
              "alarms_critical=0;;;0 alarms_major=0;;;0 alarms_minor=0;;;0 alarms_warning=0;;;0 "
              "alarms_indeterminate=0;;;0 age=0.4s;;;0\n");
}

TEST(CheckTest, TheGravestAlarmDecides) {
    auto const result = check(sample(samples::kAlarms), {});
    EXPECT_EQ(result.state, PluginState::Critical);
    EXPECT_THAT(result.text,
                testing::StartsWith("KVLOAM CRITICAL: 2 alarms, critical boardFailed on board "
                                    "Z70002, 2 boards, 2 lines | "));
    EXPECT_THAT(result.text, HasSubstr("\ncritical boardFailed on board Z70002: the board has "
                                       "failed\nminor dsx1RcvFarEndLOF on "));
}

TEST(CheckTest, LimitsChooseTheState) {
    auto const state = [](char const* severity, CheckLimits const& limits = {}) {
        return check(sample(alarm(severity)), limits).state;
    };
    EXPECT_EQ(state("indeterminate"), PluginState::Warning);
    EXPECT_EQ(state("minor"), PluginState::Warning);
    EXPECT_EQ(state("major"), PluginState::Critical);
    EXPECT_EQ(state("warning", {"minor", "critical"}), PluginState::Ok);
    EXPECT_EQ(state("major", {"minor", "critical"}), PluginState::Warning);
    EXPECT_EQ(state("critical", {"minor", "critical"}), PluginState::Critical);
}

TEST(CheckTest, AnOldSnapshotIsCritical) {
    auto overview = sample(samples::kNoAlarms);
    overview.health["ageSeconds"] = 61.0;
    auto const result = check(overview, {});
    EXPECT_EQ(result.state, PluginState::Critical);
    EXPECT_THAT(result.text, HasSubstr("boards were read 61 s ago"));
    EXPECT_EQ(check(overview, {"minor", "major", 100}).state, PluginState::Ok);
}

TEST(CheckTest, OnlyTheAgentWritesPerformanceData) {
    auto const text =
        check(sample(samples::answer(
                  R"("alarms":[{"severity":"minor","kind":"a|b=1","resource":"x\ny"}])")),
              {})
            .text;
    EXPECT_THAT(text, HasSubstr("minor a/b=1 on x y"));
    EXPECT_EQ(std::ranges::count(text, '|'), 1);
}

TEST(CheckTest, PerformanceDataHasTheFormOfThePlugins) {
    std::string const text = check(sample(samples::kAlarms), {}).text;
    std::string const first = text.substr(0, text.find('\n'));
    EXPECT_TRUE(std::regex_match(
        first, std::regex(R"(KVLOAM [A-Z]+: [^|]+ \|( [a-z_]+=[0-9]+(\.[0-9]+)?s?;;;0)+)")))
        << first;
}

TEST(CheckTest, ManyAlarmsAreCounted) {
    auto overview = sample(samples::kAlarms);
    for (int i = 0; i < 30; ++i)
        overview.alarms["alarms"].push_back(kvloam::Json(overview.alarms["alarms"].front()));
    std::string const text = check(overview, {}).text;
    EXPECT_EQ(std::ranges::count(text, '\n'), 22);
    EXPECT_THAT(text, testing::EndsWith("and 12 more\n"));
}

} // namespace
