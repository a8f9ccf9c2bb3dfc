// SPDX-License-Identifier: BSD-2-Clause
// The standard MIB modules' tables over rows that a test makes.
#include <gmock/gmock.h>

#include "agent/objects/ObjectTree.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

/// Lines 10 with two closed intervals, 20 without history, 30 with a full one, 40 with none closed.
class StandardTablesTest : public ::testing::Test {
  protected:
    StandardTablesTest() {
        for (auto const& [index, records] :
             {std::pair{10U, 3U}, std::pair{20U, 0U}, std::pair{30U, 97U}, std::pair{40U, 1U}}) {
            LineRow line;
            line.ifIndex = index;
            auto const closed = std::make_shared<ClosedIntervals>();
            for (std::uint32_t n = 0; n < records; ++n) {
                LineCounts counts{};
                for (std::size_t i = 0; i < counts.size(); ++i)
                    counts[i] = static_cast<std::int32_t>(index * 10000 + n * 100 + i);
                if (n == 0)
                    line.running = counts;
                else
                    closed->counts.push_back(counts);
                if (n > 0) closed->valid.push_back(n < 96);
            }
            if (records > 0) line.closed = closed;
            m_snapshot.interfaces.lines.push_back(std::move(line));
        }
        countIntervals(m_snapshot.interfaces);
    }

    Lookup find(Oid const& name) { return m_tree.find(m_facts, name, m_found); }
    Oid next(Oid const& name, bool orEqual = false) {
        return m_tree.next(m_facts, name, orEqual, m_found) ? m_found.name : Oid{};
    }
    std::int64_t numberAt(Oid const& name) {
        return find(name) == Lookup::Found ? std::get<std::int64_t>(m_found.value) : -1;
    }

    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Facts const m_facts{m_snapshot, m_counters};
    Instance m_found;
};

TEST_F(StandardTablesTest, EveryTableIsBelowAPlaceThatIsServed) {
    for (Table const* const table : m_tables)
        EXPECT_TRUE(std::ranges::any_of(kStandardPlaces, [&](Place const& place) {
            return startsWith(table->entry(), place.place);
        })) << table->name();
}

TEST_F(StandardTablesTest, ColumnsAscendInEveryTable) {
    for (Table const* const table : m_tables)
        for (std::size_t column = 1; column < table->columnCount(); ++column)
            EXPECT_LT(table->column(column - 1).number, table->column(column).number)
                << table->name();
}

TEST_F(StandardTablesTest, CounterHasItsLow32BitsInTheTableAndAllInTheOther) {
    InterfaceRow row;
    row.ifIndex = 7;
    row.counters[kInOctets] = 0x8000000000000005U;
    m_snapshot.interfaces.interfaces = {row};
    EXPECT_EQ(numberAt({2, 2, 1, 10, 7}), 5);
    ASSERT_EQ(find({31, 1, 1, 1, 6, 7}), Lookup::Found);
    EXPECT_EQ(m_found.type, ValueType::Counter64);
    EXPECT_EQ(static_cast<std::uint64_t>(std::get<std::int64_t>(m_found.value)),
              0x8000000000000005U);
    EXPECT_EQ(find({31, 1, 1, 1, 10, 7}), Lookup::NoSuchInstance); // never told
}

TEST_F(StandardTablesTest, BearerChannelIsADs0WithoutCodes) {
    BearerRow bearer;
    bearer.ifIndex = 7;
    bearer.timeSlot = 31;
    m_snapshot.interfaces.bearers = {bearer};
    EXPECT_EQ(numberAt({10, 81, 1, 1, 1, 7}), 31);
    EXPECT_EQ(numberAt({10, 81, 1, 1, 2, 7}), 2);
    EXPECT_EQ(find({10, 81, 1, 1, 3, 7}), Lookup::Found);
    EXPECT_EQ(m_found.value, Value{std::string_view()});
    EXPECT_EQ(numberAt({10, 81, 1, 1, 7, 7}), 2);
    EXPECT_EQ(numberAt({10, 81, 1, 1, 8, 7}), 0);
}

TEST_F(StandardTablesTest, Ds0IsFoundByLineAndTimeSlot) {
    m_snapshot.interfaces.ds0Channels = {{5, 1, 70}, {5, 31, 71}, {6, 1, 72}};
    EXPECT_EQ(numberAt({10, 81, 3, 1, 1, 5, 31}), 71);
    EXPECT_EQ(next({10, 81, 3, 1, 1, 5, 31}), (Oid{10, 81, 3, 1, 1, 6, 1}));
}

TEST_F(StandardTablesTest, HighSpeedIsRounded) {
    for (auto const& [speed, rounded] :
         {std::pair{64000U, 0}, {1544000U, 2}, {1499999U, 1}, {4294967294U, 4295}}) {
        InterfaceRow row;
        row.ifIndex = 7;
        row.speed = speed;
        m_snapshot.interfaces.interfaces = {row};
        EXPECT_EQ(numberAt({31, 1, 1, 1, 15, 7}), rounded);
    }
}

TEST_F(StandardTablesTest, HighSpeedBeyond32BitsIsWhatTheInterfaceSays) {
    InterfaceRow row;
    row.ifIndex = 7;
    row.speed = kMostSpeed;
    m_snapshot.interfaces.interfaces = {row};
    EXPECT_EQ(find({31, 1, 1, 1, 15, 7}), Lookup::NoSuchInstance);
    row.highSpeed = 100000;
    m_snapshot.interfaces.interfaces = {row};
    EXPECT_EQ(numberAt({31, 1, 1, 1, 15, 7}), 100000);
    EXPECT_EQ(numberAt({2, 2, 1, 5, 7}), 4294967295);
}

TEST_F(StandardTablesTest, AddressThatIsNotThereIsEmpty) {
    InterfaceRow row;
    row.ifIndex = 7;
    m_snapshot.interfaces.interfaces = {row};
    ASSERT_EQ(find({2, 2, 1, 6, 7}), Lookup::Found);
    EXPECT_EQ(octetsOf(m_found.value), "");
}

TEST_F(StandardTablesTest, ReceiveAddressIsInTheIndexWithItsLength) {
    m_snapshot.interfaces.receiveAddresses = {{7, "\x02\xfe", true}, {7, "\xff\xff", false}};
    EXPECT_EQ(numberAt({31, 1, 4, 1, 2, 7, 2, 2, 254}), 1);   // active
    EXPECT_EQ(numberAt({31, 1, 4, 1, 3, 7, 2, 2, 254}), 3);   // nonVolatile
    EXPECT_EQ(numberAt({31, 1, 4, 1, 3, 7, 2, 255, 255}), 2); // volatile
    EXPECT_EQ(find({31, 1, 4, 1, 3, 7, 2, 2}), Lookup::NoSuchInstance);
    EXPECT_EQ(next({31, 1, 4, 1, 2, 7}), (Oid{31, 1, 4, 1, 2, 7, 2, 2, 254}));
    EXPECT_EQ(next({31, 1, 4, 1, 2, 7, 2, 2, 254}), (Oid{31, 1, 4, 1, 2, 7, 2, 255, 255}));
}

TEST_F(StandardTablesTest, EthernetOfUnknownDuplexSaysSo) {
    EthernetRow row;
    row.ifIndex = 7;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(numberAt({10, 7, 2, 1, 19, 7}), 1);
    row.duplexStatus = 3;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(numberAt({10, 7, 2, 1, 19, 7}), 3);
}

TEST_F(StandardTablesTest, SlowEthernetHasNoRateControl) {
    EthernetRow row;
    row.ifIndex = 7;
    row.speed = 1'000'000'000;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(numberAt({10, 7, 2, 1, 20, 7}), 2); // false
    EXPECT_EQ(numberAt({10, 7, 2, 1, 21, 7}), 1); // off
    for (std::optional<std::uint32_t> const speed :
         {std::optional<std::uint32_t>(), std::optional(2'500'000'000U),
          std::optional(kMostSpeed)}) {
        row.speed = speed;
        m_snapshot.interfaces.ethernets = {row};
        EXPECT_EQ(find({10, 7, 2, 1, 20, 7}), Lookup::NoSuchInstance);
        EXPECT_EQ(numberAt({10, 7, 2, 1, 21, 7}), 3); // unknown
    }
}

TEST_F(StandardTablesTest, EthernetStatisticHas32BitsInOneTableAnd64InTheOther) {
    EthernetRow row;
    row.ifIndex = 7;
    row.counters[kInternalMacReceiveErrors] = 0x100000005U;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(numberAt({10, 7, 2, 1, 16, 7}), 5);
    EXPECT_EQ(numberAt({10, 7, 11, 1, 5, 7}), 0x100000005);
    EXPECT_EQ(find({10, 7, 11, 1, 1, 7}), Lookup::NoSuchInstance);
}

TEST_F(StandardTablesTest, FlowControlIsShownWhereItIsKnown) {
    EthernetRow row;
    row.ifIndex = 7;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(find({10, 7, 10, 1, 1, 7}), Lookup::NoSuchInstance);
    row.pauseAdminMode = 4;
    m_snapshot.interfaces.ethernets = {row};
    EXPECT_EQ(numberAt({10, 7, 10, 1, 1, 7}), 4);
    EXPECT_EQ(find({10, 7, 10, 1, 2, 7}), Lookup::NoSuchInstance);
}

TEST_F(StandardTablesTest, WhatBeganWithTheAgentBeganLaterThanAMasterThatRanBefore) {
    InterfaceRow row;
    row.ifIndex = 7;
    row.lastChange = 0;
    m_snapshot.interfaces.interfaces = {row};
    Oid const discontinuity{31, 1, 1, 1, 19, 7};
    auto const times = [&] {
        return std::vector{numberAt(discontinuity), numberAt({31, 1, 6, 0}),
                           numberAt({47, 1, 4, 1, 0}), numberAt({2, 2, 1, 9, 7})};
    };
    m_counters.started = Clock::now();
    m_counters.setSysUpTime(50000, m_counters.started);
    EXPECT_EQ(times(), (std::vector<std::int64_t>{0, 0, 0, 0})); // alone
    m_counters.master = Master::Connected;
    // When the state of an interface began that was there before is not known.
    EXPECT_EQ(times(), (std::vector<std::int64_t>{50000, 50000, 50000, 0}));
    m_snapshot.interfaces.interfaces.edit(0).discontinuity = 200;
    EXPECT_EQ(numberAt(discontinuity), 50200);
    // A master that has been restarted since.
    m_counters.setSysUpTime(100, m_counters.started + std::chrono::seconds(10));
    EXPECT_EQ(numberAt({31, 1, 6, 0}), 0);
}

TEST_F(StandardTablesTest, InterfaceCountIsThatOfTheRows) {
    EXPECT_EQ(numberAt({2, 1, 0}), 0);
    m_snapshot.interfaces.interfaces.resize(3);
    EXPECT_EQ(numberAt({2, 1, 0}), 3);
}

Oid const kErroredSeconds{10, 18, 8, 1, 3};
Oid const kLineCodeViolations{10, 18, 8, 1, 12};
Oid const kValidData{10, 18, 8, 1, 13};

Oid with(Oid column, std::initializer_list<std::uint32_t> index) {
    column.insert(column.end(), index);
    return column;
}

TEST_F(StandardTablesTest, IntervalIsFoundByLineAndNumber) {
    EXPECT_EQ(numberAt(with(kErroredSeconds, {10, 2})), 100200);
    EXPECT_EQ(numberAt(with(kLineCodeViolations, {30, 95})), 309509);
    EXPECT_EQ(numberAt({10, 18, 8, 1, 1, 30, 5}), 30);
    EXPECT_EQ(numberAt({10, 18, 8, 1, 2, 30, 5}), 5);
}

TEST_F(StandardTablesTest, IntervalsThatWereNeverClosedHaveNoInstance) {
    for (auto const& index : std::initializer_list<std::initializer_list<std::uint32_t>>{
             {10, 0}, {10, 3}, {20, 1}, {30, 97}, {40, 1}, {50, 1}, {10}, {10, 1, 1}, {}})
        EXPECT_EQ(find(with(kErroredSeconds, index)), Lookup::NoSuchInstance);
}

TEST_F(StandardTablesTest, NextIntervalIsOfTheSameLineThenOfTheNextWithAny) {
    EXPECT_EQ(next(kErroredSeconds), with(kErroredSeconds, {10, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {10})), with(kErroredSeconds, {10, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {10, 1})), with(kErroredSeconds, {10, 2}));
    EXPECT_EQ(next(with(kErroredSeconds, {10, 1, 9})), with(kErroredSeconds, {10, 2}));
    EXPECT_EQ(next(with(kErroredSeconds, {10, 2})), with(kErroredSeconds, {30, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {11})), with(kErroredSeconds, {30, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {20, 4294967295U})), with(kErroredSeconds, {30, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {30, 95})), with({10, 18, 8, 1, 4}, {10, 1}));
}

TEST_F(StandardTablesTest, NextOrEqualIntervalIsTheIntervalItself) {
    EXPECT_EQ(next(with(kErroredSeconds, {10, 2}), true), with(kErroredSeconds, {10, 2}));
    EXPECT_EQ(next(with(kErroredSeconds, {10, 0}), true), with(kErroredSeconds, {10, 1}));
    EXPECT_EQ(next(with(kErroredSeconds, {10, 3}), true), with(kErroredSeconds, {30, 1}));
}

TEST_F(StandardTablesTest, WalkOfTheIntervalsIsStrictlyIncreasingAndFindsEveryStep) {
    Oid name{10, 18, 8};
    int steps = 0;
    for (Oid after = next(name); startsWith(after, Oid{10, 18, 8}); after = next(name), ++steps) {
        ASSERT_TRUE(compare(name, after) < 0);
        name = after;
        EXPECT_EQ(find(name), Lookup::Found);
    }
    EXPECT_EQ(steps, 13 * (2 + 95) + 3); // the oldest has its index and its validity
}

TEST_F(StandardTablesTest, OldestIntervalOfAFullHistoryHasNoValidData) {
    EXPECT_EQ(numberAt(with(kValidData, {30, 95})), 1);
    EXPECT_EQ(numberAt(with(kValidData, {30, 96})), 2);
    EXPECT_EQ(numberAt({10, 18, 6, 1, 4, 30}), 96); // dsx1ValidIntervals
    EXPECT_EQ(numberAt({10, 18, 6, 1, 14, 30}), 1); // dsx1InvalidIntervals
    EXPECT_EQ(numberAt({10, 18, 6, 1, 14, 10}), 0);
}

TEST_F(StandardTablesTest, IntervalThatMissedDataHasNoCounts) {
    LineRow& line = m_snapshot.interfaces.lines.edit(0);
    auto const closed = std::make_shared<ClosedIntervals>(*line.closed);
    closed->valid[0] = false;
    line.closed = closed;
    EXPECT_EQ(numberAt(with(kValidData, {10, 1})), 2);
    EXPECT_EQ(find(with(kErroredSeconds, {10, 1})), Lookup::NoSuchInstance);
    EXPECT_EQ(next(kErroredSeconds), with(kErroredSeconds, {10, 2}));
    EXPECT_EQ(numberAt({10, 18, 6, 1, 4, 10}), 2);
    EXPECT_EQ(numberAt({10, 18, 6, 1, 14, 10}), 1);
}

TEST_F(StandardTablesTest, LineWithoutHistoryIsInTheTableOfLinesOnly) {
    EXPECT_EQ(numberAt({10, 18, 6, 1, 1, 20}), 20);
    EXPECT_EQ(find({10, 18, 6, 1, 4, 20}), Lookup::NoSuchInstance);
    EXPECT_EQ(find({10, 18, 7, 1, 1, 20}), Lookup::NoSuchInstance);
    EXPECT_EQ(find({10, 18, 9, 1, 2, 20}), Lookup::NoSuchInstance);
}

TEST_F(StandardTablesTest, RunningIntervalIsTheFirstRecord) {
    EXPECT_EQ(numberAt({10, 18, 7, 1, 2, 40}), 400000);
    EXPECT_EQ(numberAt({10, 18, 7, 1, 11, 10}), 100009);
}

TEST_F(StandardTablesTest, CountThatALineDoesNotKnowHasNoInstance) {
    LineRow& line = m_snapshot.interfaces.lines.edit(0);
    auto const closed = std::make_shared<ClosedIntervals>(*line.closed);
    LineCounts newest = closed->counts[0];
    newest[9] = -2;
    closed->counts = {newest, closed->counts[1]};
    line.closed = closed;
    EXPECT_EQ(find(with(kLineCodeViolations, {10, 1})), Lookup::NoSuchInstance);
    EXPECT_EQ(find(with(kErroredSeconds, {10, 1})), Lookup::Found);
    EXPECT_EQ(next(kLineCodeViolations), with(kLineCodeViolations, {10, 2}));
}

Oid const kLineTraps{10, 18, 6, 1, 17};
Oid const kLinkTraps{31, 1, 1, 1, 14};
Oid const kAlias{31, 1, 1, 1, 18};

/// Lines 10, 20, 30 and 40, of which all but 20 know whether they tell; interfaces 10 and 50, the
/// latter stacked.
class StandardSetTest : public StandardTablesTest {
  protected:
    StandardSetTest() {
        m_snapshot.interfaces.lines.editAll([](LineRow& line) {
            if (line.ifIndex != 20) line.statusChangeTrapEnable = 2;
        });
        m_snapshot.interfaces.interfaces.resize(2);
        m_snapshot.interfaces.interfaces.edit(0).ifIndex = 10;
        m_snapshot.interfaces.interfaces.edit(1).ifIndex = 50;
        m_snapshot.interfaces.interfaces.edit(1).linkUpDownTraps = 2;
    }

    SetFault test(Oid const& name, std::optional<std::int64_t> integer) {
        return m_tree.test(m_withSettings, name, integer ? Value{*integer} : Value{}, m_change);
    }
    SetFault testText(Oid const& name, std::string_view text) {
        return m_tree.test(m_withSettings, name, text, m_change);
    }
    std::int64_t setNumberAt(Oid const& name) {
        Instance found;
        return m_tree.find(m_withSettings, name, found) == Lookup::Found
                   ? std::get<std::int64_t>(found.value)
                   : -1;
    }

    Settings m_settings;
    Facts const m_withSettings{m_snapshot, m_counters, &m_settings};
    std::optional<Change> m_change;
};

TEST_F(StandardSetTest, WritableColumnTakesItsValues) {
    EXPECT_EQ(test(with(kLineTraps, {10}), 1), SetFault::None);
    ASSERT_TRUE(m_change);
    EXPECT_EQ(m_change->key, (SettingKey{Setting::LineStatusChangeTraps, 10}));
    EXPECT_EQ(m_change->value, SettingValue{1});
    EXPECT_EQ(test(with(kLinkTraps, {50}), 2), SetFault::None);
    EXPECT_EQ(m_change->key, (SettingKey{Setting::LinkUpDownTraps, 50}));
}

TEST_F(StandardSetTest, TestChangesNothing) {
    test(with(kLineTraps, {10}), 1);
    EXPECT_EQ(setNumberAt(with(kLineTraps, {10})), 2);
}

TEST_F(StandardSetTest, WhatIsSetShowsAtOnceAndInItsRowOnly) {
    m_settings.exchange({Setting::LineStatusChangeTraps, 10}, 1);
    EXPECT_EQ(setNumberAt(with(kLineTraps, {10})), 1);
    EXPECT_EQ(setNumberAt(with(kLineTraps, {30})), 2);
    EXPECT_EQ(setNumberAt(with(kLinkTraps, {10})), 1);
}

TEST_F(StandardSetTest, ValueThatIsNoIntegerIsOfTheWrongType) {
    EXPECT_EQ(test(with(kLineTraps, {10}), std::nullopt), SetFault::WrongType);
}

TEST_F(StandardSetTest, AliasTakesTextsOfUpTo64Characters) {
    for (std::string const& text :
         {std::string(), std::string("to Berlin"), std::string(64, 'x')}) {
        EXPECT_EQ(testText(with(kAlias, {10}), text), SetFault::None) << text;
        ASSERT_TRUE(m_change);
        EXPECT_EQ(m_change->key, (SettingKey{Setting::InterfaceAlias, 10}));
        EXPECT_EQ(m_change->value, SettingValue(text));
    }
    std::string const long65(65, 'x');
    EXPECT_EQ(testText(with(kAlias, {10}), long65), SetFault::WrongLength);
    EXPECT_EQ(testText(with(kAlias, {10}), "a\nb"), SetFault::WrongValue);
    EXPECT_EQ(testText(with(kAlias, {10}), "caf\xc3\xa9"), SetFault::WrongValue);
    EXPECT_EQ(test(with(kAlias, {10}), 1), SetFault::WrongType);
    EXPECT_EQ(testText(with(kAlias, {11}), "x"), SetFault::NoCreation);
}

TEST_F(StandardSetTest, AliasIsEmptyUntilItIsSet) {
    Instance found;
    ASSERT_EQ(m_tree.find(m_withSettings, with(kAlias, {10}), found), Lookup::Found);
    EXPECT_EQ(octetsOf(found.value), "");
    m_settings.exchange({Setting::InterfaceAlias, 10}, "to Berlin");
    ASSERT_EQ(m_tree.find(m_withSettings, with(kAlias, {10}), found), Lookup::Found);
    EXPECT_EQ(octetsOf(found.value), "to Berlin");
}

TEST_F(StandardSetTest, NumbersBesideTheRangeAreWrongValues) {
    for (std::int64_t const number : {0, 3, -1, 2147483647})
        EXPECT_EQ(test(with(kLinkTraps, {10}), number), SetFault::WrongValue) << number;
}

TEST_F(StandardSetTest, RowThatIsNotThereIsNotMade) {
    for (auto const& index : std::initializer_list<std::initializer_list<std::uint32_t>>{
             {11}, {}, {10, 0}, {4294967295U}})
        EXPECT_EQ(test(with(kLineTraps, index), 1), SetFault::NoCreation);
}

TEST_F(StandardSetTest, LineThatDoesNotKnowWhetherItTellsHasNothingToSet) {
    EXPECT_EQ(test(with(kLineTraps, {20}), 1), SetFault::NoCreation);
    m_settings.exchange({Setting::LineStatusChangeTraps, 20}, 1);
    EXPECT_EQ(setNumberAt(with(kLineTraps, {20})), -1);
}

TEST_F(StandardSetTest, WhatIsWrongWithTheObjectIsToldBeforeWhatIsWrongWithTheValue) {
    EXPECT_EQ(test(with(kLineTraps, {11}), std::nullopt), SetFault::WrongType);
    EXPECT_EQ(test(with(kLineTraps, {11}), 7), SetFault::WrongValue);
    EXPECT_EQ(test({10, 18, 6, 1, 10, 11}, std::nullopt), SetFault::NotWritable);
}

TEST_F(StandardSetTest, OtherObjectsAndUnknownOnesAreNotWritable) {
    for (Oid const& name : {Oid{10, 18, 6, 1, 10, 10}, Oid{10, 18, 8, 1, 3, 10, 1}, Oid{2, 1, 0},
                            Oid{10, 18, 6, 1, 99, 10}, Oid{10, 18, 6}, Oid{}, Oid{99}})
        EXPECT_EQ(test(name, 1), SetFault::NotWritable);
}

} // namespace
} // namespace kvloamd
