// SPDX-License-Identifier: BSD-2-Clause
// Whose a line's history is, how long it lasts, and what of it is valid.
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "LineClocks.h"
#include "tests/modules/z7sim/LineFixture.h"

namespace {

/// The status of a T1 or E1 without signal.
constexpr int kCut = DS1LineStatusLossOfSignal | DS1LineStatusLossOfFrame |
                     DS1LineStatusXmtFarEndLOF | DS1LineStatusUnavailSigState;

class LineHistoryTest : public LineTest {
  protected:
    /// The platform says nothing of the line for so many seconds.
    void silence(int seconds) {
        sim::load({});
        tick(seconds);
    }
    void ping() { m_factory->ping_boards(); }
};

class ClocksTest : public LineHistoryTest {
  protected:
    ClocksTest() {
        s_system = 1'700'000'000;
        s_monotonic = 5'000;
        LineClocks::inUse() = {[] { return s_system; }, [] { return s_monotonic; }};
    }
    ~ClocksTest() override { LineClocks::inUse() = m_own; }

    static void pass(long seconds) {
        s_system += seconds;
        s_monotonic += seconds;
    }
    static inline long s_system;
    static inline long s_monotonic;

  private:
    LineClocks m_own = LineClocks::inUse();
};

TEST_F(LineHistoryTest, SecondsWithoutAnAnswerPassTimeAndMakeTheIntervalInvalid) {
    plugIn("type: esf, errors: {path-violations: 400}");
    tick(5);
    EXPECT_TRUE(isValid(0));
    silence(3);
    EXPECT_EQ(m_table->GetTimeElapsed(), 8);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 2000);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 5);
    EXPECT_FALSE(isValid(0));
    tick(892 + 901);
    EXPECT_EQ(m_table->GetValidIntervals(), 2);
    EXPECT_FALSE(isValid(1));
    EXPECT_FALSE(isValid(2));
}

TEST_F(LineHistoryTest, IntervalAfterOneThatMissedDataIsValidAgain) {
    plugIn("type: esf");
    std::string const line = "type: esf, errors: {path-violations: 1}";
    silence(3);
    load(line, "NAME: span-1");
    tick(897);
    EXPECT_FALSE(isValid(0));
    tick(901);
    EXPECT_EQ(m_table->GetValidIntervals(), 2);
    EXPECT_TRUE(isValid(1));
    EXPECT_EQ(m_table->GetPathCodingViolations(1), 900);
    EXPECT_FALSE(isValid(2));
}

TEST_F(LineHistoryTest, IntervalsThatWereNeverClosedAreNotValid) {
    plugIn("type: esf");
    tick(901);
    EXPECT_TRUE(isValid(0));
    EXPECT_TRUE(isValid(1));
    EXPECT_FALSE(isValid(2));
    EXPECT_FALSE(isValid(96));
    EXPECT_FALSE(isValid(-1));
    EXPECT_FALSE(isValid(97));
}

TEST_F(LineHistoryTest, EmptyPlaceOfAFullHistoryIsNotValid) {
    plugIn("type: esf, past: {hours: 24}");
    tick();
    EXPECT_EQ(m_table->GetValidIntervals(), 96);
    for (int n = 1; n <= 95; ++n)
        EXPECT_TRUE(isValid(n)) << n;
    EXPECT_FALSE(isValid(96));
}

TEST_F(LineHistoryTest, TimeThatNobodyTickedIsMissed) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(10);
    LineClock::advance(std::chrono::seconds(2000));
    tick(1);
    EXPECT_EQ(m_table->GetValidIntervals(), 2);
    EXPECT_EQ(m_table->GetTimeElapsed(), 2011 - 1800);
    for (int n = 0; n <= 2; ++n)
        EXPECT_FALSE(isValid(n)) << n;
    EXPECT_EQ(m_table->GetPathCodingViolations(2), 10);
    EXPECT_EQ(m_table->GetPathCodingViolations(1), 0);
    tick(900);
    EXPECT_FALSE(isValid(1));
    EXPECT_TRUE(isValid(0));
}

TEST_F(LineHistoryTest, LongAbsenceInvalidatesTheWholeHistory) {
    plugIn("type: esf");
    tick(5);
    LineClock::advance(std::chrono::hours(24 * 400) + std::chrono::seconds(7));
    tick(1);
    EXPECT_EQ(m_table->GetValidIntervals(), 96);
    EXPECT_EQ(m_table->GetTimeElapsed(), 13);
    for (int n = 0; n <= 96; ++n)
        EXPECT_FALSE(isValid(n)) << n;
}

TEST_F(LineHistoryTest, LineThatBeginsAnewMissesTheSecondInWhichItDoes) {
    plugIn("type: esf, errors: {path-violations: 400}");
    tick(5);
    load("type: esf, errors: {path-violations: 300}", "NAME: span-1");
    tick();
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 2000);
    EXPECT_FALSE(isValid(0));
    tick();
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 2300);
    EXPECT_EQ(m_table->GetTimeElapsed(), 7);
}

TEST_F(LineHistoryTest, StopAndStartKeepTheHistory) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(901);
    stop();
    // The platform still answers for the line: nothing is missed.
    tick(99);
    start();
    EXPECT_EQ(m_table->GetValidIntervals(), 1);
    EXPECT_EQ(m_table->GetPathCodingViolations(1), 900);
    EXPECT_EQ(m_table->GetTimeElapsed(), 100);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 100);
    EXPECT_TRUE(isValid(0));
    EXPECT_TRUE(isValid(1));
}

TEST_F(LineHistoryTest, OneFailedPingKeepsTheHistory) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(901);
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    EXPECT_EQ(m_board->GetFirstFeature(DS1LineFeature::iid()).get(), nullptr);
    tick(60);
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    find();
    ASSERT_NE(m_table.get(), nullptr);
    EXPECT_EQ(m_table->GetValidIntervals(), 1);
    EXPECT_EQ(m_table->GetTimeElapsed(), 61);
    EXPECT_TRUE(isValid(1));
}

TEST_F(LineHistoryTest, BoardThatSaysNothingKeepsItsHistoryWithAGap) {
    std::string const line = "type: esf, errors: {path-violations: 1}";
    plugIn(line);
    tick(901);
    sim::load({});
    ping();
    tick(60);
    load(line, "NAME: span-1");
    ping();
    find();
    ASSERT_NE(m_table.get(), nullptr);
    tick(2);
    EXPECT_EQ(m_table->GetValidIntervals(), 1);
    EXPECT_TRUE(isValid(1));
    EXPECT_EQ(m_table->GetTimeElapsed(), 63);
    EXPECT_FALSE(isValid(0));
}

TEST_F(LineHistoryTest, FailureAndRecoveryKeepTheHistory) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(901);
    sim::command({{"command", "fail"}, {"board", 5}});
    sim::drain();
    tick(10);
    start();
    EXPECT_EQ(m_table->GetPathCodingViolations(1), 900);
    EXPECT_EQ(m_table->GetTimeElapsed(), 11);
}

TEST_F(LineHistoryTest, StatusAndTrapEnableOutliveAStop) {
    plugIn("type: esf");
    m_line->SetLineStatusChangeTrapEnable(1);
    alarm("los");
    tick(3);
    long const changed = m_line->GetLineStatusLastChange();
    EXPECT_NE(changed, 0);
    restart();
    EXPECT_EQ(status(), kCut);
    EXPECT_EQ(m_line->GetLineStatusLastChange(), changed);
    EXPECT_EQ(m_line->GetLineStatusChangeTrapEnable(), 1);
}

TEST_F(LineHistoryTest, ListenersOfARestartedBoardHearOfItsLines) {
    plugIn("type: esf");
    restart();
    class Log final : public DS1LineStatusListener {
      public:
        int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override {
            told.push_back(event->GetLineStatus());
            line = event->GetLine();
            return 0;
        }
        std::vector<int> told;
        ReferenceCounter<DS1LineDevice> line;
    } log;
    m_feature->AddLineStatusListener(&log);
    alarm("los");
    tick(3);
    LineStatusDelivery::instance().drain();
    EXPECT_EQ(log.told, std::vector<int>{kCut});
    EXPECT_EQ(log.line.get(), m_line.get());
}

TEST_F(LineHistoryTest, AnotherBoardInTheSamePlaceHasAHistoryOfItsOwn) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(901);
    exchange("type: esf");
    EXPECT_EQ(m_table->GetValidIntervals(), 0);
    EXPECT_EQ(m_table->GetTimeElapsed(), 0);
}

TEST_F(LineHistoryTest, NothingOfAnotherBoardIsCountedBeforeItIsFound) {
    plugIn("type: esf");
    tick(10);
    auto const history = m_table;
    stop();
    load("type: esf, errors: {path-violations: 7}", "NAME: span-1", "T5");
    static_cast<Z7Board*>(m_board.get())->ProcessExternalEvent(BoardStatusStarted);
    for (int i = 0; i < 10; ++i) {
        LineClock::advance(std::chrono::seconds(1));
        m_scheduler.pass(LineScheduler::time() + 1);
    }
    EXPECT_EQ(history->GetPathCodingViolations(0), 0);
    EXPECT_EQ(history->GetTimeElapsed(), 20);
}

TEST_F(LineHistoryTest, LineOfAnotherFormatBeginsAnew) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(901);
    sim::set(51, "LINE_TYPE", 3);
    restart();
    EXPECT_EQ(m_table->GetValidIntervals(), 0);
}

TEST_F(LineHistoryTest, HistoryEndsWithItsBoard) {
    plugIn("type: esf");
    auto const* const table = m_table.get();
    m_feature = {};
    m_line = {};
    m_table = {};
    sim::command({{"command", "remove"}, {"board", 5}});
    sim::drain();
    EXPECT_EQ(LineScheduler::instance().Remove(const_cast<DS1IntervalTable*>(table)), 1);
}

TEST_F(LineHistoryTest, ProcessesSchedulerDoesNotTickTheModulesTables) {
    plugIn("type: esf");
    EXPECT_EQ(ActionScheduler_pthread::GetScheduler()->Remove(m_table.get()), 1);
    EXPECT_EQ(LineScheduler::instance().Remove(m_table.get()), 1) << "its board is ticked";
}

TEST_F(LineHistoryTest, TableThatOutlivesItsBoardMissesSeconds) {
    plugIn("type: esf, errors: {path-violations: 1}");
    tick(5);
    m_feature = {};
    m_line = {};
    m_board = {};
    sim::command({{"command", "remove"}, {"board", 5}});
    sim::drain();
    tick(3);
    EXPECT_EQ(m_table->GetTimeElapsed(), 8);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 5);
    EXPECT_FALSE(isValid(0));
}

TEST_F(LineHistoryTest, PassOfTheLinesSchedulerTicksThemOnce) {
    plugIn("type: esf");
    long const time = LineScheduler::time();
    tick(5);
    EXPECT_EQ(m_table->GetTimeElapsed(), 5);
    EXPECT_TRUE(isValid(0));
    // One pass is left out, and the clocks agree on it.
    LineClock::advance(std::chrono::seconds(2));
    m_scheduler.pass(time + 7);
    EXPECT_EQ(m_table->GetTimeElapsed(), 7);
    EXPECT_FALSE(isValid(0));
}

TEST_F(ClocksTest, LastChangeGoesWithTheSystemsClock) {
    plugIn("type: esf");
    alarm("los");
    tick(3);
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 1'700'000'000);
    pass(100);
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 1'700'000'000);
    s_system -= 3600;
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 1'700'000'000 - 3600);
    s_system += 86400;
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 1'700'000'000 - 3600 + 86400);
}

} // namespace
