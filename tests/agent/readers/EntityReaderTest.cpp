// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/EntityReader.h"
#include "agent/readers/StateFile.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/PlatformRecords.h"
#include "board/Board.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <set>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class EntityReaderTest : public ::testing::Test {
  protected:
    /// A board in a slot; -1: it does not know its slot. Boards are added in the order of indices.
    BoardRow& addBoard(std::uint32_t index, std::string serialNumber, int slot) {
        BoardRow& row = m_snapshot.boards.emplace_back();
        row.boardIndex = index;
        row.serialNumber = std::move(serialNumber);
        row.name = "NX5-T1";
        row.model = "NX5";
        row.functionalDescription = "trunk board";
        row.firmwareVersion = "4.2";
        if (slot >= 0) {
            row.busNumber = 2;
            row.pciSlotNumber = slot;
        }
        return row;
    }
    void addProcessor(std::uint32_t board, std::string name, std::optional<int> number) {
        auto records = std::make_shared<PlatformRecords>(*m_snapshot.records);
        ProcessorRow row;
        row.boardIndex = board;
        row.auid = static_cast<std::uint32_t>(records->processors.size()) + 1;
        row.name = std::move(name);
        row.number = number;
        row.bootKernelVersion = "1.08";
        row.realTimeKernelVersion = "3.51";
        records->processors.push_back(std::move(row));
        m_snapshot.records = std::move(records);
    }
    void addPort(std::uint32_t board, std::uint32_t ifIndex, IndexKey key) {
        InterfaceRow row;
        row.ifIndex = ifIndex;
        row.name = key.kind == IndexKind::Line ? key.name : "";
        row.description = "port " + key.name;
        m_snapshot.interfaces.interfaces.push_back(std::move(row));
        m_snapshot.interfaces.ports.push_back({ifIndex, board, std::move(key)});
    }
    /// Two boards: one in slot 4 with two processors, two lines and an Ethernet, one in slot 6.
    void addBoards() {
        addBoard(1, "A", 4);
        addProcessor(1, "control", 0);
        addProcessor(1, "signal", 1);
        addPort(1, 1000, {IndexKind::Line, "one"});
        addPort(1, 1001, {IndexKind::Line, "two"});
        addPort(1, 1005, {IndexKind::Ethernet, "1"});
        addBoard(2, "B", 6);
        addPort(2, 1016, {IndexKind::Line, "one"});
    }
    EntityRows read() { return m_reader.read(m_snapshot); }
    Rows<PhysicalRow> readEntities() { return read().physical->entities; }
    /// What is in `rows`; the first of those that are called so or described so.
    static PhysicalRow find(Rows<PhysicalRow> const& rows, std::string const& name) {
        for (PhysicalRow const& row : rows)
            if (row.name == name || row.description == name) return row;
        ADD_FAILURE() << "no entity " << name;
        return {};
    }

    Snapshot m_snapshot;
    StableIndices m_indices{1};
    // Long ago, so that changes get a time other than 0.
    Settings m_settings;
    EntityReader m_reader{m_indices, m_settings, Clock::now() - 1h, [] { return 1'000'000'000L; }};
};

TEST_F(EntityReaderTest, ChassisIsThereWithoutAnyBoard) {
    auto const rows = read();
    ASSERT_THAT(rows.physical->entities, SizeIs(1));
    PhysicalRow const& chassis = rows.physical->entities[0];
    EXPECT_EQ(chassis.entity, 1U);
    EXPECT_EQ(chassis.physicalClass, PhysicalClass::Chassis);
    EXPECT_EQ(chassis.containedIn, 0U);
    EXPECT_EQ(chassis.position, -1);
    EXPECT_FALSE(chassis.replaceable);
    EXPECT_THAT(rows.physical->contains, IsEmpty());
    EXPECT_THAT(rows.states, IsEmpty());
}

TEST_F(EntityReaderTest, BoardIsInItsSlotAndTheSlotInTheChassis) {
    addBoards();
    auto const rows = readEntities();
    PhysicalRow const slot = find(rows, "bus 2 slot 4");
    EXPECT_EQ(slot.physicalClass, PhysicalClass::Container);
    EXPECT_EQ(slot.containedIn, 1U);
    EXPECT_EQ(slot.position, 4);
    PhysicalRow const board = find(rows, "NX5-T1");
    EXPECT_EQ(board.physicalClass, PhysicalClass::Module);
    EXPECT_EQ(board.containedIn, slot.entity);
    EXPECT_EQ(board.position, 1);
}

TEST_F(EntityReaderTest, BoardThatDoesNotKnowItsSlotIsInTheChassis) {
    addBoard(1, "A", -1);
    auto const rows = readEntities();
    ASSERT_THAT(rows, SizeIs(2));
    EXPECT_EQ(rows[1].containedIn, rows[0].entity);
    EXPECT_EQ(rows[1].position, -1);
}

TEST_F(EntityReaderTest, SlotsOfOneNumberOnSeveralBusesAreSeveral) {
    addBoard(1, "A", 4);
    addBoard(2, "B", 4).busNumber = 3;
    addBoard(3, "C", 4).shelfId = 1;
    auto const rows = readEntities();
    std::set<std::uint32_t> slots;
    for (char const* const name : {"bus 2 slot 4", "bus 3 slot 4", "shelf 1 bus 2 slot 4"})
        slots.insert(find(rows, name).entity);
    EXPECT_THAT(slots, SizeIs(3));
}

TEST_F(EntityReaderTest, PlaceInASlotThatTwoBoardsClaimIsNotKnown) {
    addBoard(1, "A", 4);
    addBoard(2, "B", 4);
    auto const rows = readEntities();
    ASSERT_THAT(rows, SizeIs(4));
    for (PhysicalRow const& row : rows) {
        if (row.physicalClass != PhysicalClass::Module) continue;
        EXPECT_EQ(row.containedIn, find(rows, "bus 2 slot 4").entity);
        EXPECT_EQ(row.position, -1);
    }
}

TEST_F(EntityReaderTest, BoardTellsWhatItIs) {
    addBoard(1, "A", 4);
    PhysicalRow const board = find(readEntities(), "NX5-T1");
    EXPECT_EQ(board.description, "trunk board");
    EXPECT_EQ(board.firmware, "4.2");
    EXPECT_EQ(board.serialNumber, "A");
    EXPECT_EQ(board.model, "NX5");
    EXPECT_TRUE(board.replaceable);
    EXPECT_EQ(board.software, "");
}

TEST_F(EntityReaderTest, WhatABoardDoesNotKnowIsEmpty) {
    BoardRow& row = addBoard(1, "unknown", 4);
    row.functionalDescription = row.firmwareVersion = row.model = "unknown";
    PhysicalRow const board = find(readEntities(), "NX5-T1");
    EXPECT_EQ(board.serialNumber, "");
    EXPECT_EQ(board.firmware, "");
    EXPECT_EQ(board.model, "");
    EXPECT_EQ(board.description, "NX5-T1"); // the best that there is
}

TEST_F(EntityReaderTest, SerialNumberIsCutAt32Characters) {
    addBoard(1, std::string(40, 'S'), 4);
    EXPECT_EQ(find(readEntities(), "NX5-T1").serialNumber, std::string(32, 'S'));
}

TEST_F(EntityReaderTest, ProcessorsAreOfTheirBoardInTheOrderOfTheirNumbers) {
    addBoards();
    auto const rows = readEntities();
    std::uint32_t const board = find(rows, "NX5-T1").entity;
    for (auto const& [name, number] : {std::pair{"control", 0}, std::pair{"signal", 1}}) {
        PhysicalRow const processor = find(rows, name);
        EXPECT_EQ(processor.physicalClass, PhysicalClass::Cpu);
        EXPECT_EQ(processor.containedIn, board);
        EXPECT_EQ(processor.position, number);
        EXPECT_EQ(processor.firmware, "1.08");
        EXPECT_EQ(processor.software, "3.51");
    }
}

TEST_F(EntityReaderTest, ProcessorsOfOneNameAreToldApart) {
    addBoard(1, "A", 4);
    for (int i = 0; i < 3; ++i)
        addProcessor(1, "same", std::nullopt);
    auto const rows = readEntities();
    EXPECT_THAT(rows, SizeIs(6)); // with chassis, slot and board
    EXPECT_EQ(rows.back().position, -1);
}

TEST_F(EntityReaderTest, PortsAreOfTheirBoardOneAfterTheOther) {
    addBoards();
    auto const rows = readEntities();
    std::uint32_t const board = find(rows, "NX5-T1").entity;
    int position = 0;
    for (char const* const description : {"port one", "port two", "port 1"}) {
        PhysicalRow const port = find(rows, description);
        EXPECT_EQ(port.physicalClass, PhysicalClass::Port) << description;
        EXPECT_EQ(port.containedIn, board) << description;
        EXPECT_EQ(port.position, ++position) << description;
    }
    EXPECT_EQ(find(rows, "port 1").name, ""); // an Ethernet has none
    EXPECT_EQ(rows.back().description, "port one");
    EXPECT_EQ(rows.back().position, 1); // of the other board
}

TEST_F(EntityReaderTest, EveryContainerExistsAndLeadsToTheChassis) {
    addBoards();
    addBoard(3, "C", -1);
    auto const rows = readEntities();
    std::map<std::uint32_t, std::uint32_t> container;
    for (PhysicalRow const& row : rows)
        container[row.entity] = row.containedIn;
    EXPECT_EQ(container.size(), rows.size());
    for (PhysicalRow const& row : rows) {
        std::uint32_t at = row.entity;
        for (int steps = 0; at != 1 && steps < 5; ++steps) {
            ASSERT_TRUE(container.contains(at)) << at;
            at = container[at];
        }
        EXPECT_EQ(at, 1U) << row.entity;
    }
}

TEST_F(EntityReaderTest, ContainsTableHasEveryEntityOnceAndInOrder) {
    addBoards();
    auto const physical = read().physical;
    auto const& contains = physical->contains;
    EXPECT_EQ(contains.size() + 1, physical->entities.size());
    EXPECT_TRUE(std::ranges::is_sorted(contains));
    for (PhysicalRow const& row : physical->entities)
        EXPECT_EQ(std::ranges::count(contains, ContainsRow{row.containedIn, row.entity}),
                  row.containedIn == 0 ? 0 : 1);
}

TEST_F(EntityReaderTest, EntitiesAscend) {
    addBoards();
    auto const rows = readEntities();
    EXPECT_TRUE(std::ranges::is_sorted(rows, {}, &PhysicalRow::entity));
}

TEST_F(EntityReaderTest, PortIsMappedToItsInterface) {
    addBoards();
    auto const physical = read().physical;
    ASSERT_THAT(physical->aliases, SizeIs(4));
    EXPECT_EQ(physical->aliases[0].entity, find(physical->entities, "port one").entity);
    EXPECT_EQ(physical->aliases[0].interface, (Oid{1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1000}));
    EXPECT_EQ(physical->aliases[3].interface, (Oid{1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1016}));
}

TEST_F(EntityReaderTest, BoardThatComesBackHasItsIndicesAgain) {
    addBoards();
    auto const before = readEntities();
    Snapshot const all = m_snapshot;
    m_snapshot = {};
    addBoard(2, "B", 6);
    addPort(2, 1016, {IndexKind::Line, "one"});
    EXPECT_THAT(readEntities(), SizeIs(4));
    m_snapshot = all;
    EXPECT_EQ(readEntities(), before);
}

TEST_F(EntityReaderTest, BoardInAnotherSlotKeepsItsIndex) {
    addBoard(1, "A", 4);
    std::uint32_t const entity = find(readEntities(), "NX5-T1").entity;
    m_snapshot = {};
    addBoard(2, "A", 7);
    auto const rows = readEntities();
    EXPECT_EQ(find(rows, "NX5-T1").entity, entity);
    EXPECT_EQ(find(rows, "NX5-T1").containedIn, find(rows, "bus 2 slot 7").entity);
}

TEST_F(EntityReaderTest, EntityThatNoIndexIsLeftForIsLeftOut) {
    StableIndices indices(kLastIndex - 15); // for the chassis and its slots
    EntityReader reader(indices, m_settings, Clock::now(), [] { return 1L; });
    addBoards();
    auto const physical = reader.read(m_snapshot).physical;
    EXPECT_THAT(physical->entities, SizeIs(3));
    EXPECT_THAT(physical->contains, SizeIs(2));
    EXPECT_THAT(physical->aliases, IsEmpty());
}

TEST_F(EntityReaderTest, WhatIsThereAtTheStartIsNoChange) {
    addBoards();
    EXPECT_EQ(read().lastChange, 0U);
    EXPECT_EQ(read().lastChange, 0U);
}

TEST_F(EntityReaderTest, ComingGoingAndChangingAreTimedAndStayingIsNot) {
    addBoards();
    auto const first = read();
    m_snapshot.boards.edit(0).firmwareVersion = "5.0";
    auto const changed = read();
    EXPECT_GE(changed.lastChange, 360000U); // an hour
    EXPECT_NE(changed.physical, first.physical);
    auto const same = read();
    EXPECT_EQ(same.lastChange, changed.lastChange);
    EXPECT_EQ(same.physical, changed.physical); // shared, not copied
}

TEST_F(EntityReaderTest, WhatOperatorsSetIsInTheRowsAndAChange) {
    addBoards();
    std::uint32_t const board = find(readEntities(), "NX5-T1").entity;
    m_settings.exchange({Setting::EntityAlias, board}, "west");
    m_settings.exchange({Setting::EntityAssetId, board}, "4711");
    m_settings.exchange({Setting::EntityUris, 1}, "urn:example:rack");
    auto const rows = read();
    EXPECT_EQ(find(rows.physical->entities, "NX5-T1").alias, "west");
    EXPECT_EQ(find(rows.physical->entities, "NX5-T1").assetId, "4711");
    EXPECT_EQ(rows.physical->entities[0].uris, "urn:example:rack");
    EXPECT_EQ(find(rows.physical->entities, "control").alias, "");
    EXPECT_GE(rows.lastChange, 360000U); // an hour
}

TEST_F(EntityReaderTest, ChangeOfStateIsNoChangeOfEntities) {
    addBoards();
    read();
    m_snapshot.boards.edit(0).status = BoardStatusStopped;
    m_snapshot.interfaces.interfaces.edit(0).operStatus = 2;
    EXPECT_EQ(read().lastChange, 0U);
}

TEST_F(EntityReaderTest, EverythingButChassisAndSlotsHasAState) {
    addBoards();
    auto const rows = read();
    std::vector<std::uint32_t> expected;
    for (PhysicalRow const& row : rows.physical->entities)
        if (row.physicalClass != PhysicalClass::Chassis &&
            row.physicalClass != PhysicalClass::Container)
            expected.push_back(row.entity);
    std::vector<std::uint32_t> found;
    for (EntityStateRow const& row : rows.states)
        found.push_back(row.entity);
    EXPECT_THAT(found, SizeIs(8));
    EXPECT_EQ(found, expected);
}

TEST_F(EntityReaderTest, IndicesAreTheSameAfterARestart) {
    std::string folder = ::testing::TempDir() + "entity-XXXXXX";
    ASSERT_NE(mkdtemp(folder.data()), nullptr);
    auto const readAnew = [&] {
        StateFile file(folder + "/entity.sqlite", "entities");
        StableIndices indices(file, 1);
        file.open();
        return EntityReader(indices, m_settings, Clock::now(), [] { return 1L; })
            .read(m_snapshot)
            .physical->entities;
    };
    addBoards();
    auto const before = readAnew();
    std::swap(m_snapshot.boards.edit(0).serialNumber, m_snapshot.boards.edit(1).serialNumber);
    auto const swapped = readAnew();
    std::swap(m_snapshot.boards.edit(0).serialNumber, m_snapshot.boards.edit(1).serialNumber);
    EXPECT_EQ(readAnew(), before);
    // The serial number tells which is which, not the place.
    EXPECT_EQ(find(swapped, "bus 2 slot 4").entity, find(before, "bus 2 slot 4").entity);
    EXPECT_NE(find(swapped, "control").entity, find(before, "control").entity);
    std::filesystem::remove_all(folder);
}

} // namespace
} // namespace kvloamd
