// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Rows.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <iterator>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "agent/rows/RowFinder.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Row {
    std::uint32_t number = 0;
    std::string text;

    std::array<std::uint32_t, 1> index() const { return {number}; }
    bool operator==(Row const&) const = default;
};

static_assert(std::random_access_iterator<Rows<Row>::Iterator>);

std::vector<std::uint32_t> numbersOf(Rows<Row> const& rows) {
    std::vector<std::uint32_t> numbers;
    for (Row const& row : rows)
        numbers.push_back(row.number);
    return numbers;
}

TEST(RowsTest, NewSequenceIsEmpty) {
    Rows<Row> const rows;
    EXPECT_TRUE(rows.empty());
    EXPECT_THAT(numbersOf(rows), IsEmpty());
    EXPECT_THROW(rows.at(0), std::out_of_range);
}

TEST(RowsTest, RowsStayInOrder) {
    Rows<Row> rows{{1, "a"}, {2, "b"}};
    rows.push_back({3, "c"});
    rows.emplace_back().number = 4;
    EXPECT_THAT(numbersOf(rows), ElementsAre(1, 2, 3, 4));
    EXPECT_EQ(rows.front().text, "a");
    EXPECT_EQ(rows.back().number, 4U);
}

TEST(RowsTest, CopySharesTheRows) {
    Rows<Row> const rows{{1, "a"}};
    Rows<Row> const copy = rows;
    EXPECT_TRUE(copy.shares(rows));
    EXPECT_EQ(&copy[0], &rows[0]);
}

TEST(RowsTest, EditedRowIsTheSequencesOwn) {
    Rows<Row> const before{{1, "a"}, {2, "b"}};
    Rows<Row> after = before;
    after.edit(1).text = "changed";
    EXPECT_EQ(before[1].text, "b");
    EXPECT_EQ(after[1].text, "changed");
    EXPECT_EQ(&after[0], &before[0]);
    EXPECT_NE(after, before);
}

TEST(RowsTest, AppendingToACopyLeavesTheOtherAlone) {
    Rows<Row> const before{{1, "a"}};
    Rows<Row> after = before;
    after.push_back({2, "b"});
    EXPECT_THAT(numbersOf(before), ElementsAre(1));
    EXPECT_THAT(numbersOf(after), ElementsAre(1, 2));
}

TEST(RowsTest, RowsOutliveTheSequenceThatTheyWereSharedWith) {
    Rows<Row> kept;
    {
        auto const part = std::make_shared<std::vector<Row> const>(
            std::vector<Row>{{1, "a text that is too long to be stored in place"}});
        Rows<Row> made;
        made.append(*part, part);
        kept = made;
    }
    EXPECT_EQ(kept[0].text, "a text that is too long to be stored in place");
}

TEST(RowsTest, EqualRowsAreEqualAlthoughNothingIsShared) {
    Rows<Row> const one{{1, "a"}};
    Rows<Row> const same{{1, "a"}};
    Rows<Row> const other{{1, "b"}};
    EXPECT_FALSE(one.shares(same));
    EXPECT_EQ(one, same);
    EXPECT_NE(one, other);
}

TEST(RowsTest, RowsAreSortedByTheirIndex) {
    Rows<Row> rows{{3, ""}, {1, ""}, {2, ""}};
    rows.sortBy(&Row::number);
    EXPECT_THAT(numbersOf(rows), ElementsAre(1, 2, 3));
}

TEST(RowsTest, RowsAreAddedAndRemovedAtTheEnd) {
    Rows<Row> rows{{1, "a"}, {2, "b"}};
    rows.resize(1);
    EXPECT_THAT(numbersOf(rows), ElementsAre(1));
    rows.resize(3);
    EXPECT_THAT(numbersOf(rows), ElementsAre(1, 0, 0));
}

TEST(RowFinderTest, RowsAreFoundInAnyOrder) {
    Rows<Row> const rows{{2, "two"}, {4, "four"}, {6, "six"}};
    RowFinder const finder(rows);
    EXPECT_EQ(finder.find(2), &rows[0]);
    EXPECT_EQ(finder.find(4), &rows[1]);
    EXPECT_EQ(finder.find(2), &rows[0]);
    EXPECT_EQ(finder.find(6), &rows[2]);
    EXPECT_EQ(finder.find(6), &rows[2]);
    EXPECT_EQ(finder.find(3), nullptr);
    EXPECT_EQ(finder.find(7), nullptr);
    EXPECT_EQ(finder.find(0), nullptr);
}

/// Rows of these numbers, whose text tells which generation they are of.
std::shared_ptr<std::vector<Row> const> generation(std::vector<std::uint32_t> const& numbers,
                                                   std::string const& text) {
    std::vector<Row> rows;
    for (std::uint32_t const number : numbers)
        rows.push_back({number, text});
    return std::make_shared<std::vector<Row> const>(std::move(rows));
}

std::vector<Row const*> placesOf(std::vector<Row> const& rows) {
    std::vector<Row const*> places;
    for (Row const& row : rows)
        places.push_back(&row);
    return places;
}

void exchange(Rows<Row>& rows, std::vector<std::uint32_t> const& gone,
              std::vector<std::uint32_t> const& come, std::string const& text) {
    auto const former = generation(gone, "");
    auto const now = generation(come, text);
    std::vector<std::shared_ptr<void const>> const owners{now};
    rows.exchange(placesOf(*former), placesOf(*now), owners);
}

TEST(RowsTest, ExchangePutsRowsWhereTheirIndicesBelong) {
    Rows<Row> rows{{2, "old"}, {4, "old"}, {6, "old"}};
    exchange(rows, {4, 6}, {1, 5, 6, 9}, "new");
    EXPECT_EQ(rows, (Rows<Row>{{1, "new"}, {2, "old"}, {5, "new"}, {6, "new"}, {9, "new"}}));
}

TEST(RowsTest, ExchangeLeavesCopiesAsTheyAre) {
    Rows<Row> rows{{2, "old"}, {4, "old"}};
    Rows<Row> const copy = rows;
    exchange(rows, {2, 4}, {}, "");
    EXPECT_TRUE(rows.empty());
    EXPECT_EQ(copy, (Rows<Row>{{2, "old"}, {4, "old"}}));
    EXPECT_FALSE(copy.shares(rows));
}

TEST(RowsTest, ExchangedRowsStayInMemoryAsLongAsASequenceHasThem) {
    Rows<Row> rows;
    exchange(rows, {}, {1, 2}, std::string(100, 'a'));
    Rows<Row> const copy = rows;
    for (int time = 0; time < 3; ++time)
        exchange(rows, {1}, {1}, std::string(100, 'b'));
    EXPECT_EQ(copy[0].text, std::string(100, 'a'));
    EXPECT_EQ(rows[0].text, std::string(100, 'b'));
    EXPECT_EQ(rows[1].text, std::string(100, 'a'));
}

TEST(RowsTest, AnyExchangeIsThatOfASet) {
    std::mt19937 random(20261122);
    Rows<Row> rows;
    std::map<std::uint32_t, std::string> model;
    for (int step = 0; step < 500; ++step) {
        std::vector<std::uint32_t> gone;
        std::vector<std::uint32_t> come;
        std::string const text = std::to_string(step);
        for (std::uint32_t number = 1; number <= 40; ++number) {
            bool const goes = model.contains(number) && random() % 4 == 0;
            bool const comes = (goes || !model.contains(number)) && random() % 4 == 0;
            if (goes) gone.push_back(number);
            if (comes) come.push_back(number);
            if (goes) model.erase(number);
            if (comes) model[number] = text;
        }
        exchange(rows, gone, come, text);
        Rows<Row> expected;
        for (auto const& [number, of] : model)
            expected.push_back({number, of});
        ASSERT_EQ(rows, expected) << "step " << step;
    }
}

} // namespace
} // namespace kvloamd
