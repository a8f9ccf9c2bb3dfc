// SPDX-License-Identifier: BSD-2-Clause
// Which seconds of a line were seen: each way to miss one, worked out by hand.
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
