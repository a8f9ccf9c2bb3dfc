// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StableIndices.h"

#include <gmock/gmock.h>

#include "tests/agent/readers/StateFolder.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;

class StableIndicesTest : public StateFolder {
  protected:
    /// Days pass only where a test says so.
    Retention retention(std::int64_t days, std::size_t boards = 100) {
        return {days, boards, [this] { return m_date; }};
    }

    std::int64_t m_date = 20000;
};

TEST_F(StableIndicesTest, FirstBoardBeginsAtTheBase) {
    AgentRun run(file(), 500);
    EXPECT_THAT(run.ask("A", lines(3)), ElementsAre(500, 501, 502));
}

TEST_F(StableIndicesTest, SameInterfaceHasTheSameIndexWheneverItIsAsked) {
    AgentRun run(file());
    run.ask("A", lines(3));
    EXPECT_THAT(run.ask("A", {lines(3)[2], lines(3)[0]}), ElementsAre(1002, 1000));
}

TEST_F(StableIndicesTest, IndicesAreTheSameAfterARestart) {
    {
        AgentRun run(file());
        run.ask("A", lines(3));
        run.ask("B", lines(2));
    }
    AgentRun run(file());
    EXPECT_THAT(run.ask("B", lines(2)), ElementsAre(1016, 1017));
    EXPECT_THAT(run.ask("A", lines(3)), ElementsAre(1000, 1001, 1002));
}

TEST_F(StableIndicesTest, BoardThatWasAwayDuringARestartHasItsIndicesAgain) {
    {
        AgentRun run(file());
        run.ask("A", lines(1));
        run.ask("B", lines(1));
    }
    {
        AgentRun run(file());
        run.ask("B", lines(1));
        run.ask("C", lines(1));
    }
    AgentRun run(file());
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(run.ask("C", lines(1)), ElementsAre(1032));
}

TEST_F(StableIndicesTest, BoardOfAnotherSerialNumberHasItsOwnIndices) {
    AgentRun run(file());
    run.ask("A", lines(2));
    EXPECT_THAT(run.ask("A2", lines(2)), ElementsAre(1016, 1017));
}

TEST_F(StableIndicesTest, InterfacesOfOneNameAndSeveralKindsAreDifferent) {
    AgentRun run(file());
    EXPECT_THAT(run.ask("A", {{IndexKind::Ethernet, "1"}, {IndexKind::Ip, "1"}}),
                ElementsAre(1000, 1001));
}

TEST_F(StableIndicesTest, BlockHasThePowerOfTwoThatLeavesRoom) {
    AgentRun run(file());
    run.ask("A", lines(32)); // with room for more: 64
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1064));
}

TEST_F(StableIndicesTest, TwoBoardsThatGrowStayApart) {
    AgentRun run(file());
    run.ask("A", lines(10));
    run.ask("B", lines(10));
    auto const a = run.ask("A", lines(20));
    auto const b = run.ask("B", lines(20));
    EXPECT_EQ(a[15], 1015U); // the last of its first block
    EXPECT_EQ(a[16], 1032U); // the first of its second
    EXPECT_EQ(b[15], 1031U);
    EXPECT_EQ(b[16], 1048U);
}

TEST_F(StableIndicesTest, GrownBoardIsTheSameAfterARestart) {
    std::vector<std::uint32_t> before;
    {
        AgentRun run(file());
        run.ask("A", lines(10));
        run.ask("B", lines(10));
        before = run.ask("A", lines(20));
    }
    AgentRun run(file());
    EXPECT_EQ(run.ask("A", lines(20)), before);
    EXPECT_EQ(run.ask("A", lines(21)).back(), before.back() + 1);
}

TEST_F(StableIndicesTest, InterfaceThatGoesLeavesNoRoomForAnother) {
    AgentRun run(file());
    run.ask("A", lines(2));
    EXPECT_THAT(run.ask("A", {lines(2)[0], {IndexKind::Ip, "1"}}), ElementsAre(1000, 1002));
}

TEST_F(StableIndicesTest, AnotherBaseLeavesOldIndicesAlone) {
    {
        AgentRun run(file(), 1000);
        run.ask("A", lines(1));
    }
    AgentRun run(file(), 5000);
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(5000));
}

TEST_F(StableIndicesTest, InterfacesBeyondTheLastIndexHaveNone) {
    StableIndices indices(kLastIndex - 15);
    EXPECT_THAT(indices.indicesOf({"A", true}, lines(1)), ElementsAre(kLastIndex - 15));
    EXPECT_THAT(indices.indicesOf({"B", true}, lines(1)), ElementsAre(0));
}

TEST_F(StableIndicesTest, BoardThatCannotBeIdentifiedHasItsIndicesWhileItIsPresent) {
    AgentRun run(file());
    EXPECT_THAT(run.ask("x", lines(2), false), ElementsAre(1000, 1001));
    EXPECT_THAT(run.ask("x", lines(2), false), ElementsAre(1000, 1001));
    EXPECT_FALSE(run.indices.isStable(1000));
}

TEST_F(StableIndicesTest, BoardThatCannotBeIdentifiedLeavesNothingBehind) {
    {
        AgentRun run(file());
        for (int replug = 0; replug < 100; ++replug)
            run.ask("x" + std::to_string(replug), lines(2), false);
        run.ask("A", lines(1));
    }
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM interface"), 1);
    EXPECT_EQ(database.number("SELECT count(*) FROM block"), 1);
}

TEST_F(StableIndicesTest, BoardThatIsAwayForTooManyDaysIsForgotten) {
    AgentRun run(file(), 1000, retention(2));
    run.ask("A", lines(2));
    for (int day = 0; day < 2; ++day) {
        ++m_date;
        run.ask("B", lines(1));
    }
    EXPECT_TRUE(run.indices.isStable(1000)); // two days: not too many yet
    ++m_date;
    run.ask("B", lines(1));
    run.ask("B", lines(1));
    EXPECT_FALSE(run.indices.isStable(1000));
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM interface WHERE serialNumber = 'A'"), 0);
    EXPECT_EQ(database.number("SELECT count(*) FROM block WHERE serialNumber = 'A'"), 0);
}

TEST_F(StableIndicesTest, DaysCountAcrossRestarts) {
    AgentRun(file(), 1000, retention(1)).ask("A", lines(1));
    for (int day = 0; day < 3; ++day) {
        ++m_date;
        AgentRun run(file(), 1000, retention(1));
        run.ask("B", lines(1));
        run.ask("B", lines(1));
    }
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM interface"), 1);
}

TEST_F(StableIndicesTest, ClockThatJumpsAheadMakesNoBoardOld) {
    AgentRun(file(), 1000, retention(10)).ask("A", lines(1));
    m_date += 100000;
    AgentRun run(file(), 1000, retention(10));
    run.ask("B", lines(1));
    EXPECT_TRUE(run.indices.isStable(1000));
}

TEST_F(StableIndicesTest, StoppedBoardIsPresent) {
    AgentRun run(file(), 1000, retention(2));
    run.ask("A", lines(1));
    for (int day = 0; day < 5; ++day) {
        ++m_date;
        run.ask("A", {}); // it has no lines meanwhile
    }
    EXPECT_TRUE(run.indices.isStable(1000));
}

TEST_F(StableIndicesTest, OfTooManyBoardsThatAreAwayTheFirstGoes) {
    AgentRun run(file(), 1000, retention(400, 2));
    for (char const* const board : {"C", "B", "A"})
        run.ask(board, lines(1));
    EXPECT_TRUE(run.indices.isStable(1000)); // two are away
    run.ask("D", lines(1));
    EXPECT_FALSE(run.indices.isStable(1000));
    EXPECT_TRUE(run.indices.isStable(1016));
    EXPECT_TRUE(run.indices.isStable(1032));
}

} // namespace
} // namespace kvloamd
