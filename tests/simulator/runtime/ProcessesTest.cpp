// SPDX-License-Identifier: BSD-2-Clause
// The runtime library: which processes it lists, what they count, and the commands for them.
#include <unistd.h>

#include <array>
#include <chrono>
#include <csignal>
#include <fstream>
#include <limits>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "boardplatform/kpx.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/NamedProcess.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

std::chrono::nanoseconds s_now{};

class ProcessesTest : public testing::Test {
  protected:
    ProcessesTest() {
        s_now = std::chrono::hours(1);
        kvlsim::loadChassis("boards: []\nprocesses: []\n");
        kvlsim::setCounterClock([] { return s_now; });
    }
    ~ProcessesTest() override {
        kvlsim::loadChassis("boards: []\nprocesses: []\n");
        kvlsim::setCounterClock(nullptr);
    }

    static std::vector<int> pids(int max = 200) {
        std::vector<int> list(static_cast<std::size_t>(max), -7);
        int const count = _kp_getpids(list.data(), max);
        list.resize(static_cast<std::size_t>(count));
        return list;
    }
    static tag_KPXSTATISTICS statistics(int pid) {
        tag_KPXSTATISTICS record{};
        EXPECT_EQ(_kp_getstatsbypid(pid, &record), 0);
        return record;
    }
    static bool known(int pid) {
        tag_KPXSTATISTICS record{};
        return _kp_getstatsbypid(pid, &record) != -1;
    }
    static int add(sim::Json command) {
        command["command"] = "process-add";
        return sim::command(command).value("pid", 0);
    }
    static std::string refusal(std::string const& command) {
        sim::Json const reply = kvlsim::execute(sim::Json::parse(command));
        EXPECT_EQ(reply["ok"], false) << command << " -> " << reply;
        return reply.value("error", "");
    }
};

TEST_F(ProcessesTest, ProcessItselfIsListedUnlessTheChassisSaysOtherwise) {
    kvlsim::loadChassis("boards: []\n");
    EXPECT_THAT(pids(), ElementsAre(getpid()));
    EXPECT_STREQ(statistics(getpid()).name, "kvlsim_store_test");
}

TEST_F(ProcessesTest, ChassisWithoutProcessesListsNone) {
    EXPECT_THAT(pids(), IsEmpty());
    EXPECT_FALSE(known(getpid()));
}

TEST_F(ProcessesTest, ChassisStartsItsChildren) {
    kvlsim::loadChassis("boards: []\nprocesses:\n  - {kind: self}\n"
                        "  - {kind: child, name: /opt/bin/one}\n  - {kind: child, name: two}\n");
    auto const list = pids();
    ASSERT_EQ(list.size(), 3U);
    EXPECT_EQ(list[0], getpid());
    EXPECT_STREQ(statistics(list[1]).name, "one");
    EXPECT_STREQ(statistics(list[2]).name, "two");
}

TEST_F(ProcessesTest, NewChassisEndsTheChildrenOfTheOldOne) {
    int const child = add({{"name", "child"}});
    kvlsim::loadChassis("boards: []\n");
    EXPECT_EQ(kill(child, 0), -1);
}

TEST_F(ProcessesTest, AddedChildRunsUnderItsName) {
    int const child = add({{"name", "/opt/app/bin/call-server"}});
    EXPECT_EQ(kill(child, 0), 0);
    EXPECT_THAT(pids(), ElementsAre(child));
    EXPECT_STREQ(statistics(child).name, "call-server");
}

TEST_F(ProcessesTest, LongNameFillsItsField) {
    int const child = add({{"name", std::string(40, 'n')}});
    tag_KPXSTATISTICS const record = statistics(child);
    EXPECT_EQ(std::string(record.name, sizeof record.name), std::string(32, 'n'));
    EXPECT_EQ(record.reserved1, 0);
}

TEST_F(ProcessesTest, EndedChildIsNeitherListedNorKnown) {
    int const child = add({{"name", "child"}});
    sim::command({{"command", "process-end"}, {"pid", child}});
    EXPECT_THAT(pids(), IsEmpty());
    EXPECT_FALSE(known(child));
    EXPECT_EQ(kill(child, 0), -1);
}

TEST_F(ProcessesTest, KilledChildIsNeitherListedNorKnown) {
    int const child = add({{"name", "child"}});
    ASSERT_EQ(kill(child, SIGKILL), 0);
    siginfo_t info{};
    ASSERT_EQ(waitid(P_PID, static_cast<id_t>(child), &info, WEXITED | WNOWAIT), 0);
    EXPECT_FALSE(known(child));
    EXPECT_THAT(pids(), IsEmpty());
}

TEST_F(ProcessesTest, ChildrenOfOneNameEndTogether) {
    add({{"name", "/opt/bin/child"}});
    add({{"name", "child"}});
    int const other = add({{"name", "other"}});
    EXPECT_EQ(sim::command({{"command", "process-end"}, {"name", "child"}})["ended"], 2);
    EXPECT_THAT(pids(), ElementsAre(other));
}

TEST_F(ProcessesTest, ChildEndsWithTheProcessThatStartedItHoweverThatEnds) {
    support::ChildProcess holder({KVLSIM_PLATFORM_HOLDER}, {});
    ASSERT_EQ(holder.readLine(), "ready");
    holder.writeLine("child orphan");
    std::string const line = holder.readLine();
    ASSERT_EQ(line.substr(0, 6), "child ") << line;
    int const child = std::stoi(line.substr(6));
    ASSERT_EQ(kill(child, 0), 0);
    holder.kill();
    holder.finish();
    // It has another parent now, which reaps it at a time of its own.
    auto const running = [child] {
        std::string const path = "/proc/" + std::to_string(child) + "/cmdline";
        std::ifstream file(path);
        return file.peek() != std::ifstream::traits_type::eof();
    };
    for (int i = 0; i < 60000 && running(); ++i)
        usleep(1000);
    EXPECT_FALSE(running());
}

TEST_F(ProcessesTest, ProcessOfTheHostIsListedByItsId) {
    sim::NamedProcess process("/opt/app/attached");
    EXPECT_EQ(add({{"pid", process.pid()}}), process.pid());
    EXPECT_THAT(pids(), ElementsAre(process.pid()));
    EXPECT_STREQ(statistics(process.pid()).name, "attached");
    process.die();
    EXPECT_FALSE(known(process.pid()));
    EXPECT_THAT(pids(), IsEmpty());
}

TEST_F(ProcessesTest, ProcessOfTheHostSurvivesBeingTakenOffTheList) {
    sim::NamedProcess const process("attached");
    add({{"pid", process.pid()}});
    sim::command({{"command", "process-end"}, {"pid", process.pid()}});
    EXPECT_THAT(pids(), IsEmpty());
    EXPECT_EQ(kill(process.pid(), 0), 0);
}

TEST_F(ProcessesTest, ProcessesAreFoundByTheirCommand) {
    std::string const command = "found-" + std::to_string(getpid());
    EXPECT_EQ(add({{"process", command}}), 0);
    EXPECT_THAT(pids(), IsEmpty());
    sim::NamedProcess first("/opt/app/" + command);
    sim::NamedProcess const second(command);
    EXPECT_THAT(pids(), testing::UnorderedElementsAre(first.pid(), second.pid()));
    EXPECT_TRUE(known(first.pid()));
    first.end();
    EXPECT_FALSE(known(first.pid()));
    EXPECT_THAT(pids(), ElementsAre(second.pid()));
    sim::command({{"command", "process-end"}, {"name", command}});
    EXPECT_THAT(pids(), IsEmpty());
}

TEST_F(ProcessesTest, ProcessFoundByTwoEntriesIsListedOnce) {
    std::string const command = "found-" + std::to_string(getpid());
    sim::NamedProcess const process(command);
    add({{"process", command}});
    kvlsim::loadChassis("boards: []\nprocesses: [{kind: command, name: " + command + "}]");
    add({{"name", command}});
    auto const list = pids();
    EXPECT_EQ(list.size(), 2U); // the child is found by its command, too
    EXPECT_THAT(list, Contains(process.pid()));
}

TEST_F(ProcessesTest, NoMoreAreFilledInThanThereIsRoomFor) {
    for (int i = 0; i < 3; ++i)
        add({{"name", "child"}});
    EXPECT_EQ(pids(2).size(), 2U);
    std::array<int, 1> none = {-7};
    EXPECT_EQ(_kp_getpids(none.data(), 0), 0);
    EXPECT_EQ(_kp_getpids(none.data(), -1), 0);
    EXPECT_EQ(_kp_getpids(nullptr, 5), 0);
    EXPECT_EQ(none[0], -7);
}

TEST_F(ProcessesTest, UnknownProcessAnswersMinusOne) {
    tag_KPXSTATISTICS record{};
    EXPECT_EQ(_kp_getstatsbypid(getpid(), &record), -1);
    EXPECT_EQ(_kp_getstatsbypid(0, &record), -1);
    EXPECT_EQ(_kp_getstatsbypid(-1, &record), -1);
    EXPECT_EQ(_kp_getstatsbypid(std::numeric_limits<int>::max(), &record), -1);
}

TEST_F(ProcessesTest, StatisticsWithoutARecordAnswerMinusOne) {
    int const child = add({{"name", "child"}});
    EXPECT_EQ(_kp_getstatsbypid(child, nullptr), -1);
}

TEST_F(ProcessesTest, CountersBeginAsTheyAreGiven) {
    int const child = add({{"name", "child"},
                           {"counters",
                            {{"NumberOfOpens", 1},
                             {"NumberOfCloses", 2},
                             {"EventQueueSize", 30},
                             {"CurrentEventsOnQueue", 4},
                             {"MaxEventsOnQueue", 5},
                             {"TotalQueuedEvents", 6},
                             {"NumberOfHandlers", 7}}}});
    tag_KPXSTATISTICS const record = statistics(child);
    EXPECT_EQ(record.numberOfOpens, 1);
    EXPECT_EQ(record.numberOfCloses, 2);
    EXPECT_EQ(record.eventQueueSize, 30);
    EXPECT_EQ(record.currentEventsOnQueue, 4);
    EXPECT_EQ(record.maxEventsOnQueue, 5);
    EXPECT_EQ(record.totalQueuedEvents, 6);
    EXPECT_EQ(record.numberOfHandlers, 7);
}

TEST_F(ProcessesTest, CountersMoveWithTheClock) {
    int const child = add({{"name", "child"},
                           {"counters", {{"NumberOfOpens", 10}}},
                           {"rates", {{"NumberOfOpens", 2.5}, {"TotalQueuedEvents", 1}}}});
    s_now += std::chrono::seconds(3);
    EXPECT_EQ(statistics(child).numberOfOpens, 17);
    EXPECT_EQ(statistics(child).totalQueuedEvents, 3);
}

TEST_F(ProcessesTest, CountersStayWithinTheirBounds) {
    int const child =
        add({{"name", "child"},
             {"counters",
              {{"NumberOfOpens", 2147483647}, {"NumberOfHandlers", 3}, {"EventQueueSize", 8}}},
             {"rates",
              {{"NumberOfOpens", 1e300}, {"NumberOfHandlers", -1}, {"CurrentEventsOnQueue", 2}}}});
    s_now += std::chrono::seconds(100);
    tag_KPXSTATISTICS const record = statistics(child);
    EXPECT_EQ(record.numberOfOpens, std::numeric_limits<int>::max());
    EXPECT_EQ(record.numberOfHandlers, 0);
    EXPECT_EQ(record.currentEventsOnQueue, 8);
    EXPECT_EQ(record.maxEventsOnQueue, 8);
}

TEST_F(ProcessesTest, ListTellsProcessesAndCounters) {
    int const child = add({{"name", "/opt/child"}, {"counters", {{"NumberOfHandlers", 3}}}});
    sim::Json const listed = sim::command({{"command", "process-list"}})["processes"];
    ASSERT_EQ(listed.size(), 1U);
    EXPECT_EQ(listed[0]["pid"], child);
    EXPECT_EQ(listed[0]["kind"], "child");
    EXPECT_EQ(listed[0]["name"], "child");
    EXPECT_EQ(listed[0]["counters"]["NumberOfHandlers"], 3);
}

TEST_F(ProcessesTest, ProcessIsNotListedTwice) {
    sim::NamedProcess const process("attached");
    add({{"pid", process.pid()}});
    std::string const pid = std::to_string(process.pid());
    EXPECT_EQ(refusal(R"({"command": "process-add", "pid": )" + pid + "}"),
              "process " + pid + " is listed already");
    add({{"process", "no-such-command"}});
    EXPECT_EQ(refusal(R"({"command": "process-add", "process": "no-such-command"})"),
              "command \"no-such-command\" is listed already");
}

TEST_F(ProcessesTest, ProcessItselfCannotBeEnded) {
    kvlsim::loadChassis("boards: []\n");
    std::string const pid = std::to_string(getpid());
    EXPECT_EQ(refusal(R"({"command": "process-end", "pid": )" + pid + "}"),
              "process " + pid + " runs the platform itself; it cannot be taken off its own list");
}

struct BadProcess {
    char const* name;
    char const* command;
    char const* error;
};

class BadProcessCommandTest : public ProcessesTest,
                              public testing::WithParamInterface<BadProcess> {};

TEST_P(BadProcessCommandTest, IsRefusedAndChangesNothing) {
    EXPECT_THAT(refusal(GetParam().command), HasSubstr(GetParam().error));
    EXPECT_THAT(pids(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Commands, BadProcessCommandTest,
    testing::Values(
        BadProcess{"Nothing", R"({"command": "process-add"})", "give one of \"name\""},
        BadProcess{"TwoWays", R"({"command": "process-add", "name": "a", "pid": 1})",
                   "give one of \"name\""},
        BadProcess{"EmptyName", R"({"command": "process-add", "name": ""})",
                   "a process's name is empty; write one"},
        BadProcess{"NulInTheName", R"({"command": "process-add", "name": "a\u0000b"})",
                   "a process's name cannot contain a NUL; remove it"},
        BadProcess{"PidThatDoesNotRun", R"({"command": "process-add", "pid": 5000000})",
                   "no process 5000000 runs on this host; name one that does"},
        BadProcess{"PidZero", R"({"command": "process-add", "pid": 0})",
                   "\"pid\" cannot be 0; write a whole number from 1 to 2147483647"},
        BadProcess{"UnknownCounter",
                   R"({"command": "process-add", "name": "a", "counters": {"Opens": 1}})",
                   "no counter is called \"Opens\"; there are NumberOfOpens, NumberOfCloses,"},
        BadProcess{"NegativeCounter",
                   R"({"command": "process-add", "name": "a", "counters": {"NumberOfOpens": -1}})",
                   "NumberOfOpens cannot be -1; write a number from 0 to 2147483647"},
        BadProcess{"RateIsAText",
                   R"({"command": "process-add", "name": "a", "rates": {"NumberOfOpens": "x"}})",
                   "the rate of NumberOfOpens cannot be the text \"x\""},
        BadProcess{"CountersAreAList",
                   R"({"command": "process-add", "name": "a", "counters": [1]})",
                   "counters cannot be a list"},
        BadProcess{"EndOfNothing", R"({"command": "process-end"})",
                   "give either \"pid\" or \"name\""},
        BadProcess{"EndOfAnUnknownPid", R"({"command": "process-end", "pid": 5000000})",
                   "no process 5000000 was added"},
        BadProcess{"EndOfAnUnknownName", R"({"command": "process-end", "name": "nobody"})",
                   "no process \"nobody\" was added"}),
    [](auto const& each) { return each.param.name; });

} // namespace
