// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardSource.h"

#include <stdexcept>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/FakeBoards.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// A manager whose boards go away while somebody walks over them.
class ShakyManager final : public BoardManager {
  public:
    /// Called before every step of a walk.
    std::function<void(int)> beforeStep = [](int) {};

    int GetNextBoardIndex(int index) override {
        beforeStep(index);
        return BoardManager::GetNextBoardIndex(index);
    }
};

class BoardSourceTest : public ::testing::Test {
  protected:
    BoardSourceTest() {
        m_manager->Attach(m_factoryHandle);
        for (char const* const serialNumber : {"A", "B", "C", "D"}) {
            auto* const board = new FakeBoard;
            m_boards.emplace_back(board);
            board->serialNumber = serialNumber;
            m_factory->enter(m_boards.back());
        }
    }

    void takeOut(int index) { m_factory->takeOut(m_boards[static_cast<std::size_t>(index) - 1]); }
    std::vector<std::uint32_t> readIndices() {
        std::vector<std::uint32_t> indices;
        for (BoardRow const& row : m_source.read())
            indices.push_back(row.boardIndex);
        return indices;
    }

    ShakyManager* m_shaky = new ShakyManager;
    ReferenceCounter<BoardManager> m_manager{m_shaky};
    FakeFactory* m_factory = new FakeFactory;
    ReferenceCounter<BoardFactory> m_factoryHandle{m_factory};
    std::vector<ReferenceCounter<Board>> m_boards;
    BoardSource m_source{*m_shaky};
};

TEST_F(BoardSourceTest, BoardsAreReadInTheOrderOfTheirIndices) {
    EXPECT_THAT(readIndices(), ElementsAre(1, 2, 3, 4));
}

TEST_F(BoardSourceTest, EmptyTableReadsAsNoBoards) {
    for (int index = 1; index <= 4; ++index)
        takeOut(index);
    EXPECT_THAT(readIndices(), IsEmpty());
}

TEST_F(BoardSourceTest, BoardThatGoesUnderTheWalkHidesNoOther) {
    m_shaky->beforeStep = [this](int index) {
        if (index == 2) takeOut(2);
    };
    EXPECT_THAT(readIndices(), ElementsAre(1, 3, 4));
}

TEST_F(BoardSourceTest, SeveralBoardsThatGoUnderTheWalkHideNoOther) {
    m_shaky->beforeStep = [this](int index) {
        if (index != 3) return;
        for (int gone = 1; gone <= 3; ++gone)
            takeOut(gone);
    };
    EXPECT_THAT(readIndices(), ElementsAre(4));
}

TEST_F(BoardSourceTest, LastBoardMayGoUnderTheWalk) {
    m_shaky->beforeStep = [this](int index) {
        if (index == 4) takeOut(4);
    };
    EXPECT_THAT(readIndices(), ElementsAre(1, 2, 3));
}

TEST_F(BoardSourceTest, BoardThatIsAnnouncedAsGoneIsLeftOutWhileTheTableStillHasIt) {
    m_source.boardHasGone(3);
    EXPECT_THAT(readIndices(), ElementsAre(1, 2, 4));
    takeOut(3);
    EXPECT_THAT(readIndices(), ElementsAre(1, 2, 4));
}

TEST_F(BoardSourceTest, BoardThatIsAnnouncedAsGoneWhileItIsReadIsLeftOut) {
    FakeChassis::fake(m_boards[3]).whenAsked = [this] { m_source.boardHasGone(4); };
    EXPECT_THAT(readIndices(), ElementsAre(1, 2, 3));
}

TEST_F(BoardSourceTest, BoardThatThrowsIsShownAsNotAnsweringAndTheOthersAsTheyAre) {
    LogCapture logged;
    auto const before = m_source.read();
    auto& faulty = FakeChassis::fake(m_boards[1]);
    faulty.whenAsked = [] { throw std::runtime_error("lost the bus"); };
    for (int reading = 0; reading < 3; ++reading) {
        auto const rows = m_source.read();
        ASSERT_EQ(rows.size(), 4U);
        EXPECT_EQ(rows[1].status, BoardStatusNone);
        EXPECT_EQ(rows[1].errorMessage, "does not answer: lost the bus");
        EXPECT_EQ(rows[1].serialNumber, "B");
        EXPECT_EQ(rows[1].name, before[1].name);
        EXPECT_EQ(rows[2], before[2]);
    }
    faulty.whenAsked = [] {};
    EXPECT_EQ(m_source.read(), before);
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 2) << message;
}

TEST_F(BoardSourceTest, BoardThatThrowsSomethingOddIsShownAsNotAnswering) {
    LogCapture logged;
    FakeChassis::fake(m_boards[0]).whenAsked = [] { throw 7; };
    auto const rows = m_source.read();
    ASSERT_EQ(rows.size(), 4U);
    EXPECT_EQ(rows[0].errorMessage, "does not answer: ");
    FakeChassis::fake(m_boards[0]).whenAsked = [] {};
    m_source.read();
}

} // namespace
} // namespace kvloamd
