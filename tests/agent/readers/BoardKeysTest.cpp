// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardKeys.h"

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

BoardRow board(std::uint32_t index, std::string serialNumber, std::optional<int> slot = {},
               std::optional<int> logicalId = {}) {
    BoardRow row;
    row.boardIndex = index;
    row.serialNumber = std::move(serialNumber);
    row.pciSlotNumber = slot;
    row.logicalId = logicalId;
    return row;
}

TEST(BoardKeysTest, KeyIsTheSerialNumberWhateverThePlace) {
    EXPECT_EQ(boardKeys({board(1, "A", 3)}), boardKeys({board(7, "A", 5, 2)}));
}

TEST(BoardKeysTest, BoardOfUnknownSerialNumberIsKnownByItsSlot) {
    for (char const* const unknown : {"", "unknown"}) {
        auto const keys = boardKeys({board(1, unknown, 3)});
        EXPECT_TRUE(keys[0].stable);
        EXPECT_EQ(keys, boardKeys({board(9, unknown, 3)})); // after a restart
        EXPECT_NE(keys, boardKeys({board(1, unknown, 4)}));
    }
}

TEST(BoardKeysTest, BusAndShelfArePartOfThePlace) {
    BoardRow a = board(1, "", 3);
    BoardRow b = board(2, "", 3);
    a.busNumber = 1;
    b.busNumber = 2;
    auto const keys = boardKeys({a, b});
    EXPECT_TRUE(keys[0].stable && keys[1].stable);
    EXPECT_NE(keys[0].name, keys[1].name);
}

TEST(BoardKeysTest, BoardOfUnknownSlotIsKnownByItsLogicalIdentifier) {
    auto const keys = boardKeys({board(1, "", {}, 4)});
    EXPECT_TRUE(keys[0].stable);
    EXPECT_EQ(keys, boardKeys({board(2, "", {}, 4)}));
}

TEST(BoardKeysTest, BoardThatKnowsNothingOfItselfHasNoStableKey) {
    auto const keys = boardKeys({board(1, ""), board(2, "")});
    EXPECT_FALSE(keys[0].stable || keys[1].stable);
    EXPECT_NE(keys[0].name, keys[1].name);
}

TEST(BoardKeysTest, BoardsOfOneSerialNumberAreToldApartByTheirPlaces) {
    auto const before = boardKeys({board(1, "A", 3), board(2, "A", 5)});
    EXPECT_EQ(before[0].name, "A");
    EXPECT_TRUE(before[1].stable);
    // The order in which boards appear is of one run only.
    auto const after = boardKeys({board(1, "A", 5), board(2, "A", 3)});
    EXPECT_EQ(after[0], before[1]);
    EXPECT_EQ(after[1], before[0]);
}

TEST(BoardKeysTest, SecondBoardInOnePlaceHasNoStableKey) {
    auto const keys = boardKeys({board(1, "", 3), board(2, "", 3)});
    EXPECT_TRUE(keys[0].stable);
    EXPECT_FALSE(keys[1].stable);
}

} // namespace
} // namespace kvloamd
