// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/EntityReader.h"

#include <algorithm>
#include <map>
#include <set>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "agent/readers/BoardKeys.h"
#include "agent/readers/Courtesy.h"
#include "agent/rows/IndexKey.h"

namespace kvloamd {

namespace {

/// ifIndex in ifTable's entry, which an interface's ifIndex follows.
constexpr std::uint32_t kIfIndex[] = {1, 3, 6, 1, 2, 1, 2, 2, 1, 1};

/// What the chassis and its slots, which belong to no board, are kept under.
BoardKey const kNoBoard{"", true};

/// What ENTITY-MIB allows for a serial number.
constexpr std::size_t kLongestSerialNumber = 32;

/// The library's word for a text that it does not know.
std::string known(std::string const& text) {
    return text == "unknown" ? std::string() : text;
}

std::string firstKnown(std::initializer_list<std::string> texts) {
    for (std::string const& text : texts)
        if (!known(text).empty()) return text;
    return {};
}

/// The processors of one board.
std::span<ProcessorRow const> rowsOf(std::vector<ProcessorRow> const& rows,
                                     std::uint32_t boardIndex) {
    auto const begin = std::ranges::lower_bound(rows, boardIndex, {}, &ProcessorRow::boardIndex);
    auto const end = std::ranges::upper_bound(rows, boardIndex, {}, &ProcessorRow::boardIndex);
    return {begin, end};
}

/// The entities of one snapshot, while they are put together.
class Building {
  public:
    Building(StableIndices& indices, Settings const& settings, Snapshot const& snapshot)
        : m_indices(indices), m_snapshot(snapshot) {
        for (SettingEntry& entry : settings.all(SettingIndex::Entity))
            m_set[entry.key.index].push_back(std::move(entry));
        for (PortRow const& port : snapshot.interfaces.ports)
            m_ports[port.boardIndex].push_back(&port);
    }

    PhysicalEntities build();

  private:
    /// How a slot is taken.
    struct Slot {
        std::uint32_t entity = 0;
        int boards = 0;
    };

    void addChassisAndSlots();
    void addBoard(BoardRow const& board, BoardKey const& boardKey);
    void addProcessor(ProcessorRow const& processor, std::uint32_t entity, std::uint32_t board);
    void addPort(PortRow const& port, std::uint32_t entity, std::uint32_t board, int position);
    void applySettings(PhysicalRow& row) const;
    /// Enters an entity, unless there is no index left for it.
    void add(PhysicalRow row);

    StableIndices& m_indices;
    Snapshot const& m_snapshot;
    std::map<std::uint32_t, std::vector<PortRow const*>> m_ports; ///< by board index
    std::map<std::uint32_t, std::vector<SettingEntry>> m_set;     ///< by entity
    std::map<std::string, Slot> m_slots;
    std::uint32_t m_chassis = 0;
    PhysicalEntities m_built;
};

PhysicalEntities Building::build() {
    addChassisAndSlots();
    std::vector<BoardKey> const boards = boardKeys(m_snapshot.boards);
    for (std::size_t i = 0; i < boards.size(); ++i) {
        addBoard(m_snapshot.boards[i], boards[i]);
        yieldBetweenBoards();
    }
    std::ranges::sort(m_built.entities, {}, &PhysicalRow::entity);
    std::ranges::sort(m_built.contains);
    std::ranges::sort(m_built.aliases, {}, &AliasRow::entity);
    return std::move(m_built);
}

void Building::applySettings(PhysicalRow& row) const {
    auto const entries = m_set.find(row.entity);
    if (entries == m_set.end()) return;
    for (SettingEntry const& entry : entries->second) {
        auto const* const text = entry.value ? std::get_if<std::string>(&*entry.value) : nullptr;
        if (text == nullptr) continue;
        switch (entry.key.setting) {
        case Setting::EntityAlias:
            row.alias = *text;
            break;
        case Setting::EntityAssetId:
            row.assetId = *text;
            break;
        case Setting::EntityUris:
            row.uris = *text;
            break;
        default:
            break;
        }
    }
}

void Building::add(PhysicalRow row) {
    if (row.entity == 0) return;
    applySettings(row);
    if (row.containedIn != 0) m_built.contains.push_back({row.containedIn, row.entity});
    m_built.entities.push_back(std::move(row));
}

void Building::addChassisAndSlots() {
    std::vector<IndexKey> keys{{IndexKind::Chassis, ""}};
    std::vector<int> numbers{-1};
    for (BoardRow const& board : m_snapshot.boards) {
        std::string name = slotName(board);
        if (name.empty()) continue;
        if (++m_slots[name].boards > 1) continue;
        keys.push_back({IndexKind::Slot, std::move(name)});
        numbers.push_back(*board.pciSlotNumber);
    }
    std::vector<std::uint32_t> const indices = m_indices.indicesOf(kNoBoard, keys);
    m_chassis = indices[0];
    PhysicalRow chassis;
    chassis.entity = m_chassis;
    chassis.physicalClass = PhysicalClass::Chassis;
    chassis.description = "chassis";
    add(std::move(chassis));
    for (std::size_t i = 1; i < keys.size(); ++i) {
        PhysicalRow slot;
        slot.entity = m_slots[keys[i].name].entity = indices[i];
        slot.containedIn = m_chassis;
        slot.physicalClass = PhysicalClass::Container;
        slot.position = numbers[i];
        slot.description = "slot";
        slot.name = keys[i].name;
        add(std::move(slot));
    }
}

void Building::addBoard(BoardRow const& board, BoardKey const& boardKey) {
    auto const processors = rowsOf(m_snapshot.records->processors, board.boardIndex);
    std::vector<PortRow const*> const& ports = m_ports[board.boardIndex];
    std::vector<IndexKey> keys{{IndexKind::Board, ""}};
    std::set<std::string> names;
    for (ProcessorRow const& processor : processors) {
        std::string name = processor.name;
        for (int copy = 2; !names.insert(name).second; ++copy)
            name = processor.name + "#" + std::to_string(copy);
        keys.push_back({IndexKind::Processor, std::move(name)});
    }
    for (PortRow const* const port : ports)
        keys.push_back(port->key);
    std::vector<std::uint32_t> const indices = m_indices.indicesOf(boardKey, keys);
    auto index = indices.begin();
    std::uint32_t const entity = *index++;
    if (entity == 0) return;

    PhysicalRow row;
    row.entity = entity;
    row.containedIn = m_chassis;
    row.physicalClass = PhysicalClass::Module;
    if (auto const slot = m_slots.find(slotName(board));
        slot != m_slots.end() && slot->second.entity != 0) {
        row.containedIn = slot->second.entity;
        // A slot holds one board; where several claim it, their positions are not known.
        if (slot->second.boards == 1) row.position = 1;
    }
    row.description = firstKnown({board.functionalDescription, board.model, board.name, "board"});
    row.name = known(board.name);
    row.firmware = known(board.firmwareVersion);
    row.serialNumber = known(board.serialNumber).substr(0, kLongestSerialNumber);
    row.model = known(board.model);
    row.replaceable = true;
    row.boardIndex = board.boardIndex;
    add(std::move(row));

    for (ProcessorRow const& processor : processors)
        addProcessor(processor, *index++, entity);
    int position = 0;
    for (PortRow const* const port : ports)
        addPort(*port, *index++, entity, ++position);
}

void Building::addProcessor(ProcessorRow const& processor, std::uint32_t entity,
                            std::uint32_t board) {
    PhysicalRow row;
    row.entity = entity;
    row.containedIn = board;
    row.physicalClass = PhysicalClass::Cpu;
    row.position = processor.number.value_or(-1);
    row.description = "processor";
    row.name = processor.name;
    row.firmware = processor.bootKernelVersion;
    row.software = processor.realTimeKernelVersion;
    add(std::move(row));
}

void Building::addPort(PortRow const& port, std::uint32_t entity, std::uint32_t board,
                       int position) {
    PhysicalRow row;
    row.entity = entity;
    row.containedIn = board;
    row.physicalClass = PhysicalClass::Port;
    row.position = position;
    row.ifIndex = port.ifIndex;
    auto const& interfaces = m_snapshot.interfaces.interfaces;
    if (auto const interface =
            std::ranges::lower_bound(interfaces, port.ifIndex, {}, &InterfaceRow::ifIndex);
        interface != interfaces.end() && interface->ifIndex == port.ifIndex) {
        row.description = interface->description;
        row.name = interface->name;
    }
    if (row.description.empty()) row.description = "port";
    if (entity != 0) {
        Oid alias(std::begin(kIfIndex), std::end(kIfIndex));
        alias.push_back(port.ifIndex);
        m_built.aliases.push_back({entity, std::move(alias)});
    }
    add(std::move(row));
}

} // namespace

EntityReader::EntityReader(StableIndices& indices, Settings const& settings,
                           Clock::time_point started, EntityStates::Now now)
    : m_indices(indices), m_settings(settings), m_uptime(started), m_states(std::move(now)) {}

EntityRows EntityReader::read(Snapshot const& snapshot) {
    PhysicalEntities found = Building(m_indices, m_settings, snapshot).build();
    m_indices.save();
    if (!m_physical || *m_physical != found) {
        if (m_physical) m_lastChange = m_uptime.now();
        m_physical = std::make_shared<PhysicalEntities const>(std::move(found));
    }
    return {m_physical,
            m_states.read(m_physical->entities, snapshot.boards, snapshot.interfaces,
                          snapshot.faults.rows),
            m_lastChange};
}

} // namespace kvloamd
