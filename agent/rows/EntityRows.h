// SPDX-License-Identifier: BSD-2-Clause
// The physical entities and their states, as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "agent/rows/Oid.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

/// ENTITY-MIB's PhysicalClass, as far as there are such entities.
enum class PhysicalClass : int { Chassis = 3, Container = 5, Module = 9, Port = 10, Cpu = 12 };

/// Texts are empty when they are not known, which is how ENTITY-MIB says so.
struct PhysicalRow {
    std::uint32_t entity = 0;
    std::uint32_t containedIn = 0; ///< 0: in nothing
    PhysicalClass physicalClass = PhysicalClass::Chassis;
    int position = -1; ///< among those of its class in the same container; -1: not known
    std::string description;
    std::string name;
    std::string firmware;
    std::string software;
    std::string serialNumber;
    std::string model;
    bool replaceable = false;
    // What operators have set.
    std::string alias;
    std::string assetId;
    std::string uris;
    // Where its state comes from.
    std::uint32_t boardIndex = 0; ///< of a module
    std::uint32_t ifIndex = 0;    ///< of a port

    std::array<std::uint32_t, 1> index() const { return {entity}; }
    bool operator==(PhysicalRow const&) const = default;
};

/// One entity directly in another.
struct ContainsRow {
    std::uint32_t container = 0;
    std::uint32_t child = 0;

    std::array<std::uint32_t, 2> index() const { return {container, child}; }
    auto operator<=>(ContainsRow const&) const = default;
};

/// A port, and the interface that it is.
struct AliasRow {
    std::uint32_t entity = 0;
    Oid interface; ///< absolute: its ifIndex in ifTable

    std::array<std::uint32_t, 2> index() const { return {entity, 0}; }
    bool operator==(AliasRow const&) const = default;
};

/// What seldom changes. All ascending by index.
struct PhysicalEntities {
    Rows<PhysicalRow> entities;
    Rows<ContainsRow> contains;
    Rows<AliasRow> aliases;

    bool operator==(PhysicalEntities const&) const = default;
};

// ENTITY-STATE-MIB's states, in its numbers.
enum class AdminState : int { Unknown = 1, Locked = 2, ShuttingDown = 3, Unlocked = 4 };
enum class OperState : int { Unknown = 1, Disabled = 2, Enabled = 3, Testing = 4 };
enum class UsageState : int { Unknown = 1, Idle = 2, Active = 3, Busy = 4 };
enum class StandbyState : int {
    Unknown = 1,
    HotStandby = 2,
    ColdStandby = 3,
    ProvidingService = 4
};

/// Alarms are a set, the first bit is the highest; none: nothing is wrong.
enum AlarmBits : unsigned {
    kAlarmUnknown = 0x80, ///< it is not known whether there is an alarm
    kAlarmCritical = 0x20,
    kAlarmMajor = 0x10,
    kAlarmMinor = 0x08,
    kAlarmWarning = 0x04,
    kAlarmIndeterminate = 0x02
};

/// The usage is about other entities that an entity has room for. Those that have a state have no
/// room for another one, which ENTITY-STATE-MIB calls busy. None has a standby role, which is
/// called providing service.
struct EntityState {
    AdminState admin = AdminState::Unknown;
    OperState oper = OperState::Unknown;
    UsageState usage = UsageState::Busy;
    char alarm = static_cast<char>(kAlarmUnknown); ///< of `AlarmBits`
    StandbyState standby = StandbyState::ProvidingService;

    bool operator==(EntityState const&) const = default;
};

struct EntityStateRow {
    std::uint32_t entity = 0;
    EntityState state;
    std::string changed; ///< when, as `dateOctets`

    std::array<std::uint32_t, 1> index() const { return {entity}; }
    bool operator==(EntityStateRow const&) const = default;
};

struct EntityRows {
    std::shared_ptr<PhysicalEntities const> physical =
        std::make_shared<PhysicalEntities>(); ///< set
    Rows<EntityStateRow> states;
    std::uint32_t lastChange = 0; ///< of `physical`: hundredths of a second since the agent's start

    // Which entities there are of rows, in the order of the rows; 0: of none.
    std::vector<std::uint32_t> ofBoards;
    std::vector<std::uint32_t> ofInterfaces; ///< the port, else the board
};

} // namespace kvloamd
