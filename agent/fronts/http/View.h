// SPDX-License-Identifier: BSD-2-Clause
// One snapshot as HTTP answers show it.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "agent/fronts/http/JsonWriter.h"
#include "agent/rows/Counters.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// What the first answer from a snapshot saw. All later answers from the same snapshot see the
/// same, so that one number of a snapshot always stands for one content.
struct Moment {
    std::uint32_t number = 0; ///< of the snapshot
    Settings settings;        ///< a copy: what is set meanwhile appears with the next snapshot
    std::int64_t taken = 0;   ///< when the snapshot was begun: milliseconds since the epoch
    std::int64_t age = 0;     ///< the snapshot's, in milliseconds
    /// The snapshot's: a stale snapshot is shown again with other alarms.
    std::shared_ptr<AlarmRows const> alarms;

    Moment(Snapshot const& snapshot, Settings const& current);
};

/// A `View` is a snapshot, its moment and the agent's counters. It refers to all of them.
/// Immutable.
class View {
  public:
    View(Snapshot const& snapshot, Moment const& moment, Counters const& counters)
        : m_snapshot(snapshot), m_moment(moment), m_counters(counters) {}

    Snapshot const& snapshot() const { return m_snapshot; }
    Counters const& counters() const { return m_counters; }
    Moment const& moment() const { return m_moment; }
    Facts facts() const { return {m_snapshot, m_counters, &m_moment.settings}; }

    /// Null when there is none of this index.
    BoardRow const* board(std::uint32_t boardIndex) const;
    InterfaceRow const* interface(std::uint32_t ifIndex) const;
    /// The time slot that a bearer channel is in; null if none is known.
    Ds0ChannelRow const* timeSlot(std::uint32_t ifIndex) const;
    LineRow const* line(std::uint32_t ifIndex) const;
    AlarmRow const* alarm(std::uint32_t number) const;

    /// How many bearer channels there are, and how many of them are not idle.
    struct Channels {
        std::int64_t all = 0;
        std::int64_t inUse = 0;
    };
    /// Those whose time slots of a line are known.
    Channels channelsOf(std::uint32_t lineIfIndex) const;
    Channels allChannels() const;

  private:
    Snapshot const& m_snapshot;
    Moment const& m_moment;
    Counters const& m_counters;
};

} // namespace kvloamd
