// SPDX-License-Identifier: BSD-2-Clause
// What becomes of alarms, and the time that they are held.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/alarms/AlarmList.h"
#include "agent/alarms/AlarmSources.h"
#include "agent/journal/Journal.h"
#include "agent/journal/NotificationLog.h"
#include "agent/notifications/Notification.h"
#include "agent/rows/Counters.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// An `AlarmReport` logs every event of an alarm, and numbers and records it in the journal, with
/// other events. Thread-safe once the journal is open.
class AlarmReport {
  public:
    /// `enterprise`: the arc above KVL-OAM-MIB.
    explicit AlarmReport(Oid enterprise = {}) : m_enterprise(std::move(enterprise)) {}

    /// Opens the journal in `directory`; without one, events are only numbered. Before any other
    /// operation. Returns the alarms that were active at the end of the last run.
    std::vector<Alarm> open(std::string const& directory);
    /// Writes the end of the agent and the alarms that are active, and closes the journal. What is
    /// reported later is numbered only.
    void close(std::vector<Alarm> const& active);

    std::uint32_t report(AlarmEvent event, Alarm const& alarm);
    /// Gives a notification its number, which it appends, and records it in the journal and the log
    /// of notifications. `dropped`: it is not sent.
    void record(Notification& notification, bool dropped);
    /// Records another event.
    void note(JournalEvent event, std::string const& text, std::string const& board = {});

    Journal::Counts counts() const { return m_journal->counts(); }
    /// To read from. Once the journal is open.
    Journal const& journal() const { return *m_journal; }
    NotificationLog& notifications() { return m_notifications; }

  private:
    void addNumber(JournalEntry& entry) const;

    Oid const m_enterprise;
    NotificationLog m_notifications{JournalLimits{}.age};
    std::unique_ptr<Journal> m_journal = std::make_unique<Journal>("");
};

/// An `AlarmClock` makes the alarm list follow the time, and watches the agent's own health.
/// Thread-bound: the alarm thread.
class AlarmClock {
  public:
    /// The time between two looks at the agent's health.
    static constexpr std::chrono::seconds kPause{2};

    /// All outlive the clock. `changed` is called when the passing of time, or the agent's health,
    /// has changed the alarms.
    AlarmClock(AlarmList& alarms, AlarmReport const& report, Counters const& counters,
               std::function<void()> changed)
        : m_alarms(alarms), m_report(report), m_watch(counters), m_changed(std::move(changed)) {}

    /// Returns the time of the next call.
    Clock::time_point advance(Snapshot const& newest, Instant now);

  private:
    AlarmList& m_alarms;
    AlarmReport const& m_report;
    HealthWatch m_watch;
    std::function<void()> m_changed;
    std::optional<Clock::time_point> m_looked; ///< at the agent's health
};

/// A `SettingsWatch` records in the journal what operators set. Thread-bound: the collector.
class SettingsWatch {
  public:
    /// Both outlive the watch.
    SettingsWatch(Settings const& settings, AlarmReport& report)
        : m_settings(settings), m_report(report) {}

    /// Records what has been set since the last call. The first call records nothing.
    void update();

  private:
    Settings const& m_settings;
    AlarmReport& m_report;
    std::optional<std::vector<SettingEntry>> m_former;
};

} // namespace kvloamd
