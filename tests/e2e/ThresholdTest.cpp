// SPDX-License-Identifier: BSD-2-Clause
// Limits on what lines may count, and the alarms of lines that cross them.
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

/// kvlThresholdES15m of the first line, which is device 101, and its text in the log.
constexpr char kErroredSeconds[] = "1.3.6.1.4.1.32473.1.1.13.1.1.2.1000";
constexpr char kRaised[] = "alarm raised: warning thresholdES15m on board NX50001, T1 line ";
constexpr char kCleared[] = "alarm cleared: warning thresholdES15m on board NX50001, T1 line ";

class ThresholdTest : public AgentFixture {
  protected:
    ThresholdTest() { configureSnmp("rwcommunity public 127.0.0.1\n"); }

    void configure(std::string const& limits) {
        write(path("kvloamd.toml"), "threshold = [\"t1=" + limits + "\"]\n");
    }
    void startConfigured() { startAgent({"--config", path("kvloamd.toml")}); }
    /// From now on, every second of the first line is an errored one.
    void disturb() { sim({"line", "rates", "101", "--path-violations", "5"}); }
    void set(std::string const& limit) {
        Result const result = ask("snmpset", {kErroredSeconds, "i", limit});
        EXPECT_EQ(result.status, 0) << result.output;
    }
    bool isRaised() const {
        for (Answer const& answer : walk("kvlAlarmKind"))
            if (answer.value == "STRING: thresholdES15m") return true;
        return false;
    }
    bool isRaisedEventually() {
        return eventually([this] { return isRaised(); });
    }
    bool isClearedEventually() {
        return eventually([this] { return !isRaised(); });
    }
};

TEST_F(ThresholdTest, LineThatReachesTheLimitOfItsTypeIsAnAlarm) {
    configure("es15m=3");
    startConfigured();
    EXPECT_EQ(get("kvlThresholdES15m.1000"), "INTEGER: 3 seconds");
    EXPECT_EQ(get("kvlThresholdES24h.1000"), "INTEGER: 0 seconds");
    disturb();
    EXPECT_TRUE(agent().waitFor(kRaised));
    EXPECT_TRUE(isRaisedEventually());
    EXPECT_THAT(agent().output(), HasSubstr("as its limit (limit 3)"));
}

TEST_F(ThresholdTest, NothingIsLimitedUntilItIsConfigured) {
    startAgent();
    EXPECT_EQ(get("kvlThresholdES15m.1000"), "INTEGER: 0 seconds");
    disturb();
    EXPECT_TRUE(eventually([this] {
        std::string const seconds = get("1.3.6.1.2.1.10.18.7.1.2.1000");
        return seconds.starts_with("Gauge32: ") && std::stoi(seconds.substr(9)) >= 3;
    }));
    EXPECT_FALSE(isRaised());
}

TEST_F(ThresholdTest, OwnLimitOverridesThatOfTheTypeAndIsKept) {
    configure("es15m=100000");
    startConfigured();
    disturb();
    set("2");
    EXPECT_EQ(get(kErroredSeconds), "INTEGER: 2 seconds");
    EXPECT_TRUE(isRaisedEventually());
    set("0");
    EXPECT_TRUE(isClearedEventually());
    set("2");
    EXPECT_TRUE(isRaisedEventually());
    // The agent saves a setting before the refresh that follows it ends.
    EXPECT_EQ(stopAgent(), 0);
    startConfigured();
    EXPECT_EQ(get(kErroredSeconds), "INTEGER: 2 seconds");
    set("-1");
    EXPECT_EQ(get(kErroredSeconds), "INTEGER: 100000 seconds");
    EXPECT_TRUE(isClearedEventually());
}

TEST_F(ThresholdTest, OnlyLinesHaveLimits) {
    startAgent();
    EXPECT_THAT(ask("snmpset", {"1.3.6.1.4.1.32473.1.1.13.1.1.2.9", "i", "2"}).output,
                HasSubstr("noCreation"));
}

TEST_F(ThresholdTest, LimitsAreReadAgain) {
    configure("es15m=2");
    startConfigured();
    disturb();
    EXPECT_TRUE(isRaisedEventually());
    configure("es15m=many");
    agent().signal(SIGHUP);
    EXPECT_TRUE(agent().waitFor("kvloamd.toml:1: "));
    EXPECT_TRUE(isRaised());
    configure("es15m=100000");
    agent().signal(SIGHUP);
    EXPECT_TRUE(isClearedEventually());
    EXPECT_TRUE(
        eventually([this] { return get("kvlThresholdES15m.1000") == "INTEGER: 100000 seconds"; }));
}

TEST_F(ThresholdTest, WrongLimitIsFoundByTheCheck) {
    configure("es15m=many");
    Result const result = runAgent({"--check-config", "--config", path("kvloamd.toml")});
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.output, HasSubstr("kvloamd.toml:1: "));
    EXPECT_THAT(result.output, HasSubstr("'es15m=many'"));
}

// The line's past ends half a minute before the end of its second interval, which is good; the
// first one was not.
TEST_F(ThresholdTest, AlarmIsClearedWhenALaterIntervalHasEndedBelowTheLimit) {
    useChassis("boards:\n"
               "  - handle: 1\n"
               "    attributes: {NAME: NX5-T1, SERIAL_NUMBER: \"NX50001\", FAMILY: NX5}\n"
               "    devices:\n"
               "      - handle: 101\n"
               "        type: 501\n"
               "        attributes: {NAME: trunk-1}\n"
               "        line:\n"
               "          type: esf\n"
               "          past:\n"
               "            seconds: 1770\n"
               "            spells: [{ago: 1500, seconds: 20, errors: {path-violations: 3}}]\n");
    configure("es15m=20");
    startConfigured();
    EXPECT_TRUE(agent().waitFor(kRaised));
    EXPECT_TRUE(agent().waitFor(kCleared));
    EXPECT_TRUE(isClearedEventually());
}

} // namespace
} // namespace kvloamd::e2e
