// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/AlarmReport.h"

#include <algorithm>
#include <string>
#include <variant>

#include "agent/alarms/TypeLimits.h"
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
    case AlarmEvent::Explained:
        break;
    }
    return "changed";
}

JournalEvent journalEvent(AlarmEvent event) {
    switch (event) {
    case AlarmEvent::Raised:
        return JournalEvent::AlarmRaised;
    case AlarmEvent::Cleared:
        return JournalEvent::AlarmCleared;
    case AlarmEvent::SeverityChanged:
    case AlarmEvent::Explained:
        break;
    }
    return JournalEvent::AlarmChanged;
}

LogLevel levelOf(AlarmEvent event, AlarmSeverity severity) {
    if (event == AlarmEvent::Cleared) return LogLevel::Info;
    if (severity == AlarmSeverity::Critical) return LogLevel::Error;
    return severity == AlarmSeverity::Warning ? LogLevel::Info : LogLevel::Warning;
}

std::string textOf(AlarmEvent event, Alarm const& alarm, AlarmKindInfo const& kind) {
    std::string const detail =
        alarm.condition.text.empty() ? std::string() : " (" + alarm.condition.text + ")";
    if (event == AlarmEvent::Explained)
        return std::string(kind.name) + " on " + alarm.condition.resource + detail +
               " follows from " + alarm.cause;
    std::string text = "alarm " + std::string(eventName(event)) + ": " +
                       severityName(alarm.severity) + " " + kind.name + " on " +
                       alarm.condition.resource;
    if (event == AlarmEvent::Raised) text += std::string(": ") + kind.meaning;
    if (event != AlarmEvent::Cleared) text += detail;
    if (event == AlarmEvent::Cleared && !alarm.cause.empty())
        text += ", because it follows from " + alarm.cause;
    if (alarm.count > 1) text += ", " + std::to_string(alarm.count) + " times";
    return text;
}

/// "kvlThresholdES15m" for the setting of that limit; empty for any other setting.
std::string thresholdColumn(Setting setting) {
    for (std::size_t threshold = 0; threshold < kThresholds; ++threshold)
        if (thresholdSetting(threshold) == setting)
            return "kvlT" + std::string(alarmKind(thresholdKind(threshold)).name).substr(1);
    return {};
}

std::string textOf(SettingKey const& key) {
    std::string const index = std::to_string(key.index);
    if (std::string const column = thresholdColumn(key.setting); !column.empty())
        return column + "." + index;
    switch (key.setting) {
    case Setting::LineStatusChangeTraps:
        return "dsx1LineStatusChangeTrapEnable." + index;
    case Setting::LinkUpDownTraps:
        return "ifLinkUpDownTrapEnable." + index;
    case Setting::InterfaceAlias:
        return "ifAlias." + index;
    case Setting::CircuitIdentifier:
        return "dsx1CircuitIdentifier." + index;
    case Setting::CallInformationTraps:
        return "isdnSignalingInfoTrapEnable." + index;
    case Setting::EntityAlias:
        return "entPhysicalAlias." + index;
    case Setting::EntityAssetId:
        return "entPhysicalAssetID." + index;
    case Setting::EntityUris:
        return "entPhysicalUris." + index;
    case Setting::FirstThreshold: // has its column's name already
        break;
    }
    return "setting " + std::to_string(static_cast<int>(key.setting)) + "." + index;
}

std::string textOf(SettingValue const& value) {
    if (auto const* const number = std::get_if<int>(&value)) return std::to_string(*number);
    return "'" + std::get<std::string>(value) + "'";
}

/// The entry with this key of `all`, which are ascending by key; null when there is none.
SettingEntry const* find(std::vector<SettingEntry> const& all, SettingKey const& key) {
    auto const found = std::ranges::lower_bound(all, key, {}, &SettingEntry::key);
    return found == all.end() || found->key != key ? nullptr : &*found;
}

} // namespace

std::vector<Alarm> AlarmReport::open(std::string const& directory) {
    m_journal =
        std::make_unique<Journal>(directory.empty() ? directory : directory + "/journal.sqlite");
    note(JournalEvent::AgentStarted, "the agent has started");
    std::vector<JournalEntry> former = m_journal->takeFormerNotifications();
    for (JournalEntry& entry : former)
        addNumber(entry);
    m_notifications.load(std::move(former));
    return m_journal->formerAlarms();
}

void AlarmReport::close(std::vector<Alarm> const& active) {
    note(JournalEvent::AgentStopped, "the agent stops");
    m_journal->close(active);
}

void AlarmReport::note(JournalEvent event, std::string const& text, std::string const& board) {
    JournalEntry entry;
    entry.event = event;
    entry.date = std::chrono::system_clock::now();
    entry.text = text;
    entry.board = board;
    m_journal->append(std::move(entry));
}

void AlarmReport::addNumber(JournalEntry& entry) const {
    LoggedVariable const number{eventNumberName(m_enterprise), VariableType::Unsigned32,
                                std::int64_t{entry.sequence}};
    entry.notification->variables.push_back(number);
}

void AlarmReport::record(Notification& notification, bool dropped) {
    JournalEntry entry;
    entry.event = JournalEvent::Notification;
    entry.date = std::chrono::system_clock::now();
    entry.text = "notification " + notificationName(m_enterprise, notification.name) +
                 (dropped ? " dropped, because too many wait" : "");
    entry.ifIndex = notification.subject.ifIndex;
    // The variable with the number is not written: the entry has it.
    entry.notification = logged(notification);
    entry.sequence = m_journal->append(entry);
    addNumber(entry);
    notification.objects.push_back(
        {eventNumberName(m_enterprise), ValueType::Gauge, std::int64_t{entry.sequence}});
    m_notifications.add(std::move(entry), Clock::now());
}

std::uint32_t AlarmReport::report(AlarmEvent event, Alarm const& alarm) {
    AlarmKindInfo const& kind = alarmKind(alarm.condition.key.kind);
    std::uint32_t const ifIndex = alarm.condition.ifIndex;
    std::string const text = textOf(event, alarm, kind);
    if (event == AlarmEvent::Explained) {
        log(LogLevel::Info, text, {{"KVL_BOARD", alarm.condition.key.board}});
        return 0; // no event of an alarm
    }
    log(levelOf(event, alarm.severity), text,
        {{"KVL_ALARM", kind.name},
         {"KVL_ALARM_EVENT", eventName(event)},
         {"KVL_SEVERITY", severityName(alarm.severity)},
         {"KVL_BOARD", alarm.condition.key.board},
         {"KVL_LINE", ifIndex == 0 ? std::string() : std::to_string(ifIndex)}});
    JournalEntry entry;
    entry.event = journalEvent(event);
    entry.date = std::chrono::system_clock::now();
    entry.text = text;
    entry.board = alarm.condition.key.board;
    entry.ifIndex = ifIndex;
    entry.alarm = alarm;
    return m_journal->append(std::move(entry));
}

Clock::time_point AlarmClock::advance(Snapshot const& newest, Instant now) {
    std::uint64_t const before = m_alarms.version();
    if (!m_looked || now.steady - *m_looked >= kPause) {
        m_looked = now.steady;
        m_alarms.compare(AlarmScope::Health,
                         m_watch.conditions(newest, now.steady, m_report.counts().failing),
                         now.steady, now);
    }
    Clock::time_point const next = *m_looked + kPause;
    auto const held = m_alarms.advance(now);
    if (m_alarms.version() != before) m_changed();
    return held ? std::min(next, *held) : next;
}

void SettingsWatch::update() {
    std::vector<SettingEntry> all = m_settings.all(SettingIndex::Interface);
    for (SettingEntry& entry : m_settings.all(SettingIndex::Entity))
        all.push_back(std::move(entry));
    if (m_former) {
        // Both are ascending by key: settings of interfaces have the lower numbers.
        for (SettingEntry const& entry : all)
            if (auto const* const former = find(*m_former, entry.key);
                former == nullptr || former->value != entry.value)
                m_report.note(JournalEvent::Setting,
                              textOf(entry.key) + " is now " + textOf(*entry.value));
        for (SettingEntry const& entry : *m_former)
            if (find(all, entry.key) == nullptr)
                m_report.note(JournalEvent::Setting, textOf(entry.key) + " is not set any more");
    }
    m_former = std::move(all);
}

} // namespace kvloamd
