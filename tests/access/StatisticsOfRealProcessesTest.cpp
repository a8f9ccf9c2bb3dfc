// SPDX-License-Identifier: BSD-2-Clause
// The statistics table with the simulated runtime library and its processes.
#include <unistd.h>

#include <ctime>

#include <vector>

#include <gtest/gtest.h>

#include "access/KPXStatisticsTable.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

std::time_t s_now = 0;

class Table : public KPXStatisticsTable {
  public:
    Table() : KPXStatisticsTable([] { return s_now; }) {}
};

class StatisticsOfRealProcessesTest : public testing::Test {
  protected:
    StatisticsOfRealProcessesTest() {
        s_now = 1000;
        kvlsim::loadChassis("boards: []\nprocesses: [{kind: self, counters: {NumberOfOpens: 7}}]");
    }

    static int addChild(char const* name) {
        return sim::command({{"command", "process-add"},
                             {"name", name},
                             {"counters", {{"NumberOfHandlers", 3}}}})["pid"]
            .get<int>();
    }
    static void end(int pid) { sim::command({{"command", "process-end"}, {"pid", pid}}); }

    Table table;
};

TEST_F(StatisticsOfRealProcessesTest, ProcessItselfIsInTheTable) {
    EXPECT_EQ(table.GetFirstIndex(), getpid());
    EXPECT_EQ(table.GetNumberOfOpens(getpid()), 7);
    EXPECT_EQ(table.GetApplicationName(getpid()), "access_store_test");
}

TEST_F(StatisticsOfRealProcessesTest, AddedChildIsInTheTableAfterTheNextRefresh) {
    table.CacheRefresh();
    int const child = addChild("/opt/app/bin/call-server");
    EXPECT_THROW(table.GetNumberOfHandlers(child), KPXStatisticsTable::StatsErrorException);
    s_now += 10;
    EXPECT_EQ(table.GetNumberOfHandlers(child), 3);
    EXPECT_EQ(table.GetApplicationName(child), "call-server");
}

TEST_F(StatisticsOfRealProcessesTest, EndedChildAnswersUntilTheNextRefresh) {
    int const child = addChild("call-server");
    table.CacheRefresh();
    end(child);
    s_now += 9;
    EXPECT_EQ(table.GetNumberOfHandlers(child), 3);
    s_now += 1;
    EXPECT_THROW(table.GetNumberOfHandlers(child), KPXStatisticsTable::StatsErrorException);
}

TEST_F(StatisticsOfRealProcessesTest, MoreProcessesThanTheTableHoldsAreIgnored) {
    std::vector<int> children;
    for (int i = 0; i < 105; ++i)
        children.push_back(addChild("many"));
    int rows = 0;
    for (int pid = table.GetFirstIndex(); pid != -1; pid = table.GetNextIndex(pid))
        ++rows;
    EXPECT_EQ(rows, 101);
}

} // namespace
