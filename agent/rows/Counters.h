// SPDX-License-Identifier: BSD-2-Clause
// The counts that the agent keeps about itself.
#pragma once

#include <atomic>
#include <cstdint>

#include "agent/rows/Clock.h"

namespace kvloamd {

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

} // namespace kvloamd
