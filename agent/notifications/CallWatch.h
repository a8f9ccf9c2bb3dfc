// SPDX-License-Identifier: BSD-2-Clause
// Queues the notifications about calls.
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Rows.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// A `CallWatch` compares the calls of each snapshot with those of the one before and queues an
/// isdnMibCallInformation for each call that was connected, and for each that ended without, if its
/// signalling channel has isdnSignalingInfoTrapEnable enabled. Of failed calls with one peer, only
/// the first is announced until a call with that peer is connected. A channel that has just
/// appeared announces nothing. Of several calls of one channel between two snapshots, only the last
/// is seen. Thread-bound: the collector.
class CallWatch {
  public:
    /// All arguments outlive the watch.
    CallWatch(Settings const& settings, NotificationQueue& queue, Counters& counters)
        : m_settings(settings), m_queue(queue), m_counters(counters) {}

    /// Compares with the bearers of a snapshot that was begun at `begun`, ascending by index.
    void update(Rows<BearerRow> const& bearers, Clock::time_point begun);

  private:
    /// How far a bearer channel's call had come.
    struct Call {
        std::uint32_t ifIndex;
        std::uint32_t setupTime;
        bool connected;
        bool failed;
    };
    /// When more peers have failed, all may be announced once more.
    static constexpr std::size_t kMostPeers = 4096;

    bool isEnabled(BearerRow const& row) const;
    /// Whether a failed call with this peer is the first one.
    bool isFirstFailure(std::string const& peer);

    Settings const& m_settings;
    NotificationQueue& m_queue;
    Counters& m_counters;
    std::vector<Call> m_calls;      ///< of the previous snapshot, ascending by index
    std::set<std::string> m_failed; ///< the peers whose failure was announced
};

} // namespace kvloamd
