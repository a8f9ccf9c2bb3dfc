// SPDX-License-Identifier: BSD-2-Clause
// An ifIndex outlasts restarts of the agent and the absence of its board.
#include <filesystem>
#include <string>

#include <gmock/gmock.h>

#include "tests/e2e/InterfaceFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::SizeIs;

class KeptIndexTest : public InterfaceFixture {};

TEST_F(KeptIndexTest, IndicesAreTheSameAfterARestart) {
    startAgent();
    auto const before = column(c(kIfX, 1));
    EXPECT_THAT(before, SizeIs(73));
    EXPECT_EQ(stopAgent(), 0);
    startAgent({"--interface-base", "5000"});
    EXPECT_EQ(column(c(kIfX, 1)), before);
}

TEST_F(KeptIndexTest, FirstIndexIsTheBase) {
    startAgent({"--interface-base", "5000"});
    EXPECT_EQ(column(c(kIf, 1)).begin()->first, "5000");
}

TEST_F(KeptIndexTest, RowsGoWithABoardAndComeBackUnderTheSameIndices) {
    useChassis("boards:\n" + boardWithLine(1, "ONE") + boardWithLine(2, "TWO"));
    startAgent();
    ASSERT_EQ(lineNamed("line-ONE"), "1000");
    ASSERT_EQ(lineNamed("line-TWO"), "1016");
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([&] { return column(c(kConfig, 1)).size() == 1; }));
    EXPECT_EQ(lineNamed("line-ONE"), "none");
    EXPECT_EQ(lineNamed("line-TWO"), "1016");
    // A board with another serial number is another board, even in the same slot.
    write(path("new.yaml"), "boards:\n" + boardWithLine(1, "NEW"));
    sim({"insert", path("new.yaml")});
    EXPECT_TRUE(eventually([&] { return lineNamed("line-NEW") == "1032"; }));
    write(path("one.yaml"), "boards:\n" + boardWithLine(7, "ONE"));
    sim({"insert", path("one.yaml")});
    EXPECT_TRUE(eventually([&] { return lineNamed("line-ONE") == "1000"; }));
}

TEST_F(KeptIndexTest, BoardThatIsAwayDuringARestartHasItsIndicesAgain) {
    useChassis("boards:\n" + boardWithLine(1, "ONE") + boardWithLine(2, "TWO"));
    startAgent();
    EXPECT_EQ(stopAgent(), 0);
    useChassis("boards:\n" + boardWithLine(3, "NEW"));
    startAgent();
    EXPECT_EQ(lineNamed("line-NEW"), "1032");
    EXPECT_EQ(stopAgent(), 0);
    useChassis("boards:\n" + boardWithLine(5, "TWO"));
    startAgent();
    EXPECT_EQ(lineNamed("line-TWO"), "1016");
}

TEST_F(KeptIndexTest, DamagedIndexFileIsSetAside) {
    std::filesystem::create_directories(path("persistent"));
    write(path("persistent/ifindex.sqlite"),
          "this is no database, and long enough to be taken for one if nobody looks into it");
    startAgent();
    EXPECT_THAT(agent().output(), HasSubstr("ifindex.sqlite.damaged-"));
    EXPECT_EQ(lineNamed("nx5-trunk-1"), "1000");
}

} // namespace
} // namespace kvloamd::e2e
