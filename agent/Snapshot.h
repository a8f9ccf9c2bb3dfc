// SPDX-License-Identifier: BSD-2-Clause
// What the agent answers from: all rows as they were at one time, and its own running counts.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <vector>

#include "agent/BoardRow.h"
#include "agent/EntityRows.h"
#include "agent/FaultRow.h"
#include "agent/InterfaceRows.h"
#include "agent/PlatformReader.h"
#include "agent/ProcessRow.h"
#include "agent/ResourceRows.h"
#include "agent/ServiceRows.h"
#include "agent/Settings.h"

namespace kvloamd {

using Clock = std::chrono::steady_clock;

/// Never changed once it is published; shared by whoever answers from it.
struct Snapshot {
    std::vector<BoardRow> boards; ///< ascending by index, as all rows
    std::vector<ModuleRow> modules;
    std::vector<ServiceRow> services;
    PlatformService platformService;
    std::vector<ProcessRow> processes;
    std::vector<ResourceRow> resources;
    Faults faults;
    std::shared_ptr<PlatformRecords const> records = std::make_shared<PlatformRecords>(); ///< set
    InterfaceRows interfaces;
    EntityRows entities;
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

/// The connection to the master of the host's agents.
enum class Master {
    None,      ///< stand-alone
    Connected, ///< numbered as kvlMasterState
    Lost
};

/// Written by any thread, read by any thread.
struct Counters {
    Clock::time_point started = Clock::now(); ///< the agent's start; not changed once it serves
    std::atomic<std::uint32_t> requests{0};
    std::atomic<std::uint32_t> statusChanges{0};
    std::atomic<std::uint32_t> notificationsDropped{0};
    std::atomic<std::uint32_t> notificationsSent{0};
    std::atomic<std::uint32_t> notificationsWaiting{0};
    std::atomic<Master> master{Master::None};
    std::atomic<std::uint32_t> masterLosses{0};
};

/// What one request is answered from.
struct Facts {
    Snapshot const& snapshot;
    Counters const& counters;
    Settings const* settings = nullptr; ///< come before what the snapshot says; null: none
};

} // namespace kvloamd
