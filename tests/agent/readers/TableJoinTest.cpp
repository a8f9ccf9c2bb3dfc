// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/TableJoin.h"

#include <array>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Row {
    std::uint32_t number = 0;
    int text = 0;

    std::array<std::uint32_t, 1> index() const { return {number}; }
    bool operator==(Row const&) const = default;
};

using Part = std::vector<Row>;

std::shared_ptr<Part const> part(Part rows) {
    return std::make_shared<Part const>(std::move(rows));
}

std::vector<std::uint32_t> numbersOf(std::vector<Row const*> const& rows) {
    std::vector<std::uint32_t> numbers;
    for (Row const* const row : rows)
        numbers.push_back(row->number);
    return numbers;
}

TEST(TableJoinTest, PartsBecomeOneTableWhateverTheirOrder) {
    auto const one = part({{5, 0}, {6, 0}});
    auto const other = part({{1, 0}, {9, 0}});
    Rows<Row> all{{77, 0}};
    TableJoin joining(all, one);
    joining.append(*one);
    joining.append(*other, other);
    joining.end();
    EXPECT_EQ(all, (Rows<Row>{{1, 0}, {5, 0}, {6, 0}, {9, 0}}));
}

TEST(PartExchangesTest, FewAreExchanged) {
    PartExchanges<Part> exchanges;
    exchanges.begin(4, false);
    auto const former = part({});
    auto const now = part({});
    exchanges.add(former, now);
    exchanges.add(now, now);
    EXPECT_FALSE(exchanges.areMany());
    ASSERT_EQ(exchanges.all().size(), 1U);
    EXPECT_EQ(exchanges.all()[0].former, former);
    EXPECT_EQ(exchanges.all()[0].now, now);
}

TEST(PartExchangesTest, TwoOfOneBoardAreOne) {
    PartExchanges<Part> exchanges;
    exchanges.begin(4, false);
    auto const former = part({});
    auto const between = part({});
    exchanges.add(former, between);
    exchanges.add(between, nullptr);
    exchanges.add(nullptr, part({}));
    ASSERT_EQ(exchanges.all().size(), 2U);
    EXPECT_EQ(exchanges.all()[0].former, former);
    EXPECT_EQ(exchanges.all()[0].now, nullptr);
}

TEST(PartExchangesTest, ManyAreNotExchanged) {
    PartExchanges<Part> exchanges;
    exchanges.begin(800, false);
    for (int board = 0; board < 100; ++board)
        exchanges.add(nullptr, part({}));
    EXPECT_FALSE(exchanges.areMany());
    exchanges.add(nullptr, part({}));
    EXPECT_TRUE(exchanges.areMany());
    EXPECT_THAT(exchanges.all(), IsEmpty());
}

TEST(PartExchangesTest, FewInEachOfManyReadingsAreJoinedOnceInAWhile) {
    PartExchanges<Part> exchanges;
    int joined = 0;
    for (int reading = 0; reading < 170; ++reading) {
        exchanges.begin(4, false);
        exchanges.add(nullptr, part({}));
        if (exchanges.areMany()) ++joined;
        exchanges.end();
    }
    EXPECT_EQ(joined, 10);
}

TEST(PartExchangesTest, TablesThatAreNewAreNotExchanged) {
    PartExchanges<Part> exchanges;
    exchanges.begin(4, true);
    EXPECT_TRUE(exchanges.areMany());
    exchanges.end();
    exchanges.begin(4, false);
    EXPECT_FALSE(exchanges.areMany());
}

TEST(PartExchangesTest, RowsOfAllBoardsAreExchangedInTheirOrder) {
    std::vector<PartExchange<Part>> const parts{
        {part({{5, 0}, {6, 0}}), part({{5, 1}, {7, 0}})},
        {part({{1, 0}}), nullptr},
        {part({{3, 0}}), part({{3, 0}})}, // remains as it is
        {nullptr, part({{2, 0}})}};
    auto const exchange = exchangeOf<Row>(parts, std::identity());
    EXPECT_THAT(numbersOf(exchange.gone), ElementsAre(1, 5, 6));
    EXPECT_THAT(numbersOf(exchange.come), ElementsAre(2, 5, 7));
    EXPECT_TRUE(exchange.changesIndices());
    Rows<Row> rows{{1, 0}, {3, 0}, {5, 0}, {6, 0}, {8, 0}};
    exchange.apply(rows);
    EXPECT_EQ(rows, (Rows<Row>{{2, 0}, {3, 0}, {5, 1}, {7, 0}, {8, 0}}));
}

TEST(PartExchangesTest, RowsWithTheSameIndicesDoNotChangeIndices) {
    std::vector<PartExchange<Part>> const parts{
        {part({{5, 0}}), part({{5, 1}})}, {part({{6, 0}}), nullptr}, {nullptr, part({{6, 0}})}};
    EXPECT_FALSE(exchangeOf<Row>(parts, std::identity()).changesIndices());
}

} // namespace
} // namespace kvloamd
