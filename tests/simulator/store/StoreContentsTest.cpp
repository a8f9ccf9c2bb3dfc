// SPDX-License-Identifier: BSD-2-Clause
// What a new attribute store holds.
#include "simulator/store/StoreContents.h"

#include <set>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/description/ChassisReader.h"

namespace {

using namespace kvlsim;
using testing::ElementsAre;
using testing::SizeIs;

StoreContents contentsOf(std::string const& text) {
    return contentsFor(readChassis(text));
}

TEST(StoreContentsTest, BoardsWithoutFamilyHaveNoRecord) {
    auto const contents = contentsOf(R"(
boards:
  - {handle: 1, attributes: {SERIAL_NUMBER: "A1"}}
  - {handle: 2, attributes: {SERIAL_NUMBER: "A2", FAMILY: Z7}}
)");
    ASSERT_THAT(contents.boards, SizeIs(1));
    EXPECT_EQ(contents.boards[0].record.serialNumber(), "A2");
}

TEST(StoreContentsTest, BoardsOfAFamilyThatTheStoreLacksHaveNoRecord) {
    auto const contents = contentsOf(R"(
boards:
  - {handle: 1, attributes: {SERIAL_NUMBER: "A1", FAMILY: NX5}}
store: {families: [Z7]}
)");
    EXPECT_THAT(contents.families, ElementsAre("Z7"));
    EXPECT_THAT(contents.boards, SizeIs(0));
}

TEST(StoreContentsTest, FamilyThatFitsInNoRecordIsNone) {
    auto const contents = contentsOf(R"(
boards:
  - {handle: 1, attributes: {SERIAL_NUMBER: "A1", FAMILY: this-name-has-thirty-character}}
)");
    EXPECT_THAT(contents.families, SizeIs(5));
    EXPECT_THAT(contents.boards, SizeIs(0));
}

TEST(StoreContentsTest, LongAttributeIsCutToItsField) {
    auto const contents = contentsOf("boards: [{handle: 1, attributes: {SERIAL_NUMBER: \"A1\", "
                                     "FAMILY: Z7, NAME: " +
                                     std::string(100, 'n') + "}}]");
    EXPECT_EQ(contents.boards.at(0).record.get(*boardFieldNamed("Model")),
              FieldValue(std::string(79, 'n')));
}

TEST(StoreContentsTest, DescribedStoreMayBeEmpty) {
    auto const contents = contentsOf("boards: []\nstore: {families: [], boards: []}\n");
    EXPECT_THAT(contents.families, SizeIs(0));
    EXPECT_THAT(contents.boards, SizeIs(0));
}

TEST(StoreContentsTest, ExampleChassisHasARecordOfEveryBoardAndOneToSpare) {
    auto const contents = contentsOf(readChassisFile(KVLSIM_SMALL_CHASSIS));
    std::set<std::string> serials;
    for (auto const& board : contents.boards)
        serials.insert(board.record.serialNumber());
    EXPECT_THAT(serials, ElementsAre("NX50001", "NX50002", "QL-77-0420", "V0003-E"));
}

} // namespace
