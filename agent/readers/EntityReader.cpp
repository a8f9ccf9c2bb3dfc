// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/EntityReader.h"

#include <algorithm>
#include <iterator>
#include <set>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "agent/readers/BoardKeys.h"
#include "agent/readers/Courtesy.h"
#include "agent/readers/TableJoin.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/RowFinder.h"

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

PhysicalRow processorEntity(ProcessorRow const& processor, std::uint32_t entity,
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
    return row;
}

/// `interface`: null for a port without an interface.
PhysicalRow portEntity(PortRow const& port, InterfaceRow const* interface, std::uint32_t entity,
                       std::uint32_t board, int position) {
    PhysicalRow row;
    row.entity = entity;
    row.containedIn = board;
    row.physicalClass = PhysicalClass::Port;
    row.position = position;
    row.ifIndex = port.ifIndex;
    if (interface != nullptr) {
        row.description = interface->description;
        row.name = interface->name;
    }
    if (row.description.empty()) row.description = "port";
    return row;
}

AliasRow aliasOf(std::uint32_t entity, std::uint32_t ifIndex) {
    Oid alias(std::begin(kIfIndex), std::end(kIfIndex));
    alias.push_back(ifIndex);
    return {entity, std::move(alias)};
}

} // namespace

EntityReader::EntityReader(StableIndices& indices, Settings const& settings,
                           Clock::time_point started, EntityStates::Now now)
    : m_indices(indices), m_settings(settings), m_uptime(started), m_states(std::move(now)) {}

EntityRows EntityReader::read(Snapshot const& snapshot) {
    if (isAsBefore(snapshot)) {
        m_indices.presentAgain();
    } else {
        // If this reading throws, the next one finds what it has left undone.
        bool const anew = std::exchange(m_anew, true);
        m_exchanges.begin(snapshot.boards.size(), anew);
        if (build(snapshot, anew)) {
            if (m_physical) m_lastChange = m_uptime.now();
            join();
        }
        m_anew = false;
    }
    m_indices.save();
    return {m_physical,
            m_states.read(m_physical->entities, snapshot.boards, snapshot.interfaces,
                          snapshot.faults.rows),
            m_lastChange,
            {},
            {}};
}

bool EntityReader::isAsBefore(Snapshot const& snapshot) const {
    return !m_anew && m_known && m_indices.areKnown() && snapshot.boards.shares(m_boardRows) &&
           snapshot.interfaces.ports.shares(m_portRows) &&
           snapshot.interfaces.interfaces.shares(m_interfaceRows) &&
           snapshot.records == m_records && m_settings.all(SettingIndex::Entity) == m_set;
}

bool EntityReader::build(Snapshot const& snapshot, bool anew) {
    std::vector<SettingEntry> set = m_settings.all(SettingIndex::Entity);
    // While indices are waited for, they have to be asked for every time.
    anew = anew || set != m_set || !m_indices.areKnown() || !m_known;
    m_known = m_indices.areKnown();
    m_set = std::move(set);
    m_setOf.clear();
    for (SettingEntry const& entry : m_set)
        m_setOf[entry.key.index].push_back(entry);
    m_ports.clear();
    for (PortRow const& port : snapshot.interfaces.ports)
        m_ports.emplace_back(port.boardIndex, m_ports.size());
    if (!std::ranges::is_sorted(m_ports)) std::ranges::sort(m_ports);

    std::vector<BoardKey> const& keys = m_keys.of(snapshot.boards);
    bool changed = false;
    bool const slotsStand = !anew && m_keys.areAsBefore();
    if (!slotsStand) {
        std::shared_ptr<Part const> const former = m_places;
        findSlots(snapshot.boards);
        changed = former == nullptr || *former != *m_places;
        m_exchanges.add(former, m_places);
    } else {
        m_indices.presentAgain();
    }
    RowFinder const interfaces(snapshot.interfaces.interfaces);
    auto port = m_ports.cbegin();
    Origin origin; // one for all, because its vectors have room
    auto const drop = [&](KnownBoard const& known) {
        changed = changed || known.part != nullptr;
        m_exchanges.add(known.part, nullptr);
    };
    m_boards.begin();
    for (std::size_t i = 0; i < keys.size(); ++i) {
        BoardRow const& board = snapshot.boards[i];
        KnownBoard& known = m_boards.at(board.boardIndex, drop);
        origin.key = keys[i];
        origin.board = &board;
        origin.ports.clear();
        origin.interfaces.clear();
        auto const processors = rowsOf(snapshot.records->processors, board.boardIndex);
        origin.processors.assign(processors.begin(), processors.end());
        for (; port != m_ports.cend() && port->first <= board.boardIndex; ++port) {
            if (port->first != board.boardIndex) continue;
            PortRow const& row = snapshot.interfaces.ports[port->second];
            origin.ports.push_back(&row);
            origin.interfaces.push_back(interfaces.find(row.ifIndex));
        }
        if (slotsStand && known.origin.board == &board) {
            origin.container = known.origin.container;
            origin.isAloneThere = known.origin.isAloneThere;
        } else {
            findPlace(origin);
        }
        if (anew || known.part == nullptr || known.origin != origin) {
            Part part = boardPart(origin);
            if (known.part == nullptr || *known.part != part) {
                auto const now = std::make_shared<Part const>(std::move(part));
                m_exchanges.add(std::exchange(known.part, now), now);
                changed = true;
            }
            std::swap(known.origin, origin);
        } else if (!m_keys.areAsBefore()) {
            m_indices.indicesOf(keys[i], {});
        }
        yieldBetweenBoards();
    }
    m_boards.end(drop);
    m_boardRows = snapshot.boards;
    m_portRows = snapshot.interfaces.ports;
    m_interfaceRows = snapshot.interfaces.interfaces;
    m_records = snapshot.records;
    return changed || m_physical == nullptr;
}

void EntityReader::findSlots(Rows<BoardRow> const& boards) {
    m_slots.clear();
    std::vector<IndexKey> keys{{IndexKind::Chassis, ""}};
    std::vector<int> numbers{-1};
    for (BoardRow const& board : boards) {
        std::string name = slotName(board);
        if (name.empty()) continue;
        if (++m_slots[name].boards > 1) continue;
        keys.push_back({IndexKind::Slot, std::move(name)});
        numbers.push_back(*board.pciSlotNumber);
    }
    std::vector<std::uint32_t> const indices = m_indices.indicesOf(kNoBoard, keys);
    m_chassis = indices[0];
    Part places;
    PhysicalRow chassis;
    chassis.entity = m_chassis;
    chassis.physicalClass = PhysicalClass::Chassis;
    chassis.description = "chassis";
    add(places, std::move(chassis));
    for (std::size_t i = 1; i < keys.size(); ++i) {
        PhysicalRow slot;
        slot.entity = m_slots[keys[i].name].entity = indices[i];
        slot.containedIn = m_chassis;
        slot.physicalClass = PhysicalClass::Container;
        slot.position = numbers[i];
        slot.description = "slot";
        slot.name = keys[i].name;
        add(places, std::move(slot));
    }
    sort(places);
    m_places = std::make_shared<Part const>(std::move(places));
}

/// Says what contains the board.
void EntityReader::findPlace(Origin& origin) const {
    auto const slot = m_slots.find(slotName(*origin.board));
    bool const isInSlot = slot != m_slots.end() && slot->second.entity != 0;
    origin.container = isInSlot ? slot->second.entity : m_chassis;
    origin.isAloneThere = isInSlot && slot->second.boards == 1;
}

EntityReader::Part EntityReader::boardPart(Origin const& origin) {
    BoardRow const& board = *origin.board;
    std::vector<IndexKey> keys{{IndexKind::Board, ""}};
    std::set<std::string> names;
    for (ProcessorRow const& processor : origin.processors) {
        std::string name = processor.name;
        for (int copy = 2; !names.insert(name).second; ++copy)
            name = processor.name + "#" + std::to_string(copy);
        keys.push_back({IndexKind::Processor, std::move(name)});
    }
    for (PortRow const* const port : origin.ports)
        keys.push_back(port->key);
    std::vector<std::uint32_t> const indices = m_indices.indicesOf(origin.key, keys);
    auto index = indices.begin();
    std::uint32_t const boardEntity = *index++;
    Part part;
    if (boardEntity == 0) return part;

    PhysicalRow row;
    row.entity = boardEntity;
    row.containedIn = origin.container;
    row.physicalClass = PhysicalClass::Module;
    // A slot holds one board; where several claim it, their positions are not known.
    if (origin.isAloneThere) row.position = 1;
    row.description = firstKnown({board.functionalDescription, board.model, board.name, "board"});
    row.name = known(board.name);
    row.firmware = known(board.firmwareVersion);
    row.serialNumber = known(board.serialNumber).substr(0, kLongestSerialNumber);
    row.model = known(board.model);
    row.replaceable = true;
    row.boardIndex = board.boardIndex;
    add(part, std::move(row));

    for (ProcessorRow const& processor : origin.processors)
        add(part, processorEntity(processor, *index++, boardEntity));
    for (std::size_t i = 0; i < origin.ports.size(); ++i) {
        PortRow const& port = *origin.ports[i];
        std::uint32_t const entity = *index++;
        if (entity != 0) part.aliases.push_back(aliasOf(entity, port.ifIndex));
        add(part,
            portEntity(port, origin.interfaces[i], entity, boardEntity, static_cast<int>(i) + 1));
    }
    sort(part);
    return part;
}

void EntityReader::sort(Part& part) {
    std::ranges::sort(part.entities, {}, &PhysicalRow::entity);
    std::ranges::sort(part.contains);
    std::ranges::sort(part.aliases, {}, &AliasRow::entity);
}

/// Enters an entity, unless there is no index left for it.
void EntityReader::add(Part& part, PhysicalRow row) const {
    if (row.entity == 0) return;
    applySettings(row);
    if (row.containedIn != 0) part.contains.push_back({row.containedIn, row.entity});
    part.entities.push_back(std::move(row));
}

void EntityReader::applySettings(PhysicalRow& row) const {
    auto const entries = m_setOf.find(row.entity);
    if (entries == m_setOf.end()) return;
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

void EntityReader::join() {
    auto physical =
        std::make_shared<PhysicalEntities>(m_physical ? *m_physical : PhysicalEntities{});
    if (m_exchanges.areMany()) {
        auto const parts = std::make_shared<std::vector<std::shared_ptr<Part const>>>();
        parts->push_back(m_places);
        for (auto const& [boardIndex, known] : m_boards.all())
            parts->push_back(known.part);
        auto const join = [&](auto& table, auto rowsOf) {
            TableJoin joining(table, parts);
            for (auto const& part : *parts)
                joining.append((*part).*rowsOf);
            joining.end();
        };
        join(physical->entities, &Part::entities);
        join(physical->contains, &Part::contains);
        join(physical->aliases, &Part::aliases);
    } else {
        auto const& parts = m_exchanges.all();
        exchangeOf<PhysicalRow>(parts, &Part::entities).apply(physical->entities);
        exchangeOf<ContainsRow>(parts, &Part::contains).apply(physical->contains);
        exchangeOf<AliasRow>(parts, &Part::aliases).apply(physical->aliases);
    }
    m_exchanges.end();
    m_physical = std::move(physical);
}

} // namespace kvloamd
