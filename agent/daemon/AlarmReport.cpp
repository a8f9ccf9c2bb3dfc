// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/AlarmReport.h"

#include <algorithm>
#include <string>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

char const* eventName(AlarmEvent event) {
    switch (event) {
    case AlarmEvent::Raised:
        return "raised";
    case AlarmEvent::Cleared:
        return "cleared";
    case AlarmEvent::SeverityChanged:
        break;
    }
    return "changed";
}

LogLevel levelOf(AlarmEvent event, AlarmSeverity severity) {
    if (event == AlarmEvent::Cleared) return LogLevel::Info;
    if (severity == AlarmSeverity::Critical) return LogLevel::Error;
    return severity == AlarmSeverity::Warning ? LogLevel::Info : LogLevel::Warning;
}

std::string textOf(AlarmEvent event, Alarm const& alarm, AlarmKindInfo const& kind) {
    std::string text = "alarm " + std::string(eventName(event)) + ": " +
                       severityName(alarm.severity) + " " + kind.name + " on " +
                       alarm.condition.resource;
    if (event == AlarmEvent::Raised) text += std::string(": ") + kind.meaning;
    if (event != AlarmEvent::Cleared && !alarm.condition.text.empty())
        text += " (" + alarm.condition.text + ")";
    if (alarm.count > 1) text += ", " + std::to_string(alarm.count) + " times";
    return text;
}

} // namespace

std::uint32_t AlarmReport::report(AlarmEvent event, Alarm const& alarm) {
    std::uint32_t const number = ++m_last;
    AlarmKindInfo const& kind = alarmKind(alarm.condition.key.kind);
    std::uint32_t const ifIndex = alarm.condition.ifIndex;
    log(levelOf(event, alarm.severity), textOf(event, alarm, kind),
        {{"KVL_ALARM", kind.name},
         {"KVL_ALARM_EVENT", eventName(event)},
         {"KVL_SEVERITY", severityName(alarm.severity)},
         {"KVL_BOARD", alarm.condition.key.board},
         {"KVL_LINE", ifIndex == 0 ? std::string() : std::to_string(ifIndex)}});
    return number;
}

Clock::time_point AlarmClock::advance(Snapshot const& newest, Instant now) {
    std::uint64_t const before = m_alarms.version();
    if (!m_looked || now.steady - *m_looked >= kPause) {
        m_looked = now.steady;
        m_alarms.compare(AlarmScope::Health, m_watch.conditions(newest, now.steady), now.steady,
                         now);
    }
    Clock::time_point const next = *m_looked + kPause;
    auto const held = m_alarms.advance(now);
    if (m_alarms.version() != before) m_changed();
    return held ? std::min(next, *held) : next;
}

} // namespace kvloamd
