// SPDX-License-Identifier: BSD-2-Clause
// Raises an alarm when a line has counted as much as its limit.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "agent/alarms/AlarmList.h"
#include "agent/alarms/LineThresholds.h"
#include "agent/alarms/TypeLimits.h"
#include "agent/readers/LineHistories.h"
#include "agent/readers/PlacedLine.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// A `ThresholdWatch` reads the counters of all lines that have limits once a second, on a thread
/// of its own: neither requests nor refreshes have to wait for it, and an alarm is raised at most a
/// second after the line has counted. Without limits the thread sleeps. Thread-safe, apart from
/// `update` and `look`.
class ThresholdWatch {
  public:
    /// `list` and `settings` outlive the watch.
    ThresholdWatch(AlarmList& list, Settings const& settings, TypeLimits const& limits);
    /// Ends the thread, after a look that has begun.
    ~ThresholdWatch();
    ThresholdWatch(ThresholdWatch const&) = delete;
    ThresholdWatch& operator=(ThresholdWatch const&) = delete;

    /// Takes over other limits of the types. They hold from the next `update` on.
    void configure(TypeLimits const& limits);
    /// Takes over the lines of a refresh, and fills their rows in `snapshot`. Thread-bound: the
    /// collector.
    void update(Snapshot& snapshot, std::vector<PlacedLine> const& lines);

    /// Starts the thread. Before this, and in tests, `look` is called by hand.
    void start();
    /// Looks at all lines that have limits.
    void look(Instant now);

  private:
    struct Line {
        std::uint32_t ifIndex = 0;
        PlacedLine placed;
        Condition condition; ///< of no kind yet
        LineLimits limits{};
    };
    /// What was found about a line, and kept while it does not answer.
    struct Known {
        LineThresholds thresholds;
        LineThresholds::Crossed crossed;
    };
    using Lines = std::vector<Line>; ///< ascending by ifIndex

    LineLimits limitsOf(ThresholdRow const& row) const;
    void lookAt(Line const& line, Known& known);
    void run();

    AlarmList& m_list;
    Settings const& m_settings;
    // Of `look`.
    LineHistories m_histories;
    std::map<std::uint32_t, Known> m_known; ///< by ifIndex

    std::mutex m_mutex; ///< guards what follows
    std::condition_variable m_wake;
    TypeLimits m_limits;
    std::shared_ptr<Lines const> m_lines = std::make_shared<Lines>();
    bool m_isNew = false; ///< `m_lines` has changed since the last look
    bool m_stop = false;

    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
