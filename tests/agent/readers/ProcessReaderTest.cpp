// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/ProcessRow.h"

#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <functional>
#include <optional>

#include <gtest/gtest.h>

#include "agent/readers/ProcessReader.h"
#include "tests/support/SimulatedPlatform.h"

namespace kvloamd {
namespace {

std::function<std::time_t()> s_clock;

/// A table whose time the test tells.
class TimedTable final : public KPXStatisticsTable {
  public:
    TimedTable() : KPXStatisticsTable([] { return s_clock(); }) {}
};

/// The runtime library knows this process and a child with counters.
class ProcessRowTest : public ::testing::Test {
  protected:
    ProcessRowTest() {
        s_clock = [this] { return m_now; };
        sim::load({});
        m_child = sim::command({{"command", "process-add"},
                                {"name", "worker"},
                                {"counters",
                                 {{"NumberOfOpens", 5},
                                  {"NumberOfCloses", 4},
                                  {"EventQueueSize", 64},
                                  {"CurrentEventsOnQueue", 3},
                                  {"MaxEventsOnQueue", 9},
                                  {"TotalQueuedEvents", 77},
                                  {"NumberOfHandlers", 2}}}})
                      .at("pid")
                      .get<int>();
    }
    void endChild() const { sim::command({{"command", "process-end"}, {"pid", m_child}}); }
    /// The child's row, once the host shows the name of the program that was just started.
    std::optional<ProcessRow> childWithItsName() {
        auto const deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
        do {
            for (ProcessRow const& row : readProcesses(m_table))
                if (row.pid == static_cast<std::uint32_t>(m_child) && row.name == "worker")
                    return row;
            m_now += 10;
        } while (std::chrono::steady_clock::now() < deadline);
        return std::nullopt;
    }
    std::vector<std::uint32_t> pids() {
        std::vector<std::uint32_t> all;
        for (ProcessRow const& row : readProcesses(m_table))
            all.push_back(row.pid);
        return all;
    }
    std::vector<std::uint32_t> thisProcess() const {
        return {static_cast<std::uint32_t>(getpid())};
    }

    std::time_t m_now = 1000;
    int m_child = 0;
    TimedTable m_table;
};

TEST_F(ProcessRowTest, EveryCounterHasItsField) {
    auto const row = childWithItsName();
    ASSERT_TRUE(row.has_value());
    EXPECT_EQ(row->opens, 5U);
    EXPECT_EQ(row->closes, 4U);
    EXPECT_EQ(row->eventQueueSize, 64);
    EXPECT_EQ(row->currentEvents, 3);
    EXPECT_EQ(row->maxEvents, 9);
    EXPECT_EQ(row->totalEvents, 77U);
    EXPECT_EQ(row->handlers, 2);
}

TEST_F(ProcessRowTest, RowsAreInTheOrderOfTheirIds) {
    auto const all = pids();
    EXPECT_EQ(all.size(), 2U);
    EXPECT_TRUE(std::ranges::is_sorted(all));
}

TEST_F(ProcessRowTest, ProcessThatHasEndedGoesWhenTheTableIsRefreshed) {
    EXPECT_EQ(pids().size(), 2U);
    endChild();
    EXPECT_EQ(pids().size(), 2U);
    m_now += 10;
    EXPECT_EQ(pids(), thisProcess());
}

TEST_F(ProcessRowTest, ProcessThatEndsBetweenListingAndReadingHasNoRow) {
    // The first three questions for the time belong to the listing, which refreshes the table.
    int questions = 0;
    s_clock = [&] {
        if (++questions == 3) {
            endChild();
            m_now += 10;
        }
        return m_now;
    };
    EXPECT_EQ(pids(), thisProcess());
    EXPECT_GT(questions, 3);
}

} // namespace
} // namespace kvloamd
