// SPDX-License-Identifier: BSD-2-Clause
// The lists of boards.
#include <vector>

#include <gtest/gtest.h>

#include "access/DeviceMapperIf.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

DeviceMapperIf& mapper() {
    return *DeviceMapperIf::get_interface();
}

TEST(DeviceMapperIfTest, InterfaceIsTheSameEveryTime) {
    EXPECT_EQ(DeviceMapperIf::get_interface(), DeviceMapperIf::get_interface());
}

TEST(DeviceMapperIfTest, ClientIsThePlatforms) {
    EXPECT_EQ(mapper().GetDMClient(), dm_getDeviceMapperClient());
}

TEST(DeviceMapperIfTest, BoardsAreListedInThePlatformsOrder) {
    sim::load({sim::board(9, "A"), sim::board(3, "B"), sim::board(5, "C")});
    EXPECT_EQ(mapper().ListAllBoards(), (std::vector<long>{9, 3, 5}));
}

TEST(DeviceMapperIfTest, EmptyChassisHasNoBoards) {
    sim::load({});
    EXPECT_TRUE(mapper().ListAllBoards().empty());
}

TEST(DeviceMapperIfTest, SearchThatMatches150BoardsAnswers100) {
    sim::loadMany(150);
    std::vector<long> const boards = mapper().ListAllBoards();
    ASSERT_EQ(boards.size(), 100U);
    EXPECT_EQ(boards.front(), 1);
    EXPECT_EQ(boards.back(), 100);
}

TEST(DeviceMapperIfTest, BoardsOfOnePlatformAreListedAlone) {
    sim::load({sim::board(1, "A", "CTPLATFORM: NX5"), sim::board(2, "B", "CTPLATFORM: QUILLON"),
               sim::board(3, "C", "CTPLATFORM: NX5"), sim::board(4, "D")});
    EXPECT_EQ(mapper().ListBoardsByPlatform(DeviceMapperIf::NX5BoardPlatform),
              (std::vector<long>{1, 3}));
    EXPECT_EQ(mapper().ListBoardsByPlatform(DeviceMapperIf::QuillonBoardPlatform),
              (std::vector<long>{2}));
    EXPECT_TRUE(mapper().ListBoardsByPlatform(DeviceMapperIf::VORNBoardPlatform).empty());
}

TEST(DeviceMapperIfTest, PlatformTextMatchesWithItsTerminator) {
    sim::load({sim::board(1, "A", "CTPLATFORM: NX5"), sim::board(2, "B", "CTPLATFORM: NX50")});
    EXPECT_EQ(mapper().ListBoardsByPlatform("NX5"), (std::vector<long>{1}));
    EXPECT_TRUE(mapper().ListBoardsByPlatform("NX").empty());
}

TEST(DeviceMapperIfTest, PlatformsAreNamedAsTheDeviceMapperNamesThem) {
    EXPECT_EQ(DeviceMapperIf::NX5BoardPlatform, "NX5");
    EXPECT_EQ(DeviceMapperIf::QuillonBoardPlatform, "QUILLON");
    EXPECT_EQ(DeviceMapperIf::VORNBoardPlatform, "VORN");
}

} // namespace
