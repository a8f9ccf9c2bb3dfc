// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultLog.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using Index = std::array<std::uint32_t, 2>;

class FaultLogTest : public ::testing::Test {
  protected:
    Faults read() const { return m_log.read(m_started); }
    std::vector<Index> listed() const {
        std::vector<Index> indices;
        for (FaultRow const& row : read().rows)
            indices.push_back(row.index());
        return indices;
    }

    /// An hour before the clock's zero: a time point that was never set does not count as long ago.
    Clock::time_point m_started = Clock::time_point() - std::chrono::hours(1);
    FaultLog m_log{3};
};

TEST_F(FaultLogTest, NothingIsRaisedAtFirst) {
    Faults const faults = read();
    EXPECT_TRUE(faults.rows.empty());
    EXPECT_EQ(faults.raised, 0U);
    EXPECT_EQ(faults.lastChange, 0U);
}

TEST_F(FaultLogTest, RaisedFaultIsListedWithItsTime) {
    m_log.raise(2, 10, 17);
    Faults const faults = read();
    ASSERT_EQ(faults.rows.size(), 1U);
    FaultRow const& row = faults.rows[0];
    EXPECT_EQ(row.index(), (Index{2, 17}));
    EXPECT_EQ(row.platformBoard, 10);
    EXPECT_EQ(row.times, 1U);
    EXPECT_GE(row.time, 360000U);
    EXPECT_EQ(row.date.size(), 11U);
    EXPECT_EQ(faults.lastChange, row.time);
}

TEST_F(FaultLogTest, FaultsAreInOrderOfTheirIndices) {
    m_log.raise(2, 10, 1);
    m_log.raise(1, 11, 300);
    m_log.raise(1, 11, 5);
    EXPECT_EQ(listed(), (std::vector<Index>{{1, 5}, {1, 300}, {2, 1}}));
}

TEST_F(FaultLogTest, FaultThatIsRaisedAgainIsCountedAndKeepsItsTime) {
    m_log.raise(2, 10, 17);
    std::uint32_t const time = read().rows.at(0).time;
    m_log.raise(2, 10, 17);
    Faults const faults = read();
    ASSERT_EQ(faults.rows.size(), 1U);
    EXPECT_EQ(faults.rows[0].times, 2U);
    EXPECT_EQ(faults.rows[0].time, time);
    EXPECT_EQ(faults.raised, 2U);
}

TEST_F(FaultLogTest, ClearedFaultHasGone) {
    m_log.raise(2, 10, 17);
    m_log.raise(2, 10, 18);
    m_log.clear(2, 10, 17);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, 18}}));
    EXPECT_EQ(read().raised, 2U);
}

TEST_F(FaultLogTest, FaultThatIsRaisedAfterItsClearingBeginsAnew) {
    m_log.raise(2, 10, 17);
    m_log.raise(2, 10, 17);
    m_log.clear(2, 10, 17);
    m_log.raise(2, 10, 17);
    EXPECT_EQ(read().rows.at(0).times, 1U);
}

TEST_F(FaultLogTest, ClearingWhatIsNotRaisedChangesNothing) {
    m_log.clear(2, 10, 17);
    EXPECT_EQ(read().lastChange, 0U);
}

TEST_F(FaultLogTest, FaultThatFindsTheListFullIsCountedOnly) {
    for (std::uint16_t value = 1; value <= 5; ++value)
        m_log.raise(2, 10, value);
    Faults const faults = read();
    EXPECT_EQ(faults.rows.size(), 3U);
    EXPECT_EQ(faults.raised, 5U);
    EXPECT_EQ(faults.unlisted, 2U);
}

TEST_F(FaultLogTest, ListedFaultIsCountedOnInAFullList) {
    for (std::uint16_t value = 1; value <= 4; ++value)
        m_log.raise(2, 10, value);
    m_log.raise(2, 10, 3);
    EXPECT_EQ(read().rows.at(2).times, 2U);
    EXPECT_EQ(read().unlisted, 1U);
}

TEST_F(FaultLogTest, FullListTakesFaultsAgainOnceOneIsCleared) {
    for (std::uint16_t value = 1; value <= 4; ++value)
        m_log.raise(2, 10, value);
    m_log.clear(2, 10, 1);
    m_log.raise(2, 10, 9);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, 2}, {2, 3}, {2, 9}}));
}

TEST_F(FaultLogTest, FaultsOfABoardGoWithIt) {
    m_log.raise(1, 10, 17);
    m_log.raise(2, 11, 17);
    m_log.boardHasGone(1);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, 17}}));
}

TEST_F(FaultLogTest, FaultOfUnknownBoardIsListedUnderBoardZero) {
    m_log.raise(0, 99, 17);
    Faults const faults = read();
    ASSERT_EQ(faults.rows.size(), 1U);
    EXPECT_EQ(faults.rows[0].index(), (Index{0, 17}));
    EXPECT_EQ(faults.rows[0].platformBoard, 99);
}

TEST_F(FaultLogTest, RowOfSeveralUnknownBoardsStaysUntilAllAreCleared) {
    m_log.raise(0, 98, 17);
    m_log.raise(0, 99, 17);
    m_log.raise(0, 99, 17);
    ASSERT_EQ(listed(), (std::vector<Index>{{0, 17}}));
    EXPECT_EQ(read().rows[0].times, 3U);
    EXPECT_EQ(read().rows[0].platformBoard, 98);
    m_log.clear(0, 98, 17);
    EXPECT_EQ(listed(), (std::vector<Index>{{0, 17}}));
    m_log.clear(0, 99, 17);
    EXPECT_TRUE(listed().empty());
}

TEST_F(FaultLogTest, FaultsOfABoardThatBecomesKnownAreItsOwn) {
    m_log.raise(0, 98, 17);
    m_log.raise(0, 99, 17);
    m_log.raise(0, 99, 300);
    m_log.boardIsKnown(4, 99);
    EXPECT_EQ(listed(), (std::vector<Index>{{0, 17}, {4, 17}, {4, 300}}));
    m_log.clear(4, 99, 17);
    m_log.boardHasGone(4);
    EXPECT_EQ(listed(), (std::vector<Index>{{0, 17}}));
}

TEST_F(FaultLogTest, ClearingReachesWhatWasRaisedBeforeTheBoardWasKnown) {
    m_log.raise(0, 99, 17);
    m_log.clear(4, 99, 17);
    EXPECT_TRUE(listed().empty());
}

TEST_F(FaultLogTest, ClearingOfAKnownBoardLeavesOtherUnknownBoardsAlone) {
    m_log.raise(0, 98, 17);
    m_log.clear(4, 99, 17);
    EXPECT_EQ(listed(), (std::vector<Index>{{0, 17}}));
}

constexpr std::uint16_t kLossOfSignal = kFirstLineFault;
constexpr std::uint16_t kSendingRai = kFirstLineFault + 4;

/// Boards of which lines show faults, and a refresh that finds them so.
class LineFaultsInLogTest : public FaultLogTest {
  protected:
    /// `lines` lines of board 2 show `fault`.
    void show(std::uint16_t fault, std::uint32_t lines) {
        ShownLineFaults& board = m_shown[2];
        board = {};
        board.lines[*lineFault(fault)] = lines;
        board.allClear = lines == 0;
        m_log.compare(m_shown, m_now);
    }
    void showNothing() { show(kLossOfSignal, 0); }

    Clock::time_point m_now = Clock::now();
    std::map<std::uint32_t, ShownLineFaults> m_shown;
};

TEST_F(LineFaultsInLogTest, FaultStaysWhileAnotherLineOfTheBoardHasIt) {
    m_log.raise(2, 10, kLossOfSignal);
    m_log.raise(2, 10, kLossOfSignal);
    m_log.clear(2, 10, kLossOfSignal);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
    m_log.clear(2, 10, kLossOfSignal);
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, FaultOfUnknownBoardIsCountedByLineToo) {
    m_log.raise(0, 10, kLossOfSignal);
    m_log.raise(0, 10, kLossOfSignal);
    m_log.clear(0, 10, kLossOfSignal);
    EXPECT_EQ(listed(), (std::vector<Index>{{0, kLossOfSignal}}));
    m_log.clear(2, 10, kLossOfSignal);
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, FaultThatLinesShowAtTheFirstRefreshIsListed) {
    show(kLossOfSignal, 2);
    ASSERT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
    EXPECT_EQ(read().rows[0].platformBoard, -1);
    EXPECT_EQ(read().raised, 0U);
    m_log.clear(2, 10, kLossOfSignal);
    m_log.clear(2, 10, kLossOfSignal);
    showNothing();
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, FaultThatLinesShowLaterIsNotListedWithoutAReport) {
    showNothing();
    m_now += FaultLog::kLineFaultGrace;
    show(kLossOfSignal, 1);
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, FaultThatBecomesAFailureSoonAfterTheStartIsListed) {
    showNothing();
    m_now += FaultLog::kLineFaultGrace / 2;
    show(kLossOfSignal, 1);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
}

TEST_F(LineFaultsInLogTest, FaultThatIsClearedBeforeItShowsIsNotListedAgain) {
    showNothing();
    m_log.raise(2, 10, kLossOfSignal);
    m_log.clear(2, 10, kLossOfSignal);
    show(kLossOfSignal, 1); // a failure outlasts its defect
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, AlarmThatALineSendsByItselfIsNotListed) {
    show(kSendingRai, 1);
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, ClearedFaultStaysUntilNoLineShowsIt) {
    showNothing();
    m_log.raise(2, 10, kLossOfSignal);
    show(kLossOfSignal, 2); // one of them had it before the agent started, but not as a failure yet
    m_log.clear(2, 10, kLossOfSignal);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
    showNothing();
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, RaisedFaultMayTakeAWhileToShow) {
    m_log.raise(2, 10, kLossOfSignal);
    m_now += FaultLog::kLineFaultGrace / 2;
    showNothing();
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
}

TEST_F(LineFaultsInLogTest, FaultWhoseClearingWasLostGoesWhenAllLinesAreClear) {
    m_log.raise(2, 10, kLossOfSignal);
    m_now += 2 * FaultLog::kLineFaultGrace;
    show(kSendingRai, 1);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
    showNothing();
    EXPECT_TRUE(listed().empty());
}

TEST_F(LineFaultsInLogTest, FaultThatIsNotOfALineIsLeftAlone) {
    m_log.raise(2, 10, 17);
    m_now += 2 * FaultLog::kLineFaultGrace;
    showNothing();
    EXPECT_EQ(listed(), (std::vector<Index>{{2, 17}}));
}

TEST_F(LineFaultsInLogTest, BoardThatReturnsIsComparedAnew) {
    showNothing();
    m_log.boardHasGone(2);
    show(kLossOfSignal, 1);
    EXPECT_EQ(listed(), (std::vector<Index>{{2, kLossOfSignal}}));
}

TEST(ShownLineFaultsTest, LinesAreCountedByBoardAndFault) {
    InterfaceRows rows;
    auto const add = [&](std::uint32_t ifIndex, std::uint32_t board, std::optional<int> status) {
        InterfaceRow& interface = rows.interfaces.emplace_back();
        interface.ifIndex = ifIndex;
        interface.boardIndex = board;
        LineRow& line = rows.lines.emplace_back();
        line.ifIndex = ifIndex;
        line.lineStatus = status;
    };
    add(1000, 1, 64 + 8192);
    add(1001, 1, 64);
    add(1002, 1, 2);
    add(1016, 2, 1);
    add(1032, 3, 64);
    add(1033, 3, std::nullopt);
    auto const shown = shownLineFaults(rows);
    ASSERT_EQ(shown.size(), 2U) << "boards 1 and 2";
    EXPECT_EQ(shown.at(1).lines[0], 2U);
    EXPECT_EQ(shown.at(1).lines[3], 1U);
    EXPECT_FALSE(shown.at(1).allClear);
    EXPECT_TRUE(shown.at(2).allClear);
}

} // namespace
} // namespace kvloamd
