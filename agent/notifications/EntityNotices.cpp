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

NotifiedObject objectOf(std::uint32_t entity, OidView column, ValueType type,
                        std::variant<std::int64_t, std::string, Oid> value) {
    Oid name = joined(kStandardArc, column);
    name.push_back(entity);
    return {std::move(name), type, std::move(value)};
}

} // namespace

std::optional<Clock::time_point> EntityNotices::update(std::shared_ptr<Snapshot const> newest,
                                                       Clock::time_point now) {
    if (m_former && m_former != newest) {
        if (m_former->entities.lastChange != newest->entities.lastChange) m_changed = true;
        findStateChanges(*m_former, *newest);
    }
    m_former = std::move(newest);
    queueStateChanges(kBatch);
    if (!m_stateChanges.empty()) return now;
    if (!m_changed) return std::nullopt;
    if (m_lastConfigChange && now < *m_lastConfigChange + kPause)
        return *m_lastConfigChange + kPause;
    // The published snapshot already shows the change, so the notification need not wait.
    m_queue.push({joined(kStandardArc, kConfigChange), {}, m_former->begun});
    m_lastConfigChange = now;
    m_changed = false;
    return std::nullopt;
}

void EntityNotices::findStateChanges(Snapshot const& former, Snapshot const& newest) {
    auto before = former.entities.states.begin();
    auto const end = former.entities.states.end();
    for (EntityStateRow const& row : newest.entities.states) {
        while (before != end && before->entity < row.entity)
            ++before;
        if (before == end) return;
        if (before->entity != row.entity || before->state.oper == row.state.oper) continue;
        if (row.state.oper == OperState::Enabled || row.state.oper == OperState::Disabled)
            m_stateChanges.push_back({row.entity, row.state, newest.begun});
    }
}

void EntityNotices::finish() {
    queueStateChanges(m_stateChanges.size());
}

void EntityNotices::queueStateChanges(std::size_t most) {
    for (std::size_t queued = 0; queued < most && !m_stateChanges.empty(); ++queued) {
        auto const& [entity, state, when] = m_stateChanges.front();
        OidView const which = state.oper == OperState::Enabled ? kOperEnabled : kOperDisabled;
        m_queue.push({joined(kStandardArc, which),
                      {objectOf(entity, kAdmin, ValueType::Integer,
                                std::int64_t{static_cast<int>(state.admin)}),
                       objectOf(entity, kAlarm, ValueType::Octets, std::string(1, state.alarm))},
                      when,
                      {.entity = entity}});
        m_stateChanges.pop_front();
    }
}

} // namespace kvloamd
