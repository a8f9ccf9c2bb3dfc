// SPDX-License-Identifier: BSD-2-Clause
// Condition variables: waits with and without a limit.
#include <sys/time.h>

#include <future>
#include <thread>

#include <gtest/gtest.h>

#include "platform/KVLConditionVariable_pthread.h"

namespace {

using Timeout = KVLConditionVariable::WaitTimedOutException;

timeval now() {
    timeval time{};
    gettimeofday(&time, nullptr);
    return time;
}

/// A thread that waits, and the predicate that it waits for.
class KVLConditionVariableTest : public testing::Test {
  protected:
    /// Waits with `wait(seconds)` until the predicate holds. Signals when it is about to wait.
    void startWaiter(int seconds) {
        m_waiter = std::thread([this, seconds] {
            m_condition.grab(0);
            m_waiting.set_value();
            while (!m_ready)
                m_condition.wait(seconds);
            m_condition.release();
        });
        // The waiter holds the mutex until it waits; when this thread gets it, the waiter waits.
        m_waiting.get_future().wait();
    }

    void makeReady() {
        m_condition.grab(0);
        m_ready = true;
        m_condition.release();
    }

    KVLConditionVariable_pthread m_condition;
    bool m_ready = false;
    std::promise<void> m_waiting;
    std::thread m_waiter;
};

TEST_F(KVLConditionVariableTest, WaitOfZeroLastsUntilNotified) {
    startWaiter(0);
    makeReady();
    m_condition.notify();
    m_waiter.join();
    EXPECT_TRUE(m_ready);
}

TEST_F(KVLConditionVariableTest, WaitOfANegativeTimeLastsUntilNotified) {
    startWaiter(-5);
    makeReady();
    m_condition.notify();
    m_waiter.join();
    EXPECT_TRUE(m_ready);
}

TEST_F(KVLConditionVariableTest, NotifyAllWakesEveryWaiter) {
    startWaiter(0);
    std::promise<void> secondWaits;
    std::thread second([&] {
        m_condition.grab(0);
        secondWaits.set_value();
        while (!m_ready)
            m_condition.wait(0);
        m_condition.release();
    });
    secondWaits.get_future().wait();
    makeReady();
    m_condition.notify_all();
    m_waiter.join();
    second.join();
    EXPECT_TRUE(m_ready);
}

TEST_F(KVLConditionVariableTest, TimedOutWaitThrowsWithTheMutexHeld) {
    m_condition.grab(0);
    EXPECT_THROW(m_condition.wait(1), Timeout);

    // Another thread gets the mutex only after the release.
    bool released = false;
    std::promise<bool> seen;
    std::thread other([&] {
        m_condition.grab(0);
        seen.set_value(released);
        m_condition.release();
    });
    released = true;
    m_condition.release();
    EXPECT_TRUE(seen.get_future().get());
    other.join();
}

TEST_F(KVLConditionVariableTest, TimedWaitEndsAtAWholeSecondOfTheClock) {
    // The wait drops the fraction of the second in which it begins, so a wait of one second that
    // begins late in a second is clearly shorter. A machine that stalls can spoil one attempt, but
    // not all of them.
    constexpr long kLate = 700'000;
    bool wasShort = false;
    for (int attempt = 0; attempt < 20 && !wasShort; ++attempt) {
        timeval begin = now();
        while (begin.tv_usec < kLate)
            begin = now();
        m_condition.grab(0);
        EXPECT_THROW(m_condition.wait(1), Timeout);
        m_condition.release();
        timeval const end = now();
        EXPECT_GE(end.tv_sec, begin.tv_sec + 1) << "ended before the whole second";
        long const waited = (end.tv_sec - begin.tv_sec) * 1'000'000 + end.tv_usec - begin.tv_usec;
        wasShort = waited < 1'000'000;
    }
    EXPECT_TRUE(wasShort);
}

TEST_F(KVLConditionVariableTest, NotificationEndsATimedWaitNormally) {
    startWaiter(3600);
    makeReady();
    m_condition.notify();
    m_waiter.join();
    EXPECT_TRUE(m_ready);
}

TEST_F(KVLConditionVariableTest, LongestWaitDoesNotEndAtOnce) {
    startWaiter(2147483647);
    makeReady();
    m_condition.notify();
    m_waiter.join();
    EXPECT_TRUE(m_ready);
}

} // namespace
