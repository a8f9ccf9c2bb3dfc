// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/DistinctNames.h"

#include <map>
#include <random>
#include <set>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;

/// Boards whose interfaces get names. The first interface of board 1 has ifIndex 1000, that of
/// board 2 has 2000.
class DistinctNamesTest : public ::testing::Test {
  protected:
    /// Gives the board interfaces with these names. Returns whether the interfaces of all other
    /// boards keep their names.
    bool put(int board, std::vector<std::string> const& names) {
        BoardTexts texts{"B" + std::to_string(board), {}};
        auto index = static_cast<std::uint32_t>(board) * 1000;
        for (std::string const& name : names)
            texts.interfaces.push_back({index++, name, "about " + name});
        if (m_boards.contains(board)) m_names.remove(std::exchange(m_boards[board], {}));
        m_names.add(texts);
        m_boards[board] = std::move(texts);
        return update();
    }
    bool take(int board) {
        m_names.remove(std::move(m_boards[board]));
        m_boards.erase(board);
        return update();
    }
    std::vector<std::string> names(int board) {
        std::vector<std::string> names;
        for (InterfaceTexts const& each : m_names.distinguish(m_boards[board]))
            names.push_back(each.name);
        return names;
    }
    std::vector<BoardTexts const*> all() const {
        std::vector<BoardTexts const*> all;
        for (auto const& [board, texts] : m_boards)
            all.push_back(&texts);
        return all;
    }

    std::map<int, BoardTexts> m_boards;
    DistinctNames m_names;

  private:
    bool update() {
        if (m_names.update()) return true;
        m_names.countAnew(all());
        return false;
    }
};

TEST_F(DistinctNamesTest, NamesThatDifferStayAsTheyAre) {
    EXPECT_TRUE(put(1, {"trunk", "D1"}));
    EXPECT_TRUE(put(2, {"D2"}));
    EXPECT_THAT(names(1), ElementsAre("trunk", "D1"));
    EXPECT_THAT(names(2), ElementsAre("D2"));
}

TEST_F(DistinctNamesTest, NameOfSeveralBoardsIsFollowedByTheBoard) {
    put(1, {"D1", "D2"});
    EXPECT_FALSE(put(2, {"D1"}));
    EXPECT_THAT(names(1), ElementsAre("D1@B1", "D2"));
    EXPECT_THAT(names(2), ElementsAre("D1@B2"));
    EXPECT_EQ(m_names.distinguish(m_boards[2])[0].description, "about D1 of board B2");
}

TEST_F(DistinctNamesTest, NameStandsAloneAgainWhenTheOthersAreGone) {
    put(1, {"D1"});
    put(2, {"D1"});
    EXPECT_FALSE(take(2));
    EXPECT_THAT(names(1), ElementsAre("D1"));
}

TEST_F(DistinctNamesTest, OneMoreOfManyLeavesTheOthersAlone) {
    put(1, {"D1"});
    put(2, {"D1"});
    EXPECT_TRUE(put(3, {"D1"}));
    EXPECT_THAT(names(3), ElementsAre("D1@B3"));
    EXPECT_TRUE(take(1));
}

TEST_F(DistinctNamesTest, NameThatOneBoardGivesTwiceIsFollowedByTheIndexToo) {
    put(1, {"x", "x"});
    EXPECT_THAT(names(1), ElementsAre("x@B1#1000", "x@B1#1001"));
}

TEST_F(DistinctNamesTest, NameThatAnotherGetsFromItsBoardIsFollowedByTheIndex) {
    put(1, {"D1"});
    put(2, {"D1"});
    EXPECT_FALSE(put(3, {"D1@B1"}));
    EXPECT_THAT(names(1), ElementsAre("D1@B1#1000"));
    EXPECT_THAT(names(2), ElementsAre("D1@B2"));
    EXPECT_THAT(names(3), ElementsAre("D1@B1#3000"));
    EXPECT_FALSE(take(3));
    EXPECT_THAT(names(1), ElementsAre("D1@B1"));
}

TEST_F(DistinctNamesTest, NoNamesAreEqualHoweverLongTheyAre) {
    std::string const longest(255, 'n');
    put(1, {longest, longest});
    put(2, {longest});
    std::set<std::string> all;
    for (auto const& [board, texts] : m_boards) {
        for (InterfaceTexts const& each : m_names.distinguish(texts)) {
            all.insert(each.name);
            EXPECT_LE(each.name.size(), 255U);
            EXPECT_LE(each.description.size(), 255U);
        }
    }
    EXPECT_EQ(all.size(), 3U);
}

TEST_F(DistinctNamesTest, CountingChangesIsCountingAnew) {
    // Few names. Some are equal to what others become when the name of a board follows them.
    std::vector<std::string> const some{"a", "b", "c", "d", "a@B1", "b@B2", "a@B1@B2"};
    std::mt19937 random(20261122);
    auto const number = [&](int least, int most) {
        return std::uniform_int_distribution(least, most)(random);
    };
    int left = 0;
    for (int step = 0; step < 20'000; ++step) {
        int const board = number(1, 5);
        std::map<int, std::vector<std::string>> former;
        for (auto const& [other, texts] : m_boards)
            former[other] = names(other);
        bool stand = false;
        if (number(0, 2) == 0 && m_boards.contains(board)) {
            stand = take(board);
        } else {
            std::vector<std::string> given(static_cast<std::size_t>(number(0, 3)));
            for (std::string& name : given)
                name = some[static_cast<std::size_t>(number(0, 6))];
            stand = put(board, given);
        }
        DistinctNames anew;
        anew.countAnew(all());
        for (auto const& [other, texts] : m_boards) {
            ASSERT_EQ(m_names.distinguish(texts), anew.distinguish(texts)) << "step " << step;
            if (stand && other != board) {
                ASSERT_EQ(names(other), former[other]) << "step " << step;
                ++left;
            }
        }
    }
    EXPECT_GT(left, 1000);
}

} // namespace
} // namespace kvloamd
