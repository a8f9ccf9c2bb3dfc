// SPDX-License-Identifier: BSD-2-Clause
// The agent through a master, as clients see it.
#include <algorithm>
#include <csignal>
#include <iterator>
#include <regex>

#include <gmock/gmock.h>

#include "agent/daemon/Options.h"
#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr char kAll[] = "1.3.6.1.4.1.32473";
constexpr char kProcesses[] = "1.3.6.1.4.1.32473.1.1.7";
constexpr char kSysUpTime[] = "1.3.6.1.2.1.1.3.0";
constexpr char kDiscontinuity[] = "1.3.6.1.2.1.31.1.1.1.19.1000";
constexpr char kEntityChange[] = "1.3.6.1.2.1.47.1.4.1.0";
constexpr char kStackChange[] = "1.3.6.1.2.1.31.1.6.0";
constexpr char kSystemContact[] = "1.3.6.1.2.1.1.4.0";

class SubagentTest : public MasterFixture {
  protected:
    /// The lines of a walk, sorted, without those that differ between starts: dates and processes.
    std::vector<std::string> walkedLines() const {
        static std::regex const date("[0-9]+-[0-9]+-[0-9]+,[0-9]+:[0-9]+:[0-9.]+");
        std::vector<std::string> lines;
        for (Answer const& answer : walk(kAll)) {
            if (std::is_gteq(compare(answer.name, *parseOid(kProcesses)))) break;
            std::string line;
            for (std::uint32_t const number : answer.name)
                line += "." + std::to_string(number);
            lines.push_back(line + " = " + std::regex_replace(answer.value, date, "a date"));
        }
        std::ranges::sort(lines);
        return lines;
    }
    /// The lines that are in only one of two sorted lists.
    static std::vector<std::string> differences(std::vector<std::string> const& one,
                                                std::vector<std::string> const& other) {
        std::vector<std::string> found;
        std::ranges::set_symmetric_difference(one, other, std::back_inserter(found));
        return found;
    }
    void start() {
        configureMaster("sysContact the host's own\n");
        startMaster();
        startSubagent();
        ASSERT_TRUE(isConnected()) << agent().output();
    }
    /// Whether the master serves none of our objects.
    bool namesAreGone() const {
        auto const answered = walk(kObjects);
        return answered.empty() || answered.front().value.starts_with("No Such");
    }
};

TEST_F(SubagentTest, WalkThroughTheMasterEqualsTheWalkOfAStandAloneAgent) {
    startAgent();
    auto const alone = walkedLines();
    ASSERT_THAT(alone, SizeIs(::testing::Gt(100)));
    ASSERT_EQ(stopAgent(), 0) << agent().output();
    startMaster();
    askMaster();
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_THAT(differences(walkedLines(), alone), IsEmpty());
}

TEST_F(SubagentTest, FirstOfOurNamesComesAfterAllThatAreBefore) {
    start();
    auto const walked = walk(kObjects);
    ASSERT_THAT(walked, Not(IsEmpty()));
    for (char const* const before : {"1.3.6.1.4.1.32472.9", kAll, kObjects})
        EXPECT_THAT(answers("snmpgetnext", {before}), ElementsAre(walked.front())) << before;
}

TEST_F(SubagentTest, BulkWalkEqualsTheWalk) {
    start();
    EXPECT_EQ(answers("snmpbulkwalk", {"-Cr20", kBoards}), walk(kBoards));
}

TEST_F(SubagentTest, SingleRequestsAnswerByName) {
    start();
    EXPECT_EQ(get("kvlBoardSerialNumber.2"), "STRING: QL-77-0420");
    EXPECT_THAT(get("kvlBoardSerialNumber.77"), HasSubstr("No Such Instance"));
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: started(3)");
}

TEST_F(SubagentTest, WritingIsRefused) {
    configureMaster("rwcommunity private 127.0.0.1\n");
    startMaster();
    startSubagent();
    ASSERT_TRUE(isConnected());
    Result const result = snmp(
        "snmpset", {"-v2c", "-c", "private", "-t", "30", address(), "kvlBoardStatus.1", "i", "4"});
    EXPECT_THAT(result.output, HasSubstr("notWritable"));
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: started(3)");
}

TEST_F(SubagentTest, ObjectsOfTheMasterRemain) {
    start();
    EXPECT_THAT(get(kSystemContact), HasSubstr("the host's own"));
    EXPECT_THAT(walk("1.3.6.1.2.1.1"), Not(IsEmpty()));
}

TEST_F(SubagentTest, MasterListsOurModulesWhileWeAreThere) {
    start();
    auto const isListed = [this](std::string const& id) {
        auto const rows = walk("1.3.6.1.2.1.1.9.1.2");
        return std::ranges::find(rows, "OID: " + id, &Answer::value) != rows.end();
    };
    for (char const* const id : {".1.3.6.1.4.1.32473.1.3.1", ".1.3.6.1.4.1.32473.1",
                                 ".1.3.6.1.2.1.10.18", ".1.3.6.1.2.1.131"})
        EXPECT_TRUE(eventually([&] { return isListed(id); })) << id;
    EXPECT_EQ(stopAgent(), 0);
    EXPECT_TRUE(eventually([&] { return !isListed(".1.3.6.1.2.1.10.18"); }));
}

TEST_F(SubagentTest, WhatBeganWithTheAgentSaysSoOnTheMastersClock) {
    start();
    auto const ticks = [this](char const* name) {
        std::string const value = get(name);
        auto const open = value.find('(');
        return open == std::string::npos ? -1 : std::stol(value.substr(open + 1));
    };
    EXPECT_EQ(stopAgent(), 0);
    // The master has run for longer than the agent from now on.
    ASSERT_TRUE(eventually([&] { return ticks(kSysUpTime) > 200; }));
    long const before = ticks(kSysUpTime);
    startSubagent();
    ASSERT_TRUE(isConnected());
    ASSERT_TRUE(eventually([&] { return ticks(kDiscontinuity) >= 0; }));
    long const after = ticks(kSysUpTime);
    for (char const* const name : {kDiscontinuity, kEntityChange, kStackChange}) {
        // Its answer, when it opens the session, carries the master's time.
        EXPECT_TRUE(eventually([&] { return ticks(name) >= before - 50; })) << ticks(name);
        EXPECT_LE(ticks(name), after + 50) << name;
    }
}

TEST_F(SubagentTest, ChangesOfBoardsShow) {
    start();
    sim({"remove", "2"});
    EXPECT_TRUE(eventually(
        [this] { return get("kvlBoardName.2").find("No Such Instance") != std::string::npos; }));
}

TEST_F(SubagentTest, NamesVanishWhenTheAgentStops) {
    start();
    ASSERT_FALSE(namesAreGone());
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_TRUE(eventually([this] { return namesAreGone(); }));
    EXPECT_THAT(get(kSystemContact), HasSubstr("the host's own"));
}

TEST_F(SubagentTest, NamesVanishWhenTheAgentIsKilled) {
    start();
    agent().signal(SIGKILL);
    agent().wait();
    EXPECT_TRUE(eventually([this] { return namesAreGone(); }));
}

TEST_F(SubagentTest, SocketOfTheLoopbackNetworkServesToo) {
    useMasterAddress("tcp:127.0.0.1:" + std::to_string(freePort()));
    start();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(SubagentTest, SecondAgentIsRefusedAndSaysSoOnce) {
    start();
    setVariable("KVLSIM_SOCKET", path("second.sock"));
    Process second({KVLOAMD, "--agentx", path("master.sock"), "--module", "z7sim", "--module-dir",
                    moduleDirectory(), "--log-level", "debug", "--persistent-dir", path("second")},
                   environment());
    ASSERT_TRUE(second.waitFor("no connection to the SNMP master at")) << second.output();
    EXPECT_THAT(second.output(), HasSubstr("another agent serves them already"));
    // It keeps retrying, which is logged at debug level only.
    ASSERT_TRUE(second.waitFor("refuses the agent's names", 2)) << second.output();
    EXPECT_EQ(count(second.output(), "no connection to the SNMP master at"), 1);
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(SubagentTest, PortOfItsOwnIsRefused) {
    Result const result = runAgent({"--agentx", path("master.sock"), "--port", "1161"});
    EXPECT_EQ(result.status, kExitUsage);
    EXPECT_THAT(linesOf(result.output), ElementsAre(HasSubstr("--agentx excludes --port")));
}

/// The hundredths in an answer such as "Timeticks: (518) 0:00:05.18".
unsigned long ticksIn(std::string const& value) {
    auto const bracket = value.find('(');
    return bracket == std::string::npos ? 0 : std::stoul(value.substr(bracket + 1));
}

TEST_F(SubagentTest, TimesOfChangeAreValuesOfTheMastersSysUpTime) {
    constexpr char sysUpTime[] = "1.3.6.1.2.1.1.3.0";
    startMaster();
    // Long enough for the two start times to be told apart.
    ASSERT_TRUE(eventually([&] { return ticksIn(get(sysUpTime)) > 300; }));
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    unsigned long const before = ticksIn(get(sysUpTime));
    sim({"stop", "1"});
    EXPECT_TRUE(eventually([this] { return get("kvlBoardStatus.1") == "INTEGER: stopped(4)"; }));
    auto const when = [this] { return ticksIn(get("kvlBoardTableLastChange.0")); };
    // A few hundredths are the way of the master's answer. If it was late, the next one mends it.
    EXPECT_TRUE(eventually([&] { return when() + 20 >= before; })) << when();
    EXPECT_LE(when(), ticksIn(get(sysUpTime)) + 20);
    EXPECT_LT(ticksIn(get("kvlAgentUpTime.0")) + 250, ticksIn(get(sysUpTime)));
}

} // namespace
} // namespace kvloamd::e2e
