// SPDX-License-Identifier: BSD-2-Clause
// The standard tables through a master that has interfaces of its own.
#include <algorithm>
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr char kIfTable[] = "1.3.6.1.2.1.2.2";
constexpr char kIfDescr[] = "1.3.6.1.2.1.2.2.1.2";
constexpr char kIfXTable[] = "1.3.6.1.2.1.31.1.1";
constexpr char kIfName[] = "1.3.6.1.2.1.31.1.1.1.1";
constexpr char kStack[] = "1.3.6.1.2.1.31.1.2";
constexpr char kDot3[] = "1.3.6.1.2.1.10.7.2";
constexpr char kLines[] = "1.3.6.1.2.1.10.18.6.1.1";
constexpr char kIntervals[] = "1.3.6.1.2.1.10.18.8";
constexpr char kStates[] = "1.3.6.1.2.1.131.1";
constexpr char kIsdn[] = "1.3.6.1.2.1.10.20";
/// The ifIndex of our first interface; those of the host are far lower.
constexpr std::uint32_t kFirst = 1000;

class SharedTablesTest : public MasterFixture {
  protected:
    void start(int boards = 3) {
        startMaster();
        startSubagent(boards);
        ASSERT_TRUE(isConnected()) << agent().output();
    }
    /// The same, and waits until all interfaces of the example chassis are served.
    void startWhole() {
        start();
        ASSERT_TRUE(eventually([this] { return rows(kIfName, true).size() == 73; }));
        ASSERT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 73; }));
    }
    std::vector<Answer> walkOf(std::string const& from) const {
        auto all = walk(from);
        std::erase_if(all,
                      [](Answer const& answer) { return answer.value.starts_with("No Such"); });
        return all;
    }
    /// A column's rows: ours, or the host's.
    std::vector<Answer> rows(std::string const& column, bool ours) const {
        auto all = walkOf(column);
        std::erase_if(all,
                      [&](Answer const& answer) { return (answer.name.back() >= kFirst) != ours; });
        return all;
    }
    bool hostHasRows() const { return !rows(kIfDescr, false).empty(); }
    static std::vector<Oid> namesOf(std::vector<Answer> const& answers) {
        std::vector<Oid> names;
        for (Answer const& answer : answers)
            names.push_back(answer.name);
        return names;
    }
    static bool isStrictlyIncreasing(std::vector<Answer> const& answers) {
        return std::ranges::adjacent_find(answers, [](Answer const& a, Answer const& b) {
                   return compare(a.name, b.name) >= 0;
               }) == answers.end();
    }
    /// One line on each board, whose serial number is its name.
    static std::string board(int handle, std::string const& serialNumber) {
        return "  - handle: " + std::to_string(handle) +
               "\n    attributes: {SERIAL_NUMBER: " + serialNumber +
               "}\n    devices: [{handle: " + std::to_string(handle * 10) +
               ", type: 501, attributes: {NAME: line-" + serialNumber + "}, line: {type: esf}}]\n";
    }
    /// Boards with four lines each.
    void useBigChassis(int boards) {
        Result const made = run({KVLSIM, "generate", "--boards", std::to_string(boards), "--lines",
                                 "4", "--devices", "0"});
        ASSERT_EQ(made.status, 0) << made.output;
        useChassis(made.output);
    }
};

TEST_F(SharedTablesTest, InterfacesOfTheHostAndOursAreInOneTable) {
    startWhole();
    auto const descriptions = walkOf(kIfDescr);
    EXPECT_TRUE(isStrictlyIncreasing(descriptions));
    std::vector<std::string> values;
    for (Answer const& answer : descriptions)
        values.push_back(answer.value);
    EXPECT_THAT(values, Contains("STRING: \"lo\""));
    EXPECT_THAT(values, Contains("STRING: \"T1 line nx5-trunk-1\""));
    EXPECT_THAT(rows(kIfDescr, true), SizeIs(73));
    EXPECT_TRUE(isStrictlyIncreasing(walkOf(kIfTable)));
    EXPECT_TRUE(isStrictlyIncreasing(walkOf(kIfXTable)));
    EXPECT_TRUE(isStrictlyIncreasing(walkOf("1.3.6.1")));
}

TEST_F(SharedTablesTest, BulkWalksOfSharedTablesNameTheSameInstances) {
    startWhole();
    for (char const* const table : {kIfTable, kIfXTable, kDot3, kStack}) {
        auto const walked = namesOf(walkOf(table));
        EXPECT_THAT(walked, Not(IsEmpty())) << table;
        for (char const* const repetitions : {"-Cr1", "-Cr7", "-Cr50"})
            EXPECT_EQ(namesOf(answers("snmpbulkwalk", {repetitions, table})), walked)
                << table << " " << repetitions;
    }
}

TEST_F(SharedTablesTest, EveryStandardObjectOfAStandAloneAgentIsServed) {
    // The host has rows in the first three.
    std::vector<std::string> const places{
        kIfTable,           kIfXTable, kDot3, kStack, kIsdn, "1.3.6.1.2.1.10.18",
        "1.3.6.1.2.1.47.1", kStates};
    auto const namesOfOurs = [&] {
        std::vector<std::vector<Oid>> names;
        for (std::size_t i = 0; i < places.size(); ++i) {
            names.push_back(namesOf(walkOf(places[i])));
            if (i < 3)
                std::erase_if(names.back(), [](Oid const& name) { return name.back() < kFirst; });
        }
        return names;
    };
    startAgent();
    ASSERT_TRUE(eventually([&] { return walkOf(kIntervals).size() == 13 * 95 + 3; }));
    auto const alone = namesOfOurs();
    ASSERT_EQ(stopAgent(), 0) << agent().output();
    askMaster();
    startWhole();
    ASSERT_TRUE(eventually([&] { return walkOf(kIntervals).size() == 13 * 95 + 3; }));
    auto const beside = namesOfOurs();
    for (std::size_t i = 0; i < places.size(); ++i) {
        EXPECT_THAT(alone[i], Not(IsEmpty())) << places[i];
        EXPECT_EQ(beside[i], alone[i]) << places[i];
    }
}

TEST_F(SharedTablesTest, WholeTablesAreWalkedAlikeWhateverTheRequest) {
    startWhole();
    ASSERT_TRUE(eventually([&] { return walkOf(kIntervals).size() == 13 * 95 + 3; }));
    for (char const* const table : {kIntervals, kIsdn, kStack})
        EXPECT_EQ(answers("snmpbulkwalk", {"-Cr50", table}), walkOf(table)) << table;
}

TEST_F(SharedTablesTest, NumberOfInterfacesIsTheHosts) {
    startWhole();
    EXPECT_EQ(get("1.3.6.1.2.1.2.1.0"), "INTEGER: " + std::to_string(rows(kIfDescr, false).size()));
}

TEST_F(SharedTablesTest, RowsOfAPulledBoardVanishAndComeBack) {
    useChassis("boards:\n" + board(1, "ONE") + board(2, "TWO"));
    start(2);
    ASSERT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 2; }));
    auto const before = walkOf(kIfDescr);
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 1; }));
    EXPECT_THAT(get(std::string(kIfName) + ".1000"), HasSubstr("No Such Instance"));
    EXPECT_TRUE(hostHasRows());
    write(path("one.yaml"), "boards:\n" + board(7, "ONE"));
    sim({"insert", path("one.yaml")});
    EXPECT_TRUE(eventually([&] { return walkOf(kIfDescr) == before; }));
    EXPECT_EQ(get(std::string(kIfName) + ".1000"), "STRING: \"line-ONE\"");
}

TEST_F(SharedTablesTest, RowsOfANewBoardAppear) {
    useChassis("boards:\n" + board(1, "ONE") + board(2, "TWO"));
    start(2);
    ASSERT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 2; }));
    write(path("new.yaml"), "boards:\n" + board(3, "NEW"));
    sim({"insert", path("new.yaml")});
    EXPECT_TRUE(eventually(
        [this] { return get(std::string(kIfName) + ".1032") == "STRING: \"line-NEW\""; }));
    EXPECT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 3; }));
    EXPECT_THAT(rows(kLines, true), SizeIs(3));
}

TEST_F(SharedTablesTest, RowsOfTheHostRemainWhenTheAgentStops) {
    startWhole();
    auto const before = rows(kIfDescr, false);
    ASSERT_THAT(before, Not(IsEmpty()));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_TRUE(eventually([&] { return walkOf(kIfDescr) == before; }));
    EXPECT_THAT(walkOf(kIsdn), IsEmpty());
}

TEST_F(SharedTablesTest, RowsAreBackAfterTheMastersRestart) {
    startWhole();
    killMaster();
    ASSERT_TRUE(isLost()) << agent().output();
    startMaster();
    ASSERT_TRUE(isConnected(2)) << agent().output();
    EXPECT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 73; }));
    EXPECT_TRUE(hostHasRows());
    EXPECT_THAT(walkOf(kIsdn), Not(IsEmpty()));
}

TEST_F(SharedTablesTest, MasterThatRestartsAmidTheRegistrationsServesAllInTheEnd) {
    useBigChassis(200);
    start(200);
    for (int round = 0; round < 5; ++round) {
        killMaster();
        startMaster();
        // The next round interrupts the registration of rows wherever it is.
        ASSERT_TRUE(eventually([this] { return hostHasRows(); }));
    }
    EXPECT_TRUE(eventually([this] { return rows(kIfDescr, true).size() == 800; }));
    EXPECT_TRUE(eventually([this] { return rows("1.3.6.1.2.1.2.2.1.1", true).size() == 800; }));
}

TEST_F(SharedTablesTest, MasterThatHangsAmidTheRegistrationsServesAllWhenItGoesOn) {
    useBigChassis(200);
    start(200);
    master().signal(SIGSTOP);
    ASSERT_TRUE(isLost()) << agent().output();
    master().signal(SIGCONT);
    ASSERT_TRUE(isConnected(2)) << agent().output();
    EXPECT_TRUE(eventually([this] { return rows("1.3.6.1.2.1.2.2.1.1", true).size() == 800; }));
    EXPECT_THAT(statesTold(), ::testing::ElementsAre("connected", "lost", "connected"));
}

TEST_F(SharedTablesTest, WhatAnotherAgentServesIsToldOnceAndTheRestServed) {
    startWhole();
    setVariable("KVLSIM_SOCKET", path("second.sock"));
    Process second({KVLOAMD, "--agentx", path("master.sock"), "--module", "z7sim", "--module-dir",
                    moduleDirectory(), "--enterprise-oid", "1.3.6.1.4.1.32473.77",
                    "--persistent-dir", path("store")},
                   environment());
    ASSERT_TRUE(second.waitFor("refuses rows of ifTable")) << second.output();
    for (char const* const what : {"DS1-MIB", "ISDN-MIB", "ifStackTable"})
        EXPECT_EQ(count(second.output(), "the SNMP master refuses " + std::string(what) +
                                             ": another agent serves them already"),
                  1)
            << second.output();
    EXPECT_EQ(count(second.output(), "refuses rows of ifTable"), 1);
    EXPECT_EQ(count(second.output(), "refuses rows of ifXTable"), 1);
    EXPECT_EQ(get("1.3.6.1.4.1.32473.77.1.1.2.1.0"), "Gauge32: 3");
}

} // namespace
} // namespace kvloamd::e2e
