// SPDX-License-Identifier: BSD-2-Clause
// The statistics table with a runtime library whose answers the test chooses, and with real
// processes of this host.
#include "access/KPXStatisticsTable.h"

#include <cstring>
#include <functional>
#include <limits>
#include <set>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/NamedProcess.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::time_t s_now = 0;
int s_listings = 0;
std::vector<int> s_pids;
/// Processes that end between listing and reading.
std::set<int> s_ended;
std::function<void(int, tag_KPXSTATISTICS&)> s_fill;

/// A pid that no process has: Linux gives none above 4194304.
constexpr int kNoProcess = 5000000;

} // namespace

int _kp_getpids(int* pids, int max) {
    ++s_listings;
    int count = 0;
    for (int const pid : s_pids)
        if (count < max) pids[count++] = pid;
    return s_pids.empty() ? -1 : static_cast<int>(s_pids.size());
}

int _kp_getstatsbypid(int pid, tag_KPXSTATISTICS* record) {
    if (s_ended.contains(pid)) return -1;
    *record = {};
    s_fill(pid, *record);
    return 0;
}

namespace {

/// A table of its own, with the test's clock.
class Table : public KPXStatisticsTable {
  public:
    Table() : KPXStatisticsTable([] { return s_now; }) {}
};

class KPXStatisticsTableTest : public testing::Test {
  protected:
    KPXStatisticsTableTest() {
        s_now = 1000;
        s_listings = 0;
        s_pids.clear();
        s_ended.clear();
        s_fill = [](int pid, tag_KPXSTATISTICS& record) { record.numberOfOpens = pid; };
    }

    std::vector<int> walk() {
        std::vector<int> pids;
        for (int pid = table.GetFirstIndex(); pid != -1; pid = table.GetNextIndex(pid))
            pids.push_back(pid);
        return pids;
    }
    /// The name that a process whose command line begins with `program` has in the table.
    static std::string nameOf(std::string const& program) {
        sim::NamedProcess const process(program);
        s_pids = {process.pid()};
        return Table().GetApplicationName(process.pid());
    }

    Table table;
};

TEST_F(KPXStatisticsTableTest, FirstUseRefreshes) {
    EXPECT_EQ(table.CacheRefresh(), 1);
    EXPECT_EQ(s_listings, 1);
}

TEST_F(KPXStatisticsTableTest, CallsFiveSecondsApartListOnce) {
    table.GetFirstIndex();
    s_now += 5;
    table.GetFirstIndex();
    EXPECT_EQ(s_listings, 1);
}

TEST_F(KPXStatisticsTableTest, CallsTenSecondsApartListTwice) {
    table.GetFirstIndex();
    s_now += 10;
    table.GetFirstIndex();
    EXPECT_EQ(s_listings, 2);
}

TEST_F(KPXStatisticsTableTest, NineSecondsAreNotEnough) {
    table.GetFirstIndex();
    s_now += 9;
    EXPECT_EQ(table.CacheRefresh(), 0);
    s_now += 1;
    EXPECT_EQ(table.CacheRefresh(), 1);
}

TEST_F(KPXStatisticsTableTest, GetterRefreshesWhenDue) {
    s_pids = {kNoProcess};
    EXPECT_EQ(table.GetNumberOfOpens(kNoProcess), kNoProcess);
    s_now += 10;
    table.GetNumberOfHandlers(kNoProcess);
    EXPECT_EQ(s_listings, 2);
}

TEST_F(KPXStatisticsTableTest, WalkIsInOrderOfProcessIds) {
    s_pids = {kNoProcess + 3, kNoProcess + 1, kNoProcess + 2};
    EXPECT_THAT(walk(), ElementsAre(kNoProcess + 1, kNoProcess + 2, kNoProcess + 3));
}

TEST_F(KPXStatisticsTableTest, WalkWithoutProcessesIsEmpty) {
    EXPECT_THAT(walk(), IsEmpty()); // the runtime library answers -1
}

TEST_F(KPXStatisticsTableTest, NextOfTheLargestIsMinusOne) {
    s_pids = {kNoProcess, kNoProcess + 1};
    table.CacheRefresh();
    EXPECT_EQ(table.GetNextIndex(kNoProcess + 1), -1);
}

TEST_F(KPXStatisticsTableTest, NextOfAnUnknownProcessIsMinusOne) {
    s_pids = {kNoProcess, kNoProcess + 2};
    table.CacheRefresh();
    EXPECT_EQ(table.GetNextIndex(kNoProcess + 1), -1);
    EXPECT_EQ(table.GetNextIndex(-1), -1);
}

TEST_F(KPXStatisticsTableTest, NextNeverRefreshes) {
    s_pids = {kNoProcess, kNoProcess + 1};
    int const first = table.GetFirstIndex();
    s_pids.clear();
    s_now += 1000;
    EXPECT_EQ(table.GetNextIndex(first), kNoProcess + 1);
}

TEST_F(KPXStatisticsTableTest, EveryCounterIsThatOfTheRecord) {
    s_pids = {kNoProcess};
    s_fill = [](int, tag_KPXSTATISTICS& record) {
        record.numberOfOpens = 1;
        record.numberOfCloses = 2;
        record.eventQueueSize = 3;
        record.currentEventsOnQueue = 4;
        record.maxEventsOnQueue = 5;
        record.totalQueuedEvents = -6;
        record.numberOfHandlers = std::numeric_limits<int>::max();
    };
    EXPECT_EQ(table.GetNumberOfOpens(kNoProcess), 1);
    EXPECT_EQ(table.GetNumberOfCloses(kNoProcess), 2);
    EXPECT_EQ(table.GetEventQueueSize(kNoProcess), 3);
    EXPECT_EQ(table.GetCurrentEventsOnQueue(kNoProcess), 4);
    EXPECT_EQ(table.GetMaxEventsOnQueue(kNoProcess), 5);
    EXPECT_EQ(table.GetTotalQueuedEvents(kNoProcess), -6);
    EXPECT_EQ(table.GetNumberOfHandlers(kNoProcess), std::numeric_limits<int>::max());
}

TEST_F(KPXStatisticsTableTest, UnknownProcessThrows) {
    EXPECT_THROW(table.GetNumberOfOpens(kNoProcess), KPXStatisticsTable::StatsErrorException);
    EXPECT_THROW(table.GetApplicationName(kNoProcess), KPXStatisticsTable::StatsErrorException);
}

TEST_F(KPXStatisticsTableTest, EndedProcessAnswersUntilTheNextRefresh) {
    s_pids = {kNoProcess};
    table.CacheRefresh();
    s_pids.clear();
    s_now += 9;
    EXPECT_EQ(table.GetNumberOfOpens(kNoProcess), kNoProcess);
    s_now += 1;
    EXPECT_THROW(table.GetNumberOfOpens(kNoProcess), KPXStatisticsTable::StatsErrorException);
}

TEST_F(KPXStatisticsTableTest, ProcessThatEndsBetweenListingAndReadingIsLeftOut) {
    s_pids = {kNoProcess, kNoProcess + 1, kNoProcess + 2};
    s_ended = {kNoProcess + 1};
    EXPECT_THAT(walk(), ElementsAre(kNoProcess, kNoProcess + 2));
}

TEST_F(KPXStatisticsTableTest, LaterRecordOfOneProcessCounts) {
    s_pids = {kNoProcess, kNoProcess};
    int reads = 0;
    s_fill = [&reads](int, tag_KPXSTATISTICS& record) { record.numberOfOpens = ++reads; };
    EXPECT_EQ(table.GetNumberOfOpens(kNoProcess), 2);
}

TEST_F(KPXStatisticsTableTest, ProcessesBeyondTheCapacityAreIgnored) {
    for (int i = 0; i < 150; ++i)
        s_pids.push_back(kNoProcess + i);
    EXPECT_EQ(walk().size(), 101U);
    EXPECT_EQ(walk().back(), kNoProcess + 100);
}

TEST_F(KPXStatisticsTableTest, NameIsTheProgramsFileName) {
    EXPECT_EQ(nameOf("/opt/app/bin/server"), "server");
}

TEST_F(KPXStatisticsTableTest, NameWithoutSlashIsTheWholeFirstArgument) {
    EXPECT_EQ(nameOf("server"), "server");
}

TEST_F(KPXStatisticsTableTest, NameBehindATrailingSlashIsEmpty) {
    EXPECT_EQ(nameOf("/opt/app/"), "");
}

TEST_F(KPXStatisticsTableTest, NameOfAnEmptyCommandLineIsEmpty) {
    EXPECT_EQ(nameOf(""), "");
}

TEST_F(KPXStatisticsTableTest, NameOfADyingProcessIsEmpty) {
    sim::NamedProcess const process("/opt/app/bin/server");
    process.die();
    s_pids = {process.pid()};
    s_fill = [](int, tag_KPXSTATISTICS& record) { std::strcpy(record.name, "platform"); };
    EXPECT_EQ(table.GetApplicationName(process.pid()), "");
}

TEST_F(KPXStatisticsTableTest, NameIsThePlatformsWhereThereIsNoCommandLine) {
    s_pids = {kNoProcess};
    s_fill = [](int, tag_KPXSTATISTICS& record) { std::strcpy(record.name, "platform"); };
    EXPECT_EQ(table.GetApplicationName(kNoProcess), "platform");
}

TEST_F(KPXStatisticsTableTest, PlatformsNameWithoutTerminatorEndsWithItsField) {
    s_pids = {kNoProcess};
    s_fill = [](int, tag_KPXSTATISTICS& record) {
        std::memset(record.name, 'p', sizeof record.name);
        record.reserved1 = 0x70707070;
    };
    EXPECT_EQ(table.GetApplicationName(kNoProcess), std::string(32, 'p'));
}

TEST_F(KPXStatisticsTableTest, LongNameIsCutToItsField) {
    EXPECT_EQ(nameOf("/opt/" + std::string(40, 'n')), std::string(32, 'n'));
}

TEST_F(KPXStatisticsTableTest, ShorterNameLeavesNothingOfThePlatformsBehind) {
    s_fill = [](int, tag_KPXSTATISTICS& record) { std::memset(record.name, 'p', 32); };
    EXPECT_EQ(nameOf("/bin/x"), "x");
}

TEST_F(KPXStatisticsTableTest, OnlyTheFirst255CharactersOfACommandLineCount) {
    // The last slash stands behind them.
    EXPECT_EQ(nameOf("/" + std::string(260, 'd') + "/server"), std::string(32, 'd'));
}

TEST_F(KPXStatisticsTableTest, NameAtTheEndOfTheFirst255CharactersIsCutThere) {
    EXPECT_EQ(nameOf("/" + std::string(250, 'd') + "/server"), "ser");
}

TEST_F(KPXStatisticsTableTest, NameKeepsBytesAbove127) {
    std::string const name = "\xC3\xA9\xFF\x80";
    EXPECT_EQ(nameOf("/opt/\xE4/" + name), name);
}

TEST_F(KPXStatisticsTableTest, InstanceIsMadeOnce) {
    EXPECT_EQ(KPXStatisticsTable::GetInstance(), KPXStatisticsTable::GetInstance());
}

} // namespace
