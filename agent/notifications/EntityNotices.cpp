// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/EntityNotices.h"

#include <algorithm>
#include <string>
#include <utility>

#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

constexpr std::uint32_t kConfigChange[] = {47, 2, 0, 1};
constexpr std::uint32_t kOperEnabled[] = {131, 0, 1};
constexpr std::uint32_t kOperDisabled[] = {131, 0, 2};
constexpr std::uint32_t kAdmin[] = {131, 1, 1, 1, 2};
constexpr std::uint32_t kAlarm[] = {131, 1, 1, 1, 5};

NotifiedObject objectOf(EntityStateRow const& row, OidView column, ValueType type,
                        std::variant<std::int64_t, std::string, Oid> value) {
    Oid name = joined(kStandardArc, column);
    name.push_back(row.entity);
    return {std::move(name), type, std::move(value)};
}

Notification stateNotice(EntityStateRow const& row, OidView which, Clock::time_point when) {
    return {
        joined(kStandardArc, which),
        {objectOf(row, kAdmin, ValueType::Integer, std::int64_t{static_cast<int>(row.state.admin)}),
         objectOf(row, kAlarm, ValueType::Octets, std::string(1, row.state.alarm))},
        when,
        {.entity = row.entity}};
}

} // namespace

std::optional<Clock::time_point> EntityNotices::update(std::shared_ptr<Snapshot const> newest,
                                                       Clock::time_point now) {
    if (m_former && m_former != newest) {
        if (m_former->entities.lastChange != newest->entities.lastChange) m_changed = true;
        queueStateChanges(*m_former, *newest);
    }
    m_former = std::move(newest);
    if (!m_changed) return std::nullopt;
    if (m_lastConfigChange && now < *m_lastConfigChange + kPause)
        return *m_lastConfigChange + kPause;
    // The published snapshot already shows the change, so the notification need not wait.
    m_queue.push({joined(kStandardArc, kConfigChange), {}, m_former->begun});
    m_lastConfigChange = now;
    m_changed = false;
    return std::nullopt;
}

void EntityNotices::queueStateChanges(Snapshot const& former, Snapshot const& newest) {
    auto before = former.entities.states.begin();
    auto const end = former.entities.states.end();
    for (EntityStateRow const& row : newest.entities.states) {
        while (before != end && before->entity < row.entity)
            ++before;
        if (before == end) return;
        if (before->entity != row.entity || before->state.oper == row.state.oper) continue;
        if (row.state.oper == OperState::Enabled)
            m_queue.push(stateNotice(row, kOperEnabled, newest.begun));
        else if (row.state.oper == OperState::Disabled)
            m_queue.push(stateNotice(row, kOperDisabled, newest.begun));
    }
}

} // namespace kvloamd
