// SPDX-License-Identifier: BSD-2-Clause
// What the agent answers from: all rows as they were at one time, and its own running counts.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <vector>

#include "agent/rows/AlarmRows.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/Clock.h"
#include "agent/rows/Counters.h"
#include "agent/rows/EntityRows.h"
#include "agent/rows/FaultRow.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/NotificationLogRows.h"
#include "agent/rows/Persistence.h"
#include "agent/rows/PlatformRecords.h"
#include "agent/rows/ProcessRow.h"
#include "agent/rows/ResourceRow.h"
#include "agent/rows/Rows.h"
#include "agent/rows/ServiceRows.h"
#include "agent/rows/Settings.h"
#include "agent/rows/ThresholdRow.h"

namespace kvloamd {

/// A `Snapshot` has all rows as they were at one time. Immutable once it is published; requests
/// share it.
struct Snapshot {
    Rows<BoardRow> boards; ///< ascending by index, as all rows
    std::vector<ModuleRow> modules;
    std::vector<ServiceRow> services;
    PlatformService platformService;
    std::vector<ProcessRow> processes;
    Rows<ResourceRow> resources;
    Faults faults;
    std::shared_ptr<AlarmRows const> alarms = std::make_shared<AlarmRows>(); ///< set
    std::shared_ptr<NotificationLogRows const> notifications =
        std::make_shared<NotificationLogRows>();                                          ///< set
    std::shared_ptr<PlatformRecords const> records = std::make_shared<PlatformRecords>(); ///< set
    InterfaceRows interfaces;
    std::vector<ThresholdRow> thresholds; ///< of the lines that keep a history
    EntityRows entities;
    std::uint32_t interfaceConflicts = 0;        ///< of ifIndices with the host's own interfaces
    Persistence persistence = Persistence::Kept; ///< of the indices and settings
    bool platformSilent = false;                 ///< the device mapper does not list its boards
    bool storeUnreadable = false;                ///< the attribute store cannot be read
    Clock::time_point begun;                  ///< when reading began: what happened before is in it
    std::uint32_t number = 1;                 ///< how many have been made, this one included
    std::chrono::milliseconds refreshTime{0}; ///< how long reading took
    std::chrono::milliseconds longestRefreshTime{0}; ///< the longest so far
    std::uint32_t lastChange = 0; ///< of the boards: hundredths of a second since the agent's start
};

/// The rows of one kind among the platform's records.
template <auto Rows>
auto const& recorded(Snapshot const& snapshot) {
    return (*snapshot.records).*Rows;
}

/// What one request is answered from.
struct Facts {
    Snapshot const& snapshot;
    Counters const& counters;
    Settings const* settings = nullptr; ///< come before what the snapshot says; null: none
};

} // namespace kvloamd
