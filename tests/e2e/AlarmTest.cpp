// SPDX-License-Identifier: BSD-2-Clause
// The tables of alarms.
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class AlarmTest : public AgentFixture {
  protected:
    static constexpr char kActiveDescription[] = "1.3.6.1.2.1.118.1.2.2.1.11";
    static constexpr char kClearLogIndex[] = "1.3.6.1.2.1.118.1.3.2.1.9";

    /// The values of a column, in the order of its rows.
    std::vector<std::string> column(std::string const& name) const {
        std::vector<std::string> values;
        for (Answer const& answer : walk(name))
            if (!answer.value.starts_with("No Such")) values.push_back(answer.value);
        return values;
    }
};

TEST_F(AlarmTest, FailedBoardIsAnActiveAlarmAndThenACleared) {
    startAgent();
    EXPECT_THAT(column("kvlAlarmKind"), IsEmpty());
    sim({"fail", "2"});
    ASSERT_TRUE(eventually([this] { return column("kvlAlarmKind").size() == 1; }));
    EXPECT_THAT(column("kvlAlarmKind"), ElementsAre("STRING: boardFailed"));
    EXPECT_THAT(column("kvlAlarmSeverity"), ElementsAre("INTEGER: critical(3)"));
    EXPECT_THAT(column("kvlAlarmBoardIndex"), ElementsAre("INTEGER: 2"));
    EXPECT_THAT(column("kvlAlarmIfIndex"), IsEmpty());
    EXPECT_THAT(column(kActiveDescription),
                ElementsAre(HasSubstr("boardFailed on board QL-77-0420: ")));
    auto const active = walk(kActiveDescription);
    auto const number = walk("kvlAlarmKind");
    EXPECT_EQ(active.front().name.back(), number.front().name.back());
    sim({"start", "2"});
    EXPECT_TRUE(eventually([this] { return column("kvlAlarmKind").empty(); }));
    EXPECT_THAT(column(kActiveDescription), IsEmpty());
    auto const cleared = walk(kClearLogIndex);
    ASSERT_THAT(cleared, SizeIs(1));
    EXPECT_EQ(cleared.front().name.back(), active.front().name.back());
}

TEST_F(AlarmTest, LineWithoutSignalIsOneAlarm) {
    // However long the line takes to declare its failure.
    startAgent({"--alarm", "platformFault=indeterminate,raise=3600"});
    sim({"line", "alarm", "101", "los"});
    ASSERT_TRUE(agent().waitFor("dsx1UnavailSigState on board NX50001, T1 line nx5-trunk-1 follows "
                                "from dsx1LossOfSignal on board NX50001, T1 line nx5-trunk-1"));
    EXPECT_TRUE(agent().waitFor("platformFault on board NX50001 (fault 256) follows from "
                                "dsx1LossOfSignal on board NX50001, T1 line nx5-trunk-1"));
    EXPECT_TRUE(agent().waitFor("platformFault on board NX50001 (fault 257) follows from "
                                "dsx1LossOfFrame on board NX50001, T1 line nx5-trunk-1"));
    EXPECT_TRUE(agent().waitFor("dsx1LossOfFrame on board NX50001, T1 line nx5-trunk-1 follows"));
    // The log has it before requests are answered from it.
    EXPECT_TRUE(eventually([this] { return get("kvlAlarmCount.0") == "Gauge32: 1 alarms"; }));
    EXPECT_EQ(get("kvlAlarmsRaised.0"), "Counter32: 1 alarms");
    EXPECT_THAT(column("kvlAlarmKind"), ElementsAre("STRING: dsx1LossOfSignal"));
    sim({"line", "mend", "101"});
    EXPECT_TRUE(agent().waitFor("alarm cleared: critical dsx1LossOfSignal"));
    EXPECT_TRUE(eventually([this] { return column("kvlAlarmKind").empty(); }));
    EXPECT_EQ(get("kvlAlarmsRaised.0"), "Counter32: 1 alarms");
}

TEST_F(AlarmTest, ModelDescribesEveryKind) {
    startAgent();
    EXPECT_THAT(column("1.3.6.1.2.1.118.1.1.2.1.6"),
                Contains(EndsWith("\"linkDown (major): the interface is down although "
                                  "nobody switched it off\"")));
}

TEST_F(AlarmTest, AlarmIsTheSameAfterARestart) {
    startAgent();
    sim({"fail", "2"});
    ASSERT_TRUE(eventually([this] { return column("kvlAlarmKind").size() == 1; }));
    auto const before = walk(kActiveDescription);
    EXPECT_EQ(stopAgent(), 0);
    useChassis(
        "boards:\n"
        "  - {handle: 2, attributes: {SERIAL_NUMBER: \"QL-77-0420\", BOARD_CONDITION: 15}}\n");
    startAgent();
    EXPECT_EQ(walk(kActiveDescription).front().name, before.front().name);
}

TEST_F(AlarmTest, AlarmWhoseCauseHasGoneDuringARestartIsCleared) {
    startAgent();
    sim({"fail", "2"});
    ASSERT_TRUE(eventually([this] { return column("kvlAlarmKind").size() == 1; }));
    agent().signal(SIGKILL);
    agent().wait();
    startAgent();
    EXPECT_THAT(column("kvlAlarmKind"), IsEmpty());
    EXPECT_THAT(walk(kClearLogIndex), SizeIs(1));
}

TEST_F(AlarmTest, BoardThatHasGoneIsStillMissedAfterARestart) {
    startAgent();
    sim({"remove", "2"});
    ASSERT_TRUE(eventually([this] { return column("kvlAlarmKind").size() == 1; }));
    EXPECT_EQ(stopAgent(), 0);
    useChassis("boards:\n  - {handle: 7, attributes: {SERIAL_NUMBER: \"S7\"}}\n");
    startAgent();
    EXPECT_THAT(column("kvlAlarmKind"), ElementsAre("STRING: boardGone"));
}

TEST_F(AlarmTest, SeverityIsConfiguredAndReadAgain) {
    auto const configure = [this](std::string const& policy) {
        write(path("kvloamd.toml"), "alarm = [\"boardFailed=" + policy + "\"]\n");
    };
    configure("minor");
    startAgent({"--config", path("kvloamd.toml")});
    sim({"fail", "2"});
    ASSERT_TRUE(eventually([this] { return column("kvlAlarmSeverity").size() == 1; }));
    EXPECT_THAT(column("kvlAlarmSeverity"), ElementsAre("INTEGER: minor(5)"));
    configure("warning");
    agent().signal(SIGHUP);
    EXPECT_TRUE(eventually([this] {
        return column("kvlAlarmSeverity") == std::vector<std::string>{"INTEGER: warning(6)"};
    }));
    configure("loud");
    agent().signal(SIGHUP);
    EXPECT_TRUE(agent().waitFor("kvloamd.toml:1: "));
    EXPECT_THAT(column("kvlAlarmSeverity"), ElementsAre("INTEGER: warning(6)"));
    configure("off");
    agent().signal(SIGHUP);
    EXPECT_TRUE(eventually([this] { return column("kvlAlarmSeverity").empty(); }));
}

} // namespace
} // namespace kvloamd::e2e
