// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/ObjectTree.h"

#include <algorithm>
#include <future>
#include <iterator>

#include <gtest/gtest.h>

#include "agent/objects/OwnObjects.h"
#include "agent/rows/PlatformRecords.h"
#include "board/Board.h"

namespace kvloamd {
namespace {

/// The whole tree over boards 2, 5 and 2147483647; board 5 knows no numbers.
class ObjectTreeTest : public ::testing::Test {
  protected:
    ObjectTreeTest() {
        for (std::uint32_t const index : {2U, 5U, 2147483647U}) {
            BoardRow row;
            row.boardIndex = index;
            row.status = BoardStatusStarted;
            row.name = "board " + std::to_string(index);
            if (index != 5) row.irq = static_cast<int>(index % 100);
            m_snapshot.boards.push_back(row);
        }
    }

    Lookup find(Oid const& name) { return m_tree.find(m_facts, name, m_found); }
    /// The name after `name`; empty at the end.
    Oid next(Oid const& name, bool orEqual = false) {
        return m_tree.next(m_facts, name, orEqual, m_found) ? m_found.name : Oid{};
    }
    std::string text() { return std::string(std::get<std::string_view>(m_found.value)); }
    std::int64_t number() { return std::get<std::int64_t>(m_found.value); }

    std::vector<Table const*> const m_tables = tables();
    ObjectTree const m_tree{scalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Facts const m_facts{m_snapshot, m_counters};
    Instance m_found;
};

Oid const kName{1, 1, 2, 4, 1, 4};
Oid const kIrq{1, 1, 2, 4, 1, 17};

Oid with(Oid column, std::initializer_list<std::uint32_t> index) {
    column.insert(column.end(), index);
    return column;
}

TEST_F(ObjectTreeTest, CellIsFoundByItsIndex) {
    ASSERT_EQ(find(with(kName, {5})), Lookup::Found);
    EXPECT_EQ(text(), "board 5");
}

TEST_F(ObjectTreeTest, ScalarIsFoundAtZero) {
    ASSERT_EQ(find({1, 1, 2, 1, 0}), Lookup::Found);
    EXPECT_EQ(number(), 3);
}

TEST_F(ObjectTreeTest, ScalarHasNoOtherInstance) {
    EXPECT_EQ(find({1, 1, 2, 1, 1}), Lookup::NoSuchInstance);
    EXPECT_EQ(find({1, 1, 2, 1}), Lookup::NoSuchInstance);
    EXPECT_EQ(find({1, 1, 2, 1, 0, 0}), Lookup::NoSuchInstance);
}

TEST_F(ObjectTreeTest, RowThatIsNotThereIsNoInstance) {
    EXPECT_EQ(find(with(kName, {3})), Lookup::NoSuchInstance);
    EXPECT_EQ(find(with(kName, {2147483648})), Lookup::NoSuchInstance);
}

TEST_F(ObjectTreeTest, IndexOfAnotherLengthIsNoInstance) {
    EXPECT_EQ(find(with(kName, {})), Lookup::NoSuchInstance);
    EXPECT_EQ(find(with(kName, {5, 0})), Lookup::NoSuchInstance);
}

TEST_F(ObjectTreeTest, UnknownNumberIsNoInstance) {
    EXPECT_EQ(find(with(kIrq, {5})), Lookup::NoSuchInstance);
}

TEST_F(ObjectTreeTest, IndexColumnIsNoObject) {
    EXPECT_EQ(find({1, 1, 2, 4, 1, 1, 5}), Lookup::NoSuchObject);
}

TEST_F(ObjectTreeTest, ColumnBeyondTheLastIsNoObject) {
    EXPECT_EQ(find({1, 1, 2, 4, 1, 22, 5}), Lookup::NoSuchObject);
}

TEST_F(ObjectTreeTest, BranchIsNoObject) {
    EXPECT_EQ(find({1, 1}), Lookup::NoSuchObject);
    EXPECT_EQ(find({}), Lookup::NoSuchObject);
}

TEST_F(ObjectTreeTest, NextGoesDownTheColumn) {
    EXPECT_EQ(next(with(kName, {2})), with(kName, {5}));
}

TEST_F(ObjectTreeTest, NextOfARowThatIsNotThereIsTheRowAfterIt) {
    EXPECT_EQ(next(with(kName, {3})), with(kName, {5}));
}

TEST_F(ObjectTreeTest, NextOfALongerIndexIsTheRowAfterIt) {
    EXPECT_EQ(next(with(kName, {5, 0})), with(kName, {2147483647}));
}

TEST_F(ObjectTreeTest, NextOfTheLastRowIsTheNextColumn) {
    EXPECT_EQ(next(with(kName, {2147483647})), with({1, 1, 2, 4, 1, 5}, {2}));
}

TEST_F(ObjectTreeTest, NextPassesOverUnknownNumbers) {
    EXPECT_EQ(next(with(kIrq, {2})), with(kIrq, {2147483647}));
}

TEST_F(ObjectTreeTest, NextOfNothingIsTheFirstScalar) {
    EXPECT_EQ(next({}), (Oid{1, 1, 1, 1, 0}));
}

TEST_F(ObjectTreeTest, NextOfAScalarsPlaceIsItsInstance) {
    EXPECT_EQ(next({1, 1, 2, 1}), (Oid{1, 1, 2, 1, 0}));
}

TEST_F(ObjectTreeTest, NextOfAScalarIsTheOneAfter) {
    EXPECT_EQ(next({1, 1, 2, 1, 0}), (Oid{1, 1, 2, 2, 0}));
}

TEST_F(ObjectTreeTest, InclusiveNextIsTheInstanceItself) {
    EXPECT_EQ(next(with(kName, {5}), true), with(kName, {5}));
    EXPECT_EQ(next({1, 1, 2, 1, 0}, true), (Oid{1, 1, 2, 1, 0}));
}

TEST_F(ObjectTreeTest, NextBeyondEverythingIsNone) {
    EXPECT_EQ(next({1, 2}), Oid{});
    EXPECT_EQ(next({1, 1, 99}), Oid{});
}

TEST_F(ObjectTreeTest, ColumnsWithoutRowsArePassedOver) {
    m_snapshot.boards.clear();
    EXPECT_EQ(next({1, 1, 2, 3, 0}), (Oid{1, 1, 8, 1, 0}));
}

/// The tree over sub-devices 1.7.3, 1.7.9 and 2.1.3.
class NestedTableTest : public ObjectTreeTest {
  protected:
    NestedTableTest() {
        auto records = std::make_shared<PlatformRecords>();
        for (auto const& [board, device, auid] :
             {std::array{1U, 7U, 3U}, std::array{1U, 7U, 9U}, std::array{2U, 1U, 3U}}) {
            SubDeviceRow row;
            row.boardIndex = board;
            row.deviceAuid = device;
            row.auid = auid;
            row.name = "sub-device " + std::to_string(auid);
            records->subDevices.push_back(row);
        }
        m_snapshot.records = records;
    }
};

Oid const kSubDeviceName{1, 1, 5, 2, 1, 2};

TEST_F(NestedTableTest, CellIsFoundByItsWholeIndex) {
    ASSERT_EQ(find(with(kSubDeviceName, {1, 7, 9})), Lookup::Found);
    EXPECT_EQ(text(), "sub-device 9");
}

TEST_F(NestedTableTest, PartOfAnIndexIsNoInstance) {
    EXPECT_EQ(find(with(kSubDeviceName, {1, 7})), Lookup::NoSuchInstance);
    EXPECT_EQ(find(with(kSubDeviceName, {1, 7, 9, 0})), Lookup::NoSuchInstance);
}

TEST_F(NestedTableTest, NextOfPartOfAnIndexIsTheFirstRowThatBeginsWithIt) {
    EXPECT_EQ(next(with(kSubDeviceName, {1})), with(kSubDeviceName, {1, 7, 3}));
    EXPECT_EQ(next(with(kSubDeviceName, {2, 1})), with(kSubDeviceName, {2, 1, 3}));
}

TEST_F(NestedTableTest, NextGoesFromBoardToBoard) {
    EXPECT_EQ(next(with(kSubDeviceName, {1, 7, 3})), with(kSubDeviceName, {1, 7, 9}));
    EXPECT_EQ(next(with(kSubDeviceName, {1, 7, 9})), with(kSubDeviceName, {2, 1, 3}));
}

TEST_F(ObjectTreeTest, WalkIsStrictlyIncreasingAndFindsEveryStep) {
    Oid name;
    int steps = 0;
    for (Oid after = next(name); !after.empty(); after = next(name), ++steps) {
        ASSERT_TRUE(compare(name, after) < 0);
        name = after;
        EXPECT_EQ(find(name), Lookup::Found);
    }
    // All scalars but the platform service's 2 and the master's 2; 8 texts and 2 statuses of 3
    // boards; the IRQ of 2.
    EXPECT_EQ(steps, std::ssize(scalars()) - 5 + 3L * 10 + 2);
}

TEST_F(ObjectTreeTest, NextBeginsWithTheObjectsPlace) {
    ASSERT_FALSE(next(with(kName, {2})).empty());
    EXPECT_TRUE(std::ranges::equal(m_found.object, kName));
    ASSERT_EQ(next({1, 1, 2, 1}), (Oid{1, 1, 2, 1, 0}));
    EXPECT_TRUE(std::ranges::equal(m_found.object, Oid{1, 1, 2, 1}));
}

/// A search looks first where the last one ended, which may be anywhere.
TEST_F(ObjectTreeTest, FormerSearchesDoNotChangeWhatIsFound) {
    struct Expected {
        Oid name;
        Oid next;
        Lookup lookup;
    };
    std::vector<Expected> all;
    auto const expect = [&](Oid const& name) {
        ObjectTree const fresh(scalars(), m_tables);
        Instance found;
        bool const any = fresh.next(m_facts, name, false, found);
        all.push_back({name, any ? found.name : Oid{}, Lookup::Found});
        ObjectTree const another(scalars(), m_tables);
        all.back().lookup = another.find(m_facts, name, found);
    };
    for (Oid const& name : {Oid{}, Oid{0}, Oid{1, 1, 2}, Oid{9}})
        expect(name);
    for (Oid name = next({}); !name.empty(); name = next(name)) {
        expect(name);
        expect(Oid(name.begin(), name.end() - 1));
        expect(with(name, {1}));
    }
    ASSERT_GT(all.size(), 100U);
    for (Expected const& former : all)
        for (Expected const& asked : all) {
            next(former.name);
            ASSERT_EQ(next(asked.name), asked.next)
                << ::testing::PrintToString(asked.name) << " after a search for "
                << ::testing::PrintToString(former.name);
            find(former.name);
            ASSERT_EQ(find(asked.name), asked.lookup)
                << ::testing::PrintToString(asked.name) << " after a search for "
                << ::testing::PrintToString(former.name);
        }
}

using ObjectTreeThreadsTest = ObjectTreeTest;

/// A search on either thread begins where the last search of any thread ended.
TEST_F(ObjectTreeThreadsTest, WalksOnTwoThreadsDoNotDisturbEachOther) {
    auto const walk = [&] {
        std::vector<Oid> names;
        Instance found;
        for (Oid name; m_tree.next(m_facts, name, false, found); name = found.name)
            names.push_back(found.name);
        return names;
    };
    std::vector<Oid> const expected = walk();
    ASSERT_GT(expected.size(), 30U);
    constexpr int kWalks = 50;
    auto const walkOften = [&] {
        int right = 0;
        for (int i = 0; i < kWalks; ++i)
            if (walk() == expected) ++right;
        return right;
    };
    auto other = std::async(std::launch::async, walkOften);
    EXPECT_EQ(walkOften(), kWalks);
    EXPECT_EQ(other.get(), kWalks);
}

TEST_F(ObjectTreeTest, RowsThatVanishBetweenSearchesArePassedOver) {
    ASSERT_EQ(next(with(kName, {2})), with(kName, {5}));
    m_snapshot.boards.resize(1);
    EXPECT_EQ(next(with(kName, {5})), with(Oid{1, 1, 2, 4, 1, 5}, {2}));
    EXPECT_EQ(find(with(kName, {5})), Lookup::NoSuchInstance);
    m_snapshot.boards.clear();
    EXPECT_FALSE(startsWith(next(with(kName, {2})), kName));
}

TEST_F(ObjectTreeTest, StatusWithoutANameIsLeftOut) {
    m_snapshot.boards.edit(0).status = 7;
    EXPECT_EQ(find({1, 1, 2, 4, 1, 2, 2}), Lookup::NoSuchInstance);
    EXPECT_EQ(find({1, 1, 2, 4, 1, 2, 5}), Lookup::Found);
}

TEST_F(ObjectTreeTest, CountersAreReadWhenTheyAreAskedFor) {
    m_counters.notificationsDropped = 4294967295U;
    ASSERT_EQ(find({1, 1, 1, 3, 0}), Lookup::Found);
    EXPECT_EQ(number(), 4294967295);
}

} // namespace
} // namespace kvloamd
