// SPDX-License-Identifier: BSD-2-Clause
// Threads: start, state, and the operations that do nothing.
#include <future>

#include <gtest/gtest.h>

#include "platform/KVLThread_pthread.h"
#include "tests/platform/NoNewThreads.h"

namespace {

/// A body that runs until `letGo` is called.
class Body final : public Runnable {
  public:
    void Run() override {
        m_thread = pthread_self();
        m_started.set_value();
        m_mayEnd.get_future().wait();
    }

    void waitUntilStarted() { m_started.get_future().wait(); }
    void letGo() { m_mayEnd.set_value(); }
    pthread_t thread() const { return m_thread; }

  private:
    std::promise<void> m_started;
    std::promise<void> m_mayEnd;
    pthread_t m_thread{};
};

/// The thread is detached, so only its state shows its end.
void waitUntilNotRunning(KVLThread_pthread& thread) {
    while (thread.GetThreadState() != KVLThreadNotRunning)
        sched_yield();
}

TEST(KVLThreadTest, WithoutABodyStartIsRefusedAndTheStateStays) {
    KVLThread_pthread thread(nullptr);
    EXPECT_EQ(thread.Start(), -1);
    EXPECT_EQ(thread.GetThreadState(), 3);
}

TEST(KVLThreadTest, StateIsThreeBeforeTheStart) {
    Body body;
    KVLThread_pthread thread(&body);
    EXPECT_EQ(thread.GetThreadState(), 3);
}

TEST(KVLThreadTest, StateIsZeroFromTheStartUntilTheBodyReturns) {
    Body body;
    KVLThread_pthread thread(&body);
    EXPECT_EQ(thread.Start(), 0);
    EXPECT_EQ(thread.GetThreadState(), 0);
    body.waitUntilStarted();
    EXPECT_EQ(thread.GetThreadState(), 0);
    body.letGo();
    waitUntilNotRunning(thread);
    EXPECT_EQ(thread.GetThreadState(), 3);
}

TEST(KVLThreadTest, BodyRunsOnAThreadOfItsOwn) {
    Body body;
    KVLThread_pthread thread(&body);
    ASSERT_EQ(thread.Start(), 0);
    body.waitUntilStarted();
    EXPECT_FALSE(pthread_equal(body.thread(), pthread_self()));
    body.letGo();
    waitUntilNotRunning(thread);
}

TEST(KVLThreadTest, StopJoinAndTerminateDoNotTouchARunningThread) {
    Body body;
    KVLThread_pthread thread(&body);
    ASSERT_EQ(thread.Start(), 0);
    body.waitUntilStarted();
    EXPECT_EQ(thread.Stop(), 0);
    EXPECT_EQ(thread.Join(), 0);
    EXPECT_EQ(thread.TerminateAndWait(), 0);
    EXPECT_EQ(thread.GetThreadState(), 0);
    body.letGo();
    waitUntilNotRunning(thread);
}

TEST(KVLThreadTest, SleepOfZeroReturnsAtOnce) {
    KVLThread_pthread thread(nullptr);
    EXPECT_EQ(thread.Sleep(0), 0);
}

TEST(KVLThreadTest, ThreadThatTheSystemRefusesReadsAsStartedAndIsReported) {
    Body body;
    KVLThread_pthread thread(&body);
    testing::internal::CaptureStderr();
    NoNewThreads const none;
    EXPECT_EQ(thread.Start(), 0);
    EXPECT_EQ(thread.GetThreadState(), 0);
    EXPECT_FALSE(thread.HasThread());
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "KVLThread_pthread: cannot create a thread: Resource temporarily unavailable\n");
}

TEST(KVLThreadTest, ThreadOfTheSystemIsThereFromTheStartOn) {
    Body body;
    KVLThread_pthread thread(&body);
    EXPECT_FALSE(thread.HasThread());
    thread.Start();
    EXPECT_TRUE(thread.HasThread());
    body.letGo();
    waitUntilNotRunning(thread);
}

} // namespace
