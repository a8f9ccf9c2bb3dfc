// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/AlarmThread.h"

#include <chrono>
#include <future>
#include <optional>
#include <semaphore>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

/// A thread whose advances the test follows one by one.
class AlarmThreadTest : public ::testing::Test {
  protected:
    /// Waits for the next advance to begin, and lets it return `next`.
    void letAdvance(Clock::time_point next) {
        m_begun.acquire();
        ++m_advances;
        m_next = next;
        m_goOn.release();
    }
    Clock::time_point advance() {
        m_begun.release();
        m_goOn.acquire();
        return m_next;
    }

    static constexpr Clock::time_point kNever = Clock::time_point::max();

    int m_advances = 0;
    std::counting_semaphore<> m_begun{0};
    std::counting_semaphore<> m_goOn{0};
    Clock::time_point m_next; ///< written while the thread waits for `m_goOn`
    std::optional<AlarmThread> m_thread{std::in_place, [this] { return advance(); }};
};

TEST_F(AlarmThreadTest, NothingAdvancesBeforeTheFirstWake) {
    m_thread.reset();
    EXPECT_FALSE(m_begun.try_acquire());
}

TEST_F(AlarmThreadTest, AdvancesWhenItIsWoken) {
    m_thread->wake();
    letAdvance(kNever);
    m_thread->wake();
    letAdvance(kNever);
    m_thread.reset();
    EXPECT_FALSE(m_begun.try_acquire()) << "not without a reason";
}

TEST_F(AlarmThreadTest, AdvancesAgainAtTheTimeThatTheLastAdvanceNamed) {
    m_thread->wake();
    letAdvance(Clock::now());
    letAdvance(Clock::now() + std::chrono::milliseconds(1));
    letAdvance(kNever);
    EXPECT_EQ(m_advances, 3);
}

TEST_F(AlarmThreadTest, WakeDuringAnAdvanceIsFollowedByAnother) {
    m_thread->wake();
    m_begun.acquire();
    m_thread->wake();
    m_next = kNever;
    m_goOn.release();
    letAdvance(kNever);
    EXPECT_EQ(m_advances, 1);
}

TEST_F(AlarmThreadTest, EndWaitsForAnAdvanceThatHasBegun) {
    bool hasEnded = false;
    {
        AlarmThread thread([&] {
            m_begun.release();
            m_goOn.acquire();
            hasEnded = true;
            return kNever;
        });
        thread.wake();
        m_begun.acquire();
        m_goOn.release();
    }
    EXPECT_TRUE(hasEnded);
}

} // namespace
} // namespace kvloamd
