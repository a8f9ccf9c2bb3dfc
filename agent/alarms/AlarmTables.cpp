// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmTables.h"

#include <algorithm>
#include <utility>

#include "agent/alarms/AlarmSources.h"
#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

Oid const kZeroDotZero{0, 0};
Oid const kLinkDown{1, 3, 6, 1, 6, 3, 1, 1, 5, 3};
Oid const kLineStatusChange{1, 3, 6, 1, 2, 1, 10, 18, 15, 0, 1};
Oid const kIfIndexColumn{1, 3, 6, 1, 2, 1, 2, 2, 1, 1};
Oid const kModelColumn{1, 3, 6, 1, 2, 1, 118, 1, 1, 2, 1, 3};
// Of KVL-OAM-MIB, relative.
Oid const kBoardStatusChange{1, 0, 1};
Oid const kFaultRaised{1, 0, 2};
Oid const kBoardStatusColumn{1, 1, 2, 4, 1, 2};
Oid const kAgentUpTime{1, 1, 9, 1, 0};
Oid const kAlarmEntry{1, 1, 12, 4, 1};

// Columns of kvlAlarmTable.
constexpr std::uint32_t kKind = 2;
constexpr std::uint32_t kSeverity = 3;
constexpr std::uint32_t kResource = 4;

std::string dateOf(std::chrono::system_clock::time_point date) {
    return dateOctets(static_cast<long>(std::chrono::system_clock::to_time_t(date)));
}

std::string textOf(Condition const& condition) {
    std::string text = alarmKind(condition.key.kind).meaning;
    if (!condition.text.empty()) text += " (" + condition.text + ")";
    return printable(text);
}

/// The row of alarmModelTable for a kind with this severity.
Oid modelRow(AlarmKind kind, AlarmSeverity severity) {
    return joined(kModelColumn, Oid{0, static_cast<std::uint32_t>(kind), modelState(severity)});
}

} // namespace

std::uint32_t modelState(AlarmSeverity severity) {
    switch (severity) {
    case AlarmSeverity::Cleared:
        return 1;
    case AlarmSeverity::Indeterminate:
        return 2;
    case AlarmSeverity::Warning:
        return 3;
    case AlarmSeverity::Minor:
        return 4;
    case AlarmSeverity::Major:
        return 5;
    case AlarmSeverity::Critical:
        break;
    }
    return 6;
}

AlarmTables::AlarmTables(AlarmList const& alarms, Oid enterprise, Clock::time_point started)
    : m_alarms(alarms), m_enterprise(std::move(enterprise)), m_uptime(started) {}

std::shared_ptr<AlarmRows const> AlarmTables::rows() {
    std::scoped_lock const guard(m_mutex);
    AlarmList::Contents const contents = m_alarms.contents(m_rows ? m_version : 0);
    if (m_rows && contents.version == m_version) return m_rows;
    auto rows = std::make_shared<AlarmRows>();
    for (AlarmList::Active const& active : contents.active)
        addActive(*rows, active.alarm, active.present);
    for (Alarm const& alarm : contents.cleared) {
        DatedAlarmRow row = datedRow(alarm);
        row.place = datedIndex(dateOf(alarm.cleared), alarm.number);
        row.model = modelRow(alarm.condition.key.kind, AlarmSeverity::Cleared);
        rows->cleared.push_back(std::move(row));
    }
    addModels(*rows, contents.policies);
    addTotals(*rows, contents.kinds);
    std::ranges::sort(rows->alarms, {}, &AlarmRow::number);
    std::ranges::sort(rows->active, {}, &DatedAlarmRow::place);
    std::ranges::sort(rows->cleared, {}, &DatedAlarmRow::place);
    for (AlarmRow const& row : rows->alarms)
        addVariables(*rows, row);
    AlarmStatsRow& stats = rows->stats.front();
    stats.current = static_cast<std::uint32_t>(rows->alarms.size());
    stats.raised = contents.counts.raised;
    if (contents.counts.lastRaised) stats.lastRaise = m_uptime.at(*contents.counts.lastRaised);
    if (contents.counts.lastCleared) stats.lastClear = m_uptime.at(*contents.counts.lastCleared);
    rows->lastChange = std::max(stats.lastRaise, stats.lastClear);
    if (contents.applied) rows->modelChange = m_uptime.at(*contents.applied);
    rows->suppressed = contents.counts.suppressed;
    rows->unlisted = contents.counts.unlisted;
    rows->clearedMaximum = AlarmList::kClearedCapacity;
    m_version = contents.version;
    m_rows = std::move(rows);
    return m_rows;
}

void AlarmTables::addActive(AlarmRows& rows, Alarm const& alarm, bool present) const {
    Condition const& condition = alarm.condition;
    AlarmRow row;
    row.number = alarm.number;
    row.kind = alarmKind(condition.key.kind).name;
    row.severity = static_cast<int>(alarm.severity);
    row.resource = printable(condition.resource);
    row.boardIndex = condition.boardIndex;
    row.ifIndex = condition.ifIndex;
    row.raised = dateOf(alarm.raised);
    row.began = dateOf(alarm.began);
    row.times = alarm.count;
    row.text = textOf(condition);
    row.state = present ? AlarmState::Active : AlarmState::Ending;
    rows.alarms.push_back(std::move(row));
    rows.active.push_back(datedRow(alarm));
}

DatedAlarmRow AlarmTables::datedRow(Alarm const& alarm) const {
    AlarmKind const kind = alarm.condition.key.kind;
    return {datedIndex(dateOf(alarm.raised), alarm.number),
            notificationOf(kind),
            resourceOf(alarm.condition),
            modelRow(kind, alarm.severity),
            own(joined(kAlarmEntry, Oid{kKind, alarm.number})),
            printable(std::string(alarmKind(kind).name) + " on " + alarm.condition.resource + ": " +
                      textOf(alarm.condition))};
}

void AlarmTables::addVariables(AlarmRows& rows, AlarmRow const& row) const {
    auto const name = [&](std::uint32_t column) {
        return own(joined(kAlarmEntry, Oid{column, row.number}));
    };
    rows.variables.push_back({row.number, 1, name(kKind), VariableType::OctetString, 0, row.kind});
    rows.variables.push_back(
        {row.number, 2, name(kSeverity), VariableType::Integer32, row.severity, {}});
    rows.variables.push_back(
        {row.number, 3, name(kResource), VariableType::OctetString, 0, row.resource});
}

void AlarmTables::addModels(AlarmRows& rows, AlarmPolicies const& policies) const {
    for (AlarmKindInfo const& info : alarmKinds()) {
        auto const model = static_cast<std::uint32_t>(info.kind);
        Oid const notification = notificationOf(info.kind);
        std::string const name = info.name;
        rows.models.push_back(
            {model, modelState(AlarmSeverity::Cleared), notification, name + " cleared"});
        // A fault value may have a severity of its own, so every severity has a row.
        if (info.kind == AlarmKind::PlatformFault) {
            for (auto const severity :
                 {AlarmSeverity::Indeterminate, AlarmSeverity::Warning, AlarmSeverity::Minor,
                  AlarmSeverity::Major, AlarmSeverity::Critical})
                rows.models.push_back(
                    {model, modelState(severity), notification,
                     name + " (" + severityName(severity) + "): " + info.meaning});
            continue;
        }
        AlarmSeverity const severity = policies.of(info.kind, 0).severity;
        rows.models.push_back({model, modelState(severity), notification,
                               name + " (" + severityName(severity) + "): " + info.meaning});
    }
}

void AlarmTables::addTotals(AlarmRows& rows,
                            std::map<AlarmKind, AlarmList::KindCounts> const& kinds) {
    for (AlarmKindInfo const& info : alarmKinds()) {
        AlarmTotalRow row;
        row.kind = info.name;
        if (auto const found = kinds.find(info.kind); found != kinds.end()) {
            AlarmList::KindCounts const& counts = found->second;
            row.raised = counts.raised;
            row.cleared = counts.cleared;
            row.active = counts.active;
            row.lasted = std::chrono::duration_cast<std::chrono::milliseconds>(counts.lasted);
            row.counted = counts.counted;
        }
        rows.totals.push_back(std::move(row));
    }
}

Oid AlarmTables::notificationOf(AlarmKind kind) const {
    switch (kind) {
    case AlarmKind::BoardFailed:
    case AlarmKind::BoardStopped:
    case AlarmKind::BoardGone:
        return own(kBoardStatusChange);
    case AlarmKind::PlatformFault:
        return own(kFaultRaised);
    case AlarmKind::LinkDown:
        return kLinkDown;
    default:
        break;
    }
    bool const ofLine = std::ranges::any_of(
        lineAlarms(), [&](LineAlarm const& alarm) { return alarm.kind == kind; });
    return ofLine ? kLineStatusChange : kZeroDotZero;
}

Oid AlarmTables::resourceOf(Condition const& condition) const {
    if (condition.ifIndex != 0) return joined(kIfIndexColumn, Oid{condition.ifIndex});
    if (condition.boardIndex != 0)
        return own(joined(kBoardStatusColumn, Oid{condition.boardIndex}));
    // Neither a board that has gone nor one that is not known has a row.
    return condition.resource == "agent" ? own(kAgentUpTime) : kZeroDotZero;
}

Oid AlarmTables::own(Oid const& relative) const {
    return joined(m_enterprise, relative);
}

} // namespace kvloamd
