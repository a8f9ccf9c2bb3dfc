// SPDX-License-Identifier: BSD-2-Clause
// What the agent counts about itself.
#pragma once

#include <algorithm>
#include <atomic>
#include <cstdint>

#include "agent/rows/Clock.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

/// The connection to the AgentX master.
enum class Master {
    None,      ///< stand-alone
    Connected, ///< numbered as kvlMasterState
    Lost
};

/// A `Counters` is what the agent counts about itself. Thread-safe.
struct Counters {
    Clock::time_point started = Clock::now(); ///< the agent's start; not changed once it serves
    std::atomic<std::uint32_t> requests{0};
    std::atomic<std::uint32_t> statusChanges{0};
    std::atomic<std::uint32_t> notificationsDropped{0};
    std::atomic<std::uint32_t> notificationsSent{0};
    std::atomic<std::uint32_t> notificationsUnacknowledged{0};
    std::atomic<std::uint32_t> notificationsWaiting{0};
    std::atomic<std::uint32_t> events{0}; ///< the sequence number given last
    std::atomic<Master> master{Master::None};
    std::atomic<std::uint32_t> masterLosses{0};
    /// What sysUpTime is ahead of the agent's own time since its start, in hundredths of a second.
    std::atomic<std::int64_t> sysUpTimeLead{0};

    /// sysUpTime is `ticks` at `when`. It belongs to the SNMP library or to the master.
    void setSysUpTime(std::uint32_t ticks, Clock::time_point when) {
        std::int64_t const lead = std::int64_t{ticks} - Uptime(started).at(when);
        // A few hundredths are the way that the answer took: times must not swing by them.
        if (std::int64_t const swing = lead - sysUpTimeLead; swing > kSwing || swing < -kSwing)
            sysUpTimeLead = lead;
    }
    /// A time since the agent's start as sysUpTime was then; 0 for a time before sysUpTime's start.
    std::uint32_t sysUpTime(std::uint32_t ticks) const {
        if (ticks == 0) return 0;
        return static_cast<std::uint32_t>(std::max(ticks + sysUpTimeLead, std::int64_t{0}));
    }

    /// The same, but 0 is the agent's start, which is later than sysUpTime's beside a master that
    /// ran before.
    std::uint32_t sysUpTimeSince(std::uint32_t ticks) const {
        if (ticks > 0 || master == Master::None) return sysUpTime(ticks);
        return static_cast<std::uint32_t>(std::max(sysUpTimeLead.load(), std::int64_t{0}));
    }

    static constexpr std::int64_t kSwing = 10;
};

} // namespace kvloamd
