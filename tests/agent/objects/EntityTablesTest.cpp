// SPDX-License-Identifier: BSD-2-Clause
// ENTITY-MIB's and ENTITY-STATE-MIB's tables over rows that a test makes.
#include <gmock/gmock.h>

#include "agent/objects/ObjectTree.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

/// A chassis, 1, with a port, 7, which is interface 1000.
class EntityTablesTest : public ::testing::Test {
  protected:
    EntityTablesTest() {
        auto physical = std::make_shared<PhysicalEntities>();
        PhysicalRow chassis;
        chassis.entity = 1;
        PhysicalRow port;
        port.entity = 7;
        port.containedIn = 1;
        port.physicalClass = PhysicalClass::Port;
        port.position = 3;
        port.replaceable = true;
        physical->entities = {chassis, port};
        physical->contains = {{1, 7}};
        physical->aliases = {{7, {1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1000}}};
        m_snapshot.entities.physical = std::move(physical);
        m_snapshot.entities.lastChange = 4711;
        EntityStateRow state;
        state.entity = 7;
        state.state = {AdminState::Unlocked, OperState::Enabled, UsageState::Busy,
                       static_cast<char>(kAlarmMinor), StandbyState::ProvidingService};
        state.changed = "\x07\xd1\x09\x09\x01\x2e\x28\x05+\x01\x02";
        m_snapshot.entities.states = {state};
    }

    /// The value of column `number` of entity 7.
    Value physical(std::uint32_t number) { return at({47, 1, 1, 1, 1, number, 7}); }
    Value state(std::uint32_t number) { return at({131, 1, 1, 1, number, 7}); }
    Value at(Oid const& name) {
        EXPECT_EQ(m_tree.find(m_facts, name, m_found), Lookup::Found);
        return m_found.value;
    }
    SetFault set(std::uint32_t number, Value const& asked) {
        return m_tree.test(m_facts, Oid{47, 1, 1, 1, 1, number, 7}, asked, m_change);
    }
    Lookup find(Oid const& name) { return m_tree.find(m_facts, name, m_found); }

    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Settings m_settings;
    Facts const m_facts{m_snapshot, m_counters, &m_settings};
    Instance m_found;
    std::optional<Change> m_change;
};

TEST_F(EntityTablesTest, PlaceInTheWholeIsServed) {
    EXPECT_EQ(physical(4), Value{std::int64_t{1}});
    EXPECT_EQ(physical(5), Value{std::int64_t{10}});
    EXPECT_EQ(physical(6), Value{std::int64_t{3}});
    EXPECT_EQ(physical(16), Value{std::int64_t{1}});
    EXPECT_EQ(at({47, 1, 1, 1, 1, 6, 1}), Value{std::int64_t{-1}});
    EXPECT_EQ(at({47, 1, 1, 1, 1, 16, 1}), Value{std::int64_t{2}});
}

TEST_F(EntityTablesTest, WhatTheMibHasAWordForWhenItIsNotKnownIsThatWord) {
    static constexpr std::uint32_t kNoType[] = {0, 0};
    EXPECT_EQ(physical(3), Value{NameView{kNoType}});
    EXPECT_EQ(m_found.type, ValueType::ObjectId);
    for (std::uint32_t const number : {7U, 8U, 9U, 10U, 11U, 12U, 13U, 14U, 15U, 18U, 19U})
        EXPECT_EQ(physical(number), Value{std::string_view()}) << number;
    EXPECT_EQ(physical(17), Value{std::string_view("\0\0\0\0\0\0\0\0", 8)});
}

TEST_F(EntityTablesTest, OperatorsMaySetNamesOfTheirOwn) {
    for (auto const& [number, setting] : {std::pair{14U, Setting::EntityAlias},
                                          {15U, Setting::EntityAssetId},
                                          {18U, Setting::EntityUris}}) {
        EXPECT_EQ(set(number, std::string_view("west")), SetFault::None) << number;
        ASSERT_TRUE(m_change);
        EXPECT_EQ(m_change->key, (SettingKey{setting, 7}));
        EXPECT_EQ(m_change->value, SettingValue{"west"});
        m_settings.exchange(m_change->key, m_change->value);
        EXPECT_EQ(octetsOf(physical(number)), "west") << number;
    }
}

TEST_F(EntityTablesTest, NameThatIsTooLongIsOfTheWrongLength) {
    EXPECT_EQ(set(14, std::string(32, 'a')), SetFault::None);
    EXPECT_EQ(set(14, std::string(33, 'a')), SetFault::WrongLength);
    EXPECT_EQ(set(15, std::string(33, 'a')), SetFault::WrongLength);
    EXPECT_EQ(set(18, std::string(255, 'a')), SetFault::None);
    EXPECT_EQ(set(18, std::string(256, 'a')), SetFault::WrongLength);
    EXPECT_EQ(set(14, std::string()), SetFault::None);
}

TEST_F(EntityTablesTest, NameThatIsNoTextIsAWrongValue) {
    EXPECT_EQ(set(14, std::string_view("Zw\xc3\xb6lf")), SetFault::None);
    EXPECT_EQ(set(14, std::string_view("\xff")), SetFault::WrongValue);
    EXPECT_EQ(set(15, std::string_view("\x1b[2J")), SetFault::WrongValue);
    EXPECT_EQ(set(18, std::string_view("urn:zw\xc3\xb6lf")), SetFault::WrongValue);
}

TEST_F(EntityTablesTest, NumberIsNoName) {
    EXPECT_EQ(set(14, std::int64_t{7}), SetFault::WrongType);
    EXPECT_EQ(set(14, {}), SetFault::WrongType);
}

TEST_F(EntityTablesTest, OtherColumnsOfEntitiesAreNotWritable) {
    for (std::uint32_t const number : {2U, 7U, 11U, 19U})
        EXPECT_EQ(set(number, std::string_view("x")), SetFault::NotWritable) << number;
}

TEST_F(EntityTablesTest, IndexIsNoObjectOfItsOwn) {
    EXPECT_EQ(find({47, 1, 1, 1, 1, 1, 7}), Lookup::NoSuchObject);
    EXPECT_EQ(find({47, 1, 3, 2, 1, 1, 7, 0}), Lookup::NoSuchObject);
}

TEST_F(EntityTablesTest, AliasIsTheNameOfTheInterfacesIndex) {
    static constexpr std::uint32_t kInterface[] = {1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1000};
    EXPECT_EQ(at({47, 1, 3, 2, 1, 2, 7, 0}), Value{NameView{kInterface}});
    EXPECT_EQ(find({47, 1, 3, 2, 1, 2, 1, 0}), Lookup::NoSuchInstance);
}

TEST_F(EntityTablesTest, ContainedEntityIsFoundByItsContainer) {
    EXPECT_EQ(at({47, 1, 3, 3, 1, 1, 1, 7}), Value{std::int64_t{7}});
    EXPECT_EQ(find({47, 1, 3, 3, 1, 1, 7, 1}), Lookup::NoSuchInstance);
}

TEST_F(EntityTablesTest, TimeOfTheLastChangeIsThatOfTheRows) {
    EXPECT_EQ(at({47, 1, 4, 1, 0}), Value{std::int64_t{4711}});
    EXPECT_EQ(m_found.type, ValueType::TimeTicks);
}

TEST_F(EntityTablesTest, StatesHaveTheirNumbers) {
    EXPECT_EQ(state(1), Value{std::string_view(m_snapshot.entities.states[0].changed)});
    EXPECT_EQ(state(2), Value{std::int64_t{4}});
    EXPECT_EQ(state(3), Value{std::int64_t{3}});
    EXPECT_EQ(state(4), Value{std::int64_t{4}});
    EXPECT_EQ(state(5), Value{std::string_view("\x08")});
    EXPECT_EQ(state(6), Value{std::int64_t{4}});
    EXPECT_EQ(find({131, 1, 1, 1, 3, 1}), Lookup::NoSuchInstance); // of the chassis
}

} // namespace
} // namespace kvloamd
