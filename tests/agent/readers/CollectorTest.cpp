// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Collector.h"

#include <atomic>
#include <future>
#include <set>
#include <stdexcept>

#include <gtest/gtest.h>

#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

/// Never renews by itself.
constexpr CollectorPace kByEventOnly{1h, 0ms, 1h};
/// Every request finds the snapshot too old.
constexpr CollectorPace kByEveryRequest{-1ms, 0ms, 1h};

/// A collector over one board whose name the test sets.
class CollectorTest : public ::testing::Test {
  protected:
    void start(CollectorPace pace) {
        m_collector.emplace([this](Snapshot& snapshot) { read(snapshot); }, Clock::now() - 1min,
                            [this] { renewed(); }, pace);
    }
    void name(std::string name) {
        std::scoped_lock const guard(m_mutex);
        m_name = std::move(name);
    }
    /// Waits for the next snapshots after the first `before`.
    void awaitRenewal(int before = 0) {
        std::unique_lock lock(m_mutex);
        ASSERT_TRUE(m_changed.wait_for(lock, 60s, [&] { return m_renewals > before; }));
    }
    int renewals() {
        std::scoped_lock const guard(m_mutex);
        return m_renewals;
    }
    std::string shownName() { return m_collector->newest()->boards.at(0).name; }

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::string m_name = "first";
    int m_reads = 0;
    int m_renewals = 0;
    std::set<std::thread::id> m_readingThreads;
    std::function<void()> m_whileReading = [] {};
    std::optional<Collector> m_collector; ///< last: its thread uses all of the above

  private:
    void read(Snapshot& snapshot) {
        snapshot.boards.resize(1);
        {
            std::scoped_lock const guard(m_mutex);
            ++m_reads;
            m_readingThreads.insert(std::this_thread::get_id());
            snapshot.boards.edit(0).name = m_name;
        }
        m_whileReading();
    }
    void renewed() {
        std::scoped_lock const guard(m_mutex);
        ++m_renewals;
        m_changed.notify_all();
    }
};

TEST_F(CollectorTest, FirstSnapshotIsThereAtOnce) {
    start(kByEventOnly);
    EXPECT_EQ(shownName(), "first");
}

TEST_F(CollectorTest, RowsAreAlwaysReadOnTheCollectorsOwnThread) {
    start(kByEventOnly);
    m_collector->renew();
    awaitRenewal();
    m_collector.reset();
    EXPECT_EQ(m_reads, 2);
    EXPECT_EQ(m_readingThreads.size(), 1U);
    EXPECT_FALSE(m_readingThreads.contains(std::this_thread::get_id()));
}

TEST_F(CollectorTest, WhatTheFirstReadingThrowsReachesTheCaller) {
    m_whileReading = [] { throw std::runtime_error("no rows"); };
    EXPECT_THROW(start(kByEventOnly), std::runtime_error);
}

TEST_F(CollectorTest, EventBringsANewSnapshot) {
    start(kByEventOnly);
    name("second");
    m_collector->renew();
    awaitRenewal();
    EXPECT_EQ(shownName(), "second");
}

TEST_F(CollectorTest, RequestForAnOldSnapshotGetsItAtOnceAndHasItRenewed) {
    start(kByEveryRequest);
    name("second");
    EXPECT_EQ(m_collector->snapshot()->boards.at(0).name, "first");
    awaitRenewal();
    EXPECT_EQ(shownName(), "second");
}

TEST_F(CollectorTest, RequestForAYoungSnapshotReadsNothing) {
    start(kByEventOnly);
    m_collector->snapshot();
    m_collector.reset();
    EXPECT_EQ(m_reads, 1);
}

TEST_F(CollectorTest, RequestDoesNotWaitForBoardsThatAnswerSlowly) {
    start(kByEventOnly);
    std::promise<void> reading;
    std::promise<void> mayGoOn;
    m_whileReading = [&] {
        reading.set_value();
        mayGoOn.get_future().wait();
    };
    m_collector->renew();
    ASSERT_EQ(reading.get_future().wait_for(60s), std::future_status::ready);
    EXPECT_EQ(m_collector->snapshot()->boards.at(0).name, "first");
    mayGoOn.set_value();
    awaitRenewal();
}

TEST_F(CollectorTest, EventDuringAReadingBringsAnotherReading) {
    start(kByEventOnly);
    std::promise<void> reading;
    std::promise<void> mayGoOn;
    bool firstTime = true;
    m_whileReading = [&] {
        if (!std::exchange(firstTime, false)) return;
        reading.set_value();
        mayGoOn.get_future().wait();
    };
    m_collector->renew();
    ASSERT_EQ(reading.get_future().wait_for(60s), std::future_status::ready);
    name("second");
    m_collector->renew();
    mayGoOn.set_value();
    awaitRenewal(1);
    EXPECT_EQ(shownName(), "second");
}

TEST_F(CollectorTest, SnapshotIsRenewedAlsoWhenNobodyAsks) {
    start({1h, 0ms, 1ms});
    name("second");
    // A refresh that has begun already may still read the first name.
    awaitRenewal(renewals() + 1);
    EXPECT_EQ(shownName(), "second");
}

TEST_F(CollectorTest, HeldSnapshotStaysAsItIs) {
    start(kByEventOnly);
    std::shared_ptr<Snapshot const> const held = m_collector->newest();
    name("second");
    m_collector->renew();
    awaitRenewal();
    EXPECT_EQ(held->boards.at(0).name, "first");
}

TEST_F(CollectorTest, SnapshotsAreNumbered) {
    start(kByEventOnly);
    EXPECT_EQ(m_collector->newest()->number, 1U);
    m_collector->renew();
    awaitRenewal();
    EXPECT_EQ(m_collector->newest()->number, 2U);
}

TEST_F(CollectorTest, LongestReadingIsRemembered) {
    // Longer than the resolution, however fast the clock.
    m_whileReading = [] {
        auto const begun = Clock::now();
        while (Clock::now() - begun < 5ms) {
        }
    };
    start(kByEventOnly);
    std::shared_ptr<Snapshot const> const first = m_collector->newest();
    EXPECT_GE(first->refreshTime, 5ms);
    EXPECT_EQ(first->longestRefreshTime, first->refreshTime);
    m_whileReading = [] {};
    m_collector->renew();
    awaitRenewal();
    EXPECT_GE(m_collector->newest()->longestRefreshTime, first->refreshTime);
    EXPECT_GE(m_collector->newest()->longestRefreshTime, m_collector->newest()->refreshTime);
}

TEST_F(CollectorTest, TimeOfChangeIsZeroUntilSomethingChanges) {
    start(kByEventOnly);
    m_collector->renew();
    awaitRenewal();
    EXPECT_EQ(m_collector->newest()->lastChange, 0U);
}

TEST_F(CollectorTest, TimeOfChangeCountsFromTheAgentsStart) {
    start(kByEventOnly);
    name("second");
    m_collector->renew();
    awaitRenewal();
    EXPECT_GE(m_collector->newest()->lastChange, 6000U); // a minute, in hundredths
}

TEST_F(CollectorTest, TimeOfChangeStaysWhenNothingChangesAfterwards) {
    start(kByEventOnly);
    name("second");
    m_collector->renew();
    awaitRenewal();
    std::uint32_t const change = m_collector->newest()->lastChange;
    m_collector->renew();
    awaitRenewal(1);
    EXPECT_EQ(m_collector->newest()->lastChange, change);
}

TEST_F(CollectorTest, RefreshThatThrowsLeavesTheLastSnapshotAndIsLoggedOnce) {
    LogCapture logged;
    start(kByEventOnly);
    std::atomic<int> thrown = 0;
    m_whileReading = [&] {
        if (++thrown <= 2) throw std::runtime_error("no platform");
    };
    m_collector->renew();
    while (thrown < 1)
        std::this_thread::yield();
    EXPECT_EQ(m_collector->newest()->number, 1U);
    m_collector->renew();
    while (thrown < 2)
        std::this_thread::yield();
    m_collector->renew();
    awaitRenewal();
    EXPECT_EQ(m_collector->newest()->number, 2U);
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 2) << message;
}

} // namespace
} // namespace kvloamd
