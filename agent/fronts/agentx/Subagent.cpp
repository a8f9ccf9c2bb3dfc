// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/Subagent.h"

#include <string_view>
#include <utility>

namespace kvloamd {

void Subagent::serve(Served served) {
    std::vector<AgentxRoot> roots;
    for (ServedTree const& tree : served.trees) {
        for (Place const& place : tree.places) {
            if (place.hostHas != HostHas::Nothing) continue;
            // Another agent that serves the first tree is a second kvloamd, which serves all of it.
            roots.push_back(
                {joined(tree.arc, place.place), place.name, &tree == &served.trees.front()});
        }
    }
    m_counters = &served.counters;
    m_newestSnapshot = std::move(served.newestSnapshot);
    m_rows.emplace(served.trees);
    updateRows();
    m_answers.emplace(served.trees, served.counters, std::move(served.takeSnapshot),
                      served.settings);
    m_session.emplace(
        m_address, std::move(roots), *m_rows,
        [this](AgentxHeader const& header, std::string_view payload) {
            m_counters->master = m_session->isConnected() ? Master::Connected : Master::Lost;
            m_counters->masterLosses = m_session->timesLost();
            return m_answers->answer(header, payload);
        },
        AgentxPace{}, std::move(served.capabilities));
    loop().add(*this);
}

void Subagent::updateRows() {
    auto newest = m_newestSnapshot();
    if (newest == m_seen) return;
    m_seen = std::move(newest);
    m_rows->update({*m_seen, *m_counters}, Clock::now());
}

std::optional<Clock::time_point> Subagent::prepare(std::vector<pollfd>& polled) {
    updateRows();
    m_session->registerRows();
    polled.push_back({m_session->descriptor(), m_session->events(), 0});
    return m_session->deadline();
}

void Subagent::handle(std::span<pollfd const> polled) {
    m_session->advance(polled.front().revents);
    if (auto const& time = m_session->masterTime())
        m_counters->setSysUpTime(time->ticks, time->when);
}

} // namespace kvloamd
