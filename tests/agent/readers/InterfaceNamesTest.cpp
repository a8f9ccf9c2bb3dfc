// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceNames.h"

#include <set>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;

class InterfaceNamesTest : public ::testing::Test {
  protected:
    void add(std::string name, std::uint32_t board, std::string description = "") {
        InterfaceTexts row;
        row.ifIndex = static_cast<std::uint32_t>(1000 + m_rows.size());
        row.boardIndex = board;
        row.description =
            description.empty() ? "at " + std::to_string(row.ifIndex) : std::move(description);
        row.name = std::move(name);
        m_rows.push_back(std::move(row));
    }
    std::vector<std::string> names() {
        distinguishNames(m_rows, {{1, "ONE"}, {2, "TWO"}});
        std::vector<std::string> all;
        for (InterfaceTexts const& row : m_rows)
            all.push_back(row.name);
        return all;
    }
    static InterfaceRow completed(IndexKind kind, std::string const& name, std::string key) {
        InterfaceRow row;
        row.name = name;
        completeName(row, {kind, std::move(key)}, "A");
        return row;
    }

    std::vector<InterfaceTexts> m_rows;
};

TEST_F(InterfaceNamesTest, InterfaceWithoutANameIsCalledAfterItsKind) {
    EXPECT_EQ(completed(IndexKind::Ethernet, "", "1").name, "eth1@A");
    EXPECT_EQ(completed(IndexKind::Ip, "", "2").name, "ip2@A");
    EXPECT_EQ(completed(IndexKind::Other, "", "3").name, "if3@A");
    EXPECT_EQ(completed(IndexKind::Ethernet, "", "1").description,
              "Ethernet interface 1 of board A");
    EXPECT_EQ(completed(IndexKind::Line, "", "").name, "line@A");
}

TEST_F(InterfaceNamesTest, SecondOfANameOnABoardIsNumbered) {
    EXPECT_EQ(completed(IndexKind::Line, "trunk", "trunk#2").name, "trunk#2");
    EXPECT_EQ(completed(IndexKind::Line, "trunk", "trunk").name, "trunk");
}

TEST_F(InterfaceNamesTest, NamesThatDifferStayAsTheyAre) {
    add("trunk", 1);
    add("D1", 1);
    add("D2", 2);
    EXPECT_THAT(names(), ElementsAre("trunk", "D1", "D2"));
}

TEST_F(InterfaceNamesTest, NameOfSeveralBoardsIsFollowedByTheBoard) {
    add("D1", 1, "signalling channel D1");
    add("D2", 1);
    add("D1", 2, "signalling channel D1");
    EXPECT_THAT(names(), ElementsAre("D1@ONE", "D2", "D1@TWO"));
    EXPECT_EQ(m_rows[0].description, "signalling channel D1 of board ONE");
    EXPECT_EQ(m_rows[2].description, "signalling channel D1 of board TWO");
}

TEST_F(InterfaceNamesTest, NameThatOneBoardGivesTwiceIsFollowedByTheIndexToo) {
    add("x", 1);
    add("x", 1);
    EXPECT_THAT(names(), ElementsAre("x@ONE#1000", "x@ONE#1001"));
}

TEST_F(InterfaceNamesTest, NoNamesAreEqualHoweverLongTheyAre) {
    std::string const longest(255, 'n');
    for (std::uint32_t const board : {1U, 2U, 1U})
        add(longest, board, longest);
    auto const all = names();
    EXPECT_EQ(std::set<std::string>(all.begin(), all.end()).size(), 3U);
    for (InterfaceTexts const& row : m_rows) {
        EXPECT_LE(row.name.size(), 255U);
        EXPECT_LE(row.description.size(), 255U);
    }
}

} // namespace
} // namespace kvloamd
