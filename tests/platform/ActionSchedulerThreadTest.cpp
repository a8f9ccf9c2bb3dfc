// SPDX-License-Identifier: BSD-2-Clause
// The process's scheduler on its own thread.
#include <ctime>

#include <chrono>
#include <condition_variable>
#include <mutex>

#include <gtest/gtest.h>

#include "platform/ActionScheduler_pthread.h"
#include "tests/platform/NoNewThreads.h"

namespace {

constexpr std::chrono::seconds kPatience{30};

ActionScheduler& scheduler() {
    return *ActionScheduler_pthread::GetScheduler();
}

/// The next second of the scheduler's clock, which `time()` may lag behind.
long nextSecond() {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    return static_cast<long>(now.tv_sec) + 1;
}

/// Counts its calls. Its destructor removes it from the scheduler.
class CountingAction final : public Schedulable {
  public:
    CountingAction() = default;
    ~CountingAction() { scheduler().Remove(this); }
    CountingAction(CountingAction const&) = delete;
    CountingAction& operator=(CountingAction const&) = delete;

    int ScheduledAction() override {
        std::scoped_lock const lock(m_mutex);
        ++m_calls;
        m_changed.notify_all();
        return 0;
    }

    /// Waits until the action has been called `calls` times in all. Returns whether it was.
    bool reaches(int calls) {
        std::unique_lock lock(m_mutex);
        return m_changed.wait_for(lock, kPatience, [&] { return m_calls >= calls; });
    }
    int calls() {
        std::scoped_lock const lock(m_mutex);
        return m_calls;
    }

  private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    int m_calls = 0;
};

/// Lasts until `noteRemoved` is called, or long enough to show that it is not.
class LastingAction final : public Schedulable {
  public:
    int ScheduledAction() override {
        std::unique_lock lock(m_mutex);
        m_runs = true;
        m_changed.notify_all();
        m_removedMeanwhile =
            m_changed.wait_for(lock, std::chrono::milliseconds(300), [this] { return m_removed; });
        m_ended = true;
        return 0;
    }

    bool waitUntilItRuns() {
        std::unique_lock lock(m_mutex);
        return m_changed.wait_for(lock, kPatience, [this] { return m_runs; });
    }
    void noteRemoved() {
        std::scoped_lock const lock(m_mutex);
        m_removed = true;
        m_changed.notify_all();
    }
    bool removedMeanwhile() const { return m_removedMeanwhile; }
    bool ended() const { return m_ended; }

  private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    bool m_runs = false;
    bool m_removed = false;
    bool m_removedMeanwhile = false;
    bool m_ended = false;
};

TEST(ActionSchedulerThreadTest, ThereIsOneSchedulerAndItRuns) {
    EXPECT_EQ(ActionScheduler_pthread::GetScheduler(), ActionScheduler_pthread::GetScheduler());
    auto& thread = dynamic_cast<KVLThread_pthread&>(scheduler());
    EXPECT_EQ(thread.GetThreadState(), KVLThreadRunning);
}

TEST(ActionSchedulerThreadTest, PeriodicActionIsCalledAgainAndAgain) {
    CountingAction action;
    ASSERT_EQ(scheduler().AddPeriodic(&action, 1), 0);
    EXPECT_TRUE(action.reaches(3));
    EXPECT_EQ(scheduler().Remove(&action), 0);
}

TEST(ActionSchedulerThreadTest, RemovalWaitsForARunningAction) {
    LastingAction action;
    ASSERT_EQ(scheduler().AddPeriodic(&action, 1), 0);
    ASSERT_TRUE(action.waitUntilItRuns());
    EXPECT_EQ(scheduler().Remove(&action), 0);
    action.noteRemoved();
    EXPECT_TRUE(action.ended());
    EXPECT_FALSE(action.removedMeanwhile());
}

TEST(ActionSchedulerThreadTest, NoActionRunsAfterItsRemoval) {
    CountingAction removed, kept;
    scheduler().AddPeriodic(&removed, 1);
    scheduler().AddPeriodic(&kept, 1);
    ASSERT_TRUE(removed.reaches(1));
    EXPECT_EQ(scheduler().Remove(&removed), 0);
    int const callsUntilRemoval = removed.calls();
    ASSERT_TRUE(kept.reaches(kept.calls() + 2));
    EXPECT_EQ(removed.calls(), callsUntilRemoval);
}

TEST(ActionSchedulerThreadTest, EntryAddedWhileTheLoopWaitsForNothingIsCalled) {
    CountingAction first, second;
    scheduler().AddOneTimeAction(&first, 0);
    ASSERT_TRUE(first.reaches(1));
    // If the entry is gone, the pass has ended and the list is empty.
    EXPECT_EQ(scheduler().Remove(&first), 1);
    EXPECT_EQ(scheduler().AddOneTimeAction(&second, nextSecond()), 0);
    EXPECT_TRUE(second.reaches(1));
}

TEST(ActionSchedulerThreadTest, OneTimeActionsAndASlowerPeriodStarveOneAnotherNot) {
    CountingAction periodic, once;
    ASSERT_EQ(scheduler().AddPeriodic(&periodic, 2), 0);
    for (int i = 1; periodic.calls() < 3; ++i) {
        ASSERT_EQ(scheduler().AddOneTimeAction(&once, nextSecond()), 0);
        ASSERT_TRUE(once.reaches(i));
        // Waits for the pass that called it.
        EXPECT_EQ(scheduler().Remove(&once), 1);
        ASSERT_LE(i, 30) << "the periodic action is not called";
    }
    EXPECT_GE(once.calls(), 3);
}

/// A scheduler with a thread of its own, besides the process's.
class OwnScheduler final : public ActionScheduler_pthread {};

TEST(ActionSchedulerThreadTest, SchedulerDoesNotWaitForAThreadThatTheSystemRefuses) {
    testing::internal::CaptureStderr();
    NoNewThreads const none;
    OwnScheduler refused;
    EXPECT_NE(testing::internal::GetCapturedStderr(), "");
    EXPECT_FALSE(refused.HasThread());

    CountingAction action;
    EXPECT_EQ(refused.AddPeriodic(&action, 1), 0);
    EXPECT_EQ(refused.Remove(&action), 0);
}

} // namespace
