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
#include "agent/InterfaceRows.h"
#include "agent/PlatformReader.h"
#include "agent/ProcessRow.h"
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
    std::shared_ptr<PlatformRecords const> records = std::make_shared<PlatformRecords>(); ///< set
    InterfaceRows interfaces;
    EntityRows entities;
    Clock::time_point begun;      ///< when reading began: what happened before is in it
    std::uint32_t lastChange = 0; ///< of the boards: hundredths of a second since the agent's start
};

/// The rows of one kind among the platform's records.
template <auto Rows>
auto const& recorded(Snapshot const& snapshot) {
    return (*snapshot.records).*Rows;
}

/// Raised by any thread, read by any thread.
struct Counters {
    std::atomic<std::uint32_t> statusChanges{0};
    std::atomic<std::uint32_t> notificationsDropped{0};
};

/// What one request is answered from.
struct Facts {
    Snapshot const& snapshot;
    Counters const& counters;
    Settings const* settings = nullptr; ///< come before what the snapshot says; null: none
};

} // namespace kvloamd
