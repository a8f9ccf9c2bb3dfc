// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardTurns.h"

#include <chrono>
#include <set>
#include <vector>

#include <gmock/gmock.h>

#include "agent/readers/BoardSource.h"
#include "agent/readers/InterfaceReader.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeLines.h"

namespace kvloamd {
namespace {

using namespace std::chrono_literals;
using ::testing::SizeIs;

class BoardTurnsTest : public ::testing::Test {
  protected:
    BoardTurnsTest() {
        for (int board = 1; board <= 300; ++board)
            m_boards.push_back(board);
        m_turns.begin(m_boards, m_now);
    }
    /// The boards that a refresh reads after so much time.
    std::set<std::uint32_t> refreshAfter(Clock::duration time) {
        m_turns.begin(m_boards, m_now += time);
        std::set<std::uint32_t> due;
        for (int const board : m_boards)
            if (m_turns.isDue(static_cast<std::uint32_t>(board)))
                due.insert(static_cast<std::uint32_t>(board));
        return due;
    }

    std::vector<int> m_boards;
    Clock::time_point m_now = Clock::now();
    BoardTurns m_turns;
};

TEST_F(BoardTurnsTest, FirstRefreshReadsAllBoards) {
    BoardTurns fresh;
    fresh.begin(m_boards, m_now);
    for (int const board : m_boards)
        EXPECT_TRUE(fresh.isDue(static_cast<std::uint32_t>(board)));
}

TEST_F(BoardTurnsTest, EveryBoardHasItsTurnInThirtySeconds) {
    for (Clock::duration const pause : {Clock::duration(100ms), Clock::duration(1s),
                                        Clock::duration(10s), Clock::duration(31s)}) {
        std::set<std::uint32_t> seen;
        for (Clock::duration passed{}; passed < BoardTurns::kLongest; passed += pause)
            seen.merge(refreshAfter(pause));
        EXPECT_THAT(seen, SizeIs(300)) << pause.count();
    }
}

TEST_F(BoardTurnsTest, FewBoardsHaveTheirTurnAtOnce) {
    EXPECT_THAT(refreshAfter(0ms), SizeIs(1));
    EXPECT_THAT(refreshAfter(100ms), SizeIs(2));
    EXPECT_THAT(refreshAfter(1s), SizeIs(11));
}

TEST_F(BoardTurnsTest, BoardThatIsNotedIsDueOnce) {
    refreshAfter(0ms); // the turn is at the first boards
    m_turns.note(200);
    EXPECT_TRUE(refreshAfter(0ms).contains(200));
    EXPECT_FALSE(refreshAfter(0ms).contains(200));
}

TEST_F(BoardTurnsTest, BoardThatIsAddedIsDueInThisRefreshOnly) {
    refreshAfter(0ms);
    m_turns.add(200);
    EXPECT_TRUE(m_turns.isDue(200));
    EXPECT_FALSE(refreshAfter(0ms).contains(200));
}

TEST_F(BoardTurnsTest, TurnsGoOnWhenTheBoardAtTheTurnIsGone) {
    auto const due = refreshAfter(0ms);
    std::erase(m_boards, static_cast<int>(*due.begin()));
    EXPECT_EQ(*refreshAfter(0ms).begin(), *due.begin() + 1);
}

TEST_F(BoardTurnsTest, WithoutTurnsEveryBoardIsDue) {
    EXPECT_TRUE(isDue(nullptr, 7));
}

/// Boards that change without saying so.
class SilentChangeTest : public ::testing::Test {
  protected:
    SilentChangeTest() {
        for (char const* const serialNumber : {"A", "B", "C"})
            m_boards.push_back(m_chassis.insert(serialNumber));
        m_source.read();
    }
    FakeBoard& board(std::size_t place) { return FakeChassis::fake(m_boards[place]); }

    FakeChassis m_chassis;
    std::vector<ReferenceCounter<Board>> m_boards;
    BoardTurns m_turns;
    BoardSource m_source{*m_chassis.manager.get(), &m_turns};
    StableIndices m_indices{1000};
    InterfaceReader m_interfaces{*m_chassis.manager.get(), m_indices, Clock::now(), &m_turns};
};

TEST_F(SilentChangeTest, RowsOfBoardsThatStayAreShared) {
    auto const before = m_source.read();
    EXPECT_TRUE(m_source.read().shares(before));
}

TEST_F(SilentChangeTest, OnlyTheRowOfTheBoardThatChangesIsNew) {
    auto const before = m_source.read();
    board(1).status = BoardStatusStopped;
    auto const after = m_source.read();
    EXPECT_EQ(after[1].status, BoardStatusStopped);
    EXPECT_EQ(before[1].status, BoardStatusStarted);
    EXPECT_EQ(&after[0], &before[0]);
    EXPECT_EQ(&after[2], &before[2]);
}

TEST_F(SilentChangeTest, ShowsWhenTheBoardHasItsTurn) {
    for (std::size_t place = 0; place < 3; ++place)
        board(place).text = "other";
    std::size_t shown = 0;
    for (int refresh = 0; refresh < 3; ++refresh) {
        auto const rows = m_source.read();
        auto const changed = std::ranges::count(rows, "other name", &BoardRow::name);
        EXPECT_GT(static_cast<std::size_t>(changed), shown); // one more has had its turn
        shown = static_cast<std::size_t>(changed);
    }
    EXPECT_EQ(shown, 3U);
}

TEST_F(SilentChangeTest, StatusOfALineShowsAtOnce) {
    std::vector<FakeLine*> lines;
    for (auto const& each : m_boards) {
        lines.push_back(new FakeLine("trunk", ""));
        each->AddFeature(ReferenceCounter<Feature>(new FakeLineFeature({lines.back()})));
    }
    m_interfaces.read(m_source.read());
    for (FakeLine* const line : lines) {
        line->lineStatus = DS1LineStatusLossOfSignal;
        auto const rows = m_interfaces.read(m_source.read());
        EXPECT_EQ(std::ranges::count(rows.lines, DS1LineStatusLossOfSignal, &LineRow::lineStatus),
                  1);
        line->lineStatus = DS1LineStatusNoAlarm;
        m_interfaces.read(m_source.read());
    }
}

} // namespace
} // namespace kvloamd
