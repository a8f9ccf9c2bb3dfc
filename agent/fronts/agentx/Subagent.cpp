// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/Subagent.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string_view>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

/// poll()'s timeout, rounded up: woken too early, it would only sleep again.
int millisecondsUntil(Clock::time_point when) {
    auto const left = std::chrono::ceil<std::chrono::milliseconds>(when - Clock::now());
    std::chrono::milliseconds const longest = std::chrono::hours(1);
    return static_cast<int>(std::clamp(left, std::chrono::milliseconds(0), longest).count());
}

} // namespace

void Subagent::serve(Served served) {
    std::vector<AgentxRoot> roots;
    for (ServedTree const& tree : served.trees) {
        for (Place const& place : tree.places) {
            if (place.hostHas != HostHas::Nothing) continue;
            // Another agent that has the first tree is one of our kind, and has it all.
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
    m_session.emplace(m_address, std::move(roots), *m_rows,
                      [this](AgentxHeader const& header, std::string_view payload) {
                          m_counters->master =
                              m_session->isConnected() ? Master::Connected : Master::Lost;
                          m_counters->masterLosses = m_session->timesLost();
                          return m_answers->answer(header, payload);
                      });
}

void Subagent::updateRows() {
    auto newest = m_newestSnapshot();
    if (newest == m_seen) return;
    m_seen = std::move(newest);
    m_rows->update({*m_seen, *m_counters}, Clock::now());
}

void Subagent::watch(int descriptor, std::function<void()> readable) {
    m_watched.push_back({descriptor, std::move(readable)});
}

void Subagent::beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) {
    m_prepare = std::move(prepare);
}

void Subagent::run(Clock::time_point until) {
    m_stop = false;
    while (!m_stop && Clock::now() < until)
        step(until);
}

void Subagent::step(Clock::time_point until) {
    std::optional<Clock::time_point> const prepared = m_prepare ? m_prepare() : std::nullopt;
    if (m_stop) return;
    updateRows();
    m_session->registerRows();
    Clock::time_point wake = std::min(until, m_session->deadline());
    if (prepared) wake = std::min(wake, *prepared);

    std::vector<pollfd> polled;
    polled.push_back({m_session->descriptor(), m_session->events(), 0});
    for (Watched const& watched : m_watched)
        polled.push_back({watched.descriptor, POLLIN, 0});
    if (poll(polled.data(), polled.size(), millisecondsUntil(wake)) < 0) {
        if (errno == EINTR) return;
        log(LogLevel::Error, std::string("waiting for requests: ") + std::strerror(errno));
        m_stop = true;
        return;
    }
    for (std::size_t i = 0; i < m_watched.size(); ++i)
        if (polled[i + 1].revents != 0) m_watched[i].readable();
    m_session->advance(polled.front().revents);
}

} // namespace kvloamd
