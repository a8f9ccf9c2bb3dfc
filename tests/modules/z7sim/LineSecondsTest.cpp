// SPDX-License-Identifier: BSD-2-Clause
// Which seconds of a line were seen: each way to miss one, worked out by hand.
#include <cstdint>

#include <random>

#include <gtest/gtest.h>

#include "LineSeconds.h"

namespace {

class LineSecondsTest : public testing::Test {
  protected:
    LineSecondsTest() { m_seconds.begin(kAge, kTime); }

    /// A tick at this time, at which the line has this age, both in seconds since the beginning.
    LineTick tick(long time, long age) {
        return m_seconds.answered(static_cast<std::uint32_t>(kAge + age), kTime + time);
    }
    LineTick silence(long time) { return m_seconds.silent(kTime + time); }

    static void expectSeen(LineTick const& tick) {
        EXPECT_TRUE(tick.counts);
        EXPECT_EQ(tick.missed, 0);
    }
    static void expectMissed(LineTick const& tick, long seconds) {
        EXPECT_FALSE(tick.counts);
        EXPECT_EQ(tick.missed, seconds);
    }

    static constexpr long kAge = 500;
    static constexpr long kTime = 9000;
    LineSeconds m_seconds;
};

TEST_F(LineSecondsTest, EveryTickIsASecond) {
    for (int i = 1; i <= 100; ++i)
        expectSeen(tick(i, i));
}

TEST_F(LineSecondsTest, SecondsOfTwoClocksMayHoldTwoOrNoneOfEachOther) {
    expectSeen(tick(1, 0));
    expectSeen(tick(2, 2));
    expectSeen(tick(3, 4));
    expectSeen(tick(4, 4));
    expectSeen(tick(5, 5));
}

TEST_F(LineSecondsTest, ClocksOfDifferentSpeedMissNothing) {
    // One second in twenty more, and one in twenty less.
    for (int i = 1; i <= 400; ++i)
        expectSeen(tick(i, i + i / 20));
    m_seconds.begin(kAge, kTime);
    for (int i = 1; i <= 400; ++i)
        expectSeen(tick(i, i - i / 20));
}

/// `goOn` is a shorter way for ticks that are nothing special, and leaves no trace of itself.
TEST(LineSecondsShortcutTest, NextSecondIsTheSameAsAnAnswer) {
    std::minstd_rand engine(1);
    auto const below = [&engine](std::uint32_t limit) {
        return std::uniform_int_distribution<std::uint32_t>(0, limit - 1)(engine);
    };
    LineSeconds shorter;
    LineSeconds longer;
    shorter.begin(500, 9000);
    longer.begin(500, 9000);
    std::uint32_t age = 500;
    std::int64_t time = 9000;
    int taken = 0;
    for (int i = 0; i < 100'000; ++i) {
        bool const isSpecial = below(4) == 0;
        time += std::int64_t{isSpecial ? below(3) : 1};
        age += isSpecial ? below(4) : 1;
        if (below(50) == 0) age = below(10);
        LineTick expected;
        LineTick tick;
        if (below(20) == 0) {
            expected = longer.silent(time);
            tick = shorter.silent(time);
        } else {
            expected = longer.answered(age, time);
            bool const isNext = shorter.isNext(age, time);
            if (isNext) shorter.goOn();
            tick = isNext ? LineTick{0, true} : shorter.answered(age, time);
            taken += isNext ? 1 : 0;
        }
        ASSERT_EQ(tick.missed, expected.missed) << i;
        ASSERT_EQ(tick.counts, expected.counts) << i;
    }
    EXPECT_GT(taken, 20'000);
}

TEST(LineSecondsShortcutTest, AgeThatBeginsAnewAfterItsLastNumberIsSpecial) {
    LineSeconds seconds;
    seconds.begin(0xFFFFFFFF, 9000);
    EXPECT_FALSE(seconds.isNext(0, 9001));
}

TEST_F(LineSecondsTest, SecondsBetweenTicksThatWereLeftOutAreMissed) {
    expectSeen(tick(1, 1));
    expectMissed(tick(3, 3), 2);
    expectSeen(tick(4, 4));
    expectMissed(tick(104, 104), 100);
    expectSeen(tick(105, 105));
}

TEST_F(LineSecondsTest, AgeTellsOfTimeThatTheTicksDoNotKnow) {
    // The host was suspended: its monotonic clock stood still meanwhile.
    expectSeen(tick(1, 1));
    expectMissed(tick(2, 3602), 3601);
    expectSeen(tick(3, 3603));
}

TEST_F(LineSecondsTest, SilenceMissesTheSecondsBeforeAndAfterItsReadings) {
    expectSeen(tick(1, 1));
    expectMissed(silence(2), 1);
    expectMissed(silence(3), 1);
    expectMissed(tick(4, 4), 1);
    expectSeen(tick(5, 5));
}

TEST_F(LineSecondsTest, TicksLeftOutInSilenceAreMissedToo) {
    expectMissed(silence(5), 5);
    expectMissed(tick(8, 8), 3);
    expectSeen(tick(9, 9));
}

TEST_F(LineSecondsTest, SuspensionInSilenceIsMissedToo) {
    expectMissed(silence(1), 1);
    expectMissed(tick(2, 1002), 1001);
    expectSeen(tick(3, 1003));
}

TEST_F(LineSecondsTest, SecondInWhichTheLineBeginsAnewIsMissed) {
    expectSeen(tick(1, 1));
    expectMissed(tick(2, -500), 1);
    expectSeen(tick(3, -499));
    expectSeen(tick(4, -498));
}

TEST_F(LineSecondsTest, LineThatBeganAnewInSilenceMissesWhatTheTicksTell) {
    expectMissed(silence(1), 1);
    expectMissed(tick(4, -498), 3);
    expectSeen(tick(5, -497));
}

TEST_F(LineSecondsTest, LineWhoseOwnClockStandsStillIsMissed) {
    expectSeen(tick(1, 1));
    expectSeen(tick(2, 1));
    expectMissed(tick(3, 1), 1);
    expectMissed(tick(4, 1), 1);
    expectMissed(tick(5, 2), 1);
    expectSeen(tick(6, 3));
}

TEST_F(LineSecondsTest, LineThatHasNeverAnsweredBeginsWithItsFirstAnswer) {
    m_seconds.begin(kTime);
    expectMissed(silence(1), 1);
    expectMissed(tick(2, 70000), 1);
    expectSeen(tick(3, 70001));
}

TEST_F(LineSecondsTest, TicksWithoutATimeOfTheirOwnGoByTheAge) {
    expectSeen(tick(0, 1));
    expectSeen(tick(0, 2));
    expectMissed(tick(0, 12), 10);
    expectSeen(tick(0, 13));
}

} // namespace
