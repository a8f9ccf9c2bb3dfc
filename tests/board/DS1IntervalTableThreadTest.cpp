// SPDX-License-Identifier: BSD-2-Clause
// Interval tables that are read while they tick, and that are created and destroyed while the
// scheduler runs.
#include <cstddef>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "board/DS1IntervalTable.h"
#include "core/ReferenceCounter.h"
#include "platform/ActionScheduler_pthread.h"

namespace {

ActionScheduler& scheduler() {
    return *ActionScheduler_pthread::GetScheduler();
}

constexpr int kSecondsAnInterval = 5;

/// A table of short intervals. The counters of the k-th interval hold 1000 k and the seconds that
/// were collected in it.
class ShortTable : public DS1IntervalTable {
  public:
    ShortTable() { begin(); }
    ~ShortTable() override { scheduler().Remove(this); }

    int GetControlledSlipSeconds(int n) override { return interval(n)->ControlledSlipSeconds; }
    int GetDegradedMinutes(int n) override { return interval(n)->DegradedMinutes; }
    int CollectSecond() override {
        m_current.ErrorSeconds += 1;
        m_current.LineCodeViolations += 1;
        m_timeElapsed += 1;
        return 0;
    }
    int CloseInterval() override {
        ArchiveInterval(m_current);
        begin();
        return 0;
    }

  private:
    void begin() {
        ++m_number;
        m_current.ErrorSeconds = 1000 * m_number;
        m_current.LineCodeViolations = 1000 * m_number;
        m_timeElapsed = kIntervalLength - kSecondsAnInterval;
    }

    int m_number = 0;
};

using Handle = ReferenceCounter<ShortTable>;

/// Counts the scheduler's passes.
class Passes final : public Schedulable {
  public:
    Passes() { scheduler().AddPeriodic(this, 1); }
    ~Passes() { scheduler().Remove(this); }
    Passes(Passes const&) = delete;
    Passes& operator=(Passes const&) = delete;

    int ScheduledAction() override {
        std::scoped_lock const lock(m_mutex);
        ++m_count;
        m_changed.notify_all();
        return 0;
    }
    int count() {
        std::scoped_lock const lock(m_mutex);
        return m_count;
    }
    /// Waits for `passes` more passes. Returns whether they came.
    bool waitForMore(int passes) {
        std::unique_lock lock(m_mutex);
        int const enough = m_count + passes;
        return m_changed.wait_for(lock, std::chrono::seconds(30),
                                  [&] { return m_count >= enough; });
    }

  private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    int m_count = 0;
};

TEST(DS1IntervalTableThreadTest, ReadersSeeOldOrNewValuesWhileTablesTickAndWrapAround) {
    constexpr int kTables = 200;
    constexpr int kIntervals = 110;
    std::vector<Handle> tables;
    for (int i = 0; i < kTables; ++i) {
        tables.emplace_back(new ShortTable);
        ASSERT_EQ(scheduler().Remove(tables.back().get()), 0);
    }

    std::atomic<bool> end{false};
    std::atomic<long> wrong{0};
    auto const expectOneOf = [&](bool allowed) { wrong += allowed ? 0 : 1; };
    auto const readTable = [&](ShortTable& table, int& lastValid, int& lastNumber) {
        int const valid = table.GetValidIntervals();
        expectOneOf(valid >= lastValid && valid <= 96);
        lastValid = valid;

        int const elapsed = table.GetTimeElapsed();
        expectOneOf(elapsed == 0 || (elapsed >= 895 && elapsed <= 900));

        int const running = table.GetErrorSeconds(0);
        expectOneOf(running / 1000 >= lastNumber && running % 1000 <= kSecondsAnInterval);
        lastNumber = running / 1000;

        for (int n = 1; n <= 96; ++n)
            for (int const closed : {table.GetErrorSeconds(n), table.GetLineCodeViolations(n)})
                expectOneOf(closed == 0 ||
                            (closed % 1000 == kSecondsAnInterval && closed / 1000 <= kIntervals));
    };
    auto const read = [&] {
        std::vector<int> lastValid(kTables, 0), lastNumber(kTables, 0);
        do
            for (std::size_t i = 0; i < tables.size(); ++i)
                readTable(*tables[i].get(), lastValid[i], lastNumber[i]);
        while (!end);
    };
    std::vector<std::thread> readers;
    for (int i = 0; i < 4; ++i)
        readers.emplace_back(read);
    for (int tick = 0; tick < kIntervals * (kSecondsAnInterval + 1); ++tick)
        for (auto const& table : tables)
            table->ScheduledAction();
    end = true;
    for (auto& reader : readers)
        reader.join();

    EXPECT_EQ(wrong, 0);
    for (auto const& table : tables) {
        EXPECT_EQ(table->GetValidIntervals(), 96);
        EXPECT_EQ(table->GetErrorSeconds(1), 1000 * kIntervals + kSecondsAnInterval);
        EXPECT_EQ(table->GetErrorSeconds(95), 1000 * (kIntervals - 94) + kSecondsAnInterval);
    }
}

TEST(DS1IntervalTableThreadTest, NumberOfValidIntervalsNeverFallsWhileTheRingFills) {
    constexpr int kTables = 2000;
    std::vector<Handle> tables;
    for (int i = 0; i < kTables; ++i) {
        tables.emplace_back(new ShortTable);
        ASSERT_EQ(scheduler().Remove(tables.back().get()), 0);
    }

    std::atomic<std::size_t> filling{0};
    std::atomic<long> falls{0};
    std::thread reader([&] {
        for (std::size_t i = filling; i < tables.size(); i = filling)
            for (int last = 0; filling == i;) {
                int const valid = tables[i]->GetValidIntervals();
                falls += valid < last || valid > 96 ? 1 : 0;
                last = valid;
            }
    });
    for (auto const& table : tables) {
        for (int interval = 0; interval < 100; ++interval)
            table->CloseInterval();
        ++filling;
    }
    reader.join();
    EXPECT_EQ(falls, 0);
}

TEST(DS1IntervalTableThreadTest, TablesComeAndGoWhileTheSchedulerTicks) {
    Passes passes;
    Handle const kept(new ShortTable);
    int made = 0;
    while (passes.count() < 3) {
        std::vector<Handle> tables;
        for (int i = 0; i < 20; ++i, ++made)
            tables.emplace_back(new ShortTable);
        std::this_thread::yield();
    }
    EXPECT_GT(made, 0);
    EXPECT_GT(kept->GetErrorSeconds(0), 1000);
}

/// A table whose constructor does not call the scheduler, and whose class has a member and
/// operations of its own.
class PlainTable final : public DS1IntervalTable {
  public:
    ~PlainTable() override { scheduler().Remove(this); }

    int GetControlledSlipSeconds(int /*n*/) override { return 0; }
    int GetDegradedMinutes(int /*n*/) override { return 0; }
    int CollectSecond() override {
        m_seconds += m_step;
        m_seconds.notify_all();
        return 0;
    }
    int CloseInterval() override { return 0; }
    void waitForASecond() const { m_seconds.wait(0); }

  private:
    int m_step = 1;
    std::atomic<int> m_seconds{0};
};

TEST(DS1IntervalTableThreadTest, TickSeesWhatTheConstructorWroteWithoutACallOfTheScheduler) {
    ReferenceCounter<PlainTable> const table(new PlainTable);
    table->waitForASecond(); // ThreadSanitizer finds a fault
}

TEST(DS1IntervalTableThreadTest, SchedulerTicksATableForAsLongAsItLives) {
    Passes passes;
    Handle table(new ShortTable);
    ASSERT_TRUE(passes.waitForMore(2));
    int const seconds = table->GetErrorSeconds(0) - 1000;
    EXPECT_GE(seconds, 1);
    ASSERT_TRUE(passes.waitForMore(2));
    EXPECT_GT(table->GetErrorSeconds(0) - 1000, seconds);
    table = {};
    EXPECT_TRUE(passes.waitForMore(2));
}

} // namespace
