// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/EventLoop.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

/// poll()'s timeout, rounded up, so that the loop does not wake just before the deadline.
int millisecondsUntil(Clock::time_point when) {
    auto const left = std::chrono::ceil<std::chrono::milliseconds>(when - Clock::now());
    std::chrono::milliseconds const longest = std::chrono::hours(1);
    return static_cast<int>(std::clamp(left, std::chrono::milliseconds(0), longest).count());
}

} // namespace

void EventLoop::watch(int descriptor, std::function<void()> readable) {
    m_watched.push_back({descriptor, std::move(readable)});
}

void EventLoop::beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) {
    m_prepare = std::move(prepare);
}

void EventLoop::run(Clock::time_point until) {
    m_stop = false;
    while (!m_stop && Clock::now() < until)
        turn(until);
}

void EventLoop::turn(Clock::time_point until) {
    Clock::time_point wake = until;
    if (m_prepare)
        if (auto const deadline = m_prepare()) wake = std::min(wake, *deadline);
    if (m_stop) return;

    std::vector<pollfd> polled;
    for (Watched const& watched : m_watched)
        polled.push_back({watched.descriptor, POLLIN, 0});
    std::vector<std::size_t> ends;
    for (Source* const source : m_sources) {
        if (auto const deadline = source->prepare(polled)) wake = std::min(wake, *deadline);
        ends.push_back(polled.size());
    }
    if (poll(polled.data(), polled.size(), millisecondsUntil(wake)) < 0) {
        if (errno == EINTR) return;
        log(LogLevel::Error, std::string("waiting for requests: ") + std::strerror(errno));
        m_stop = true;
        return;
    }
    for (std::size_t i = 0; i < m_watched.size(); ++i)
        if (polled[i].revents != 0) m_watched[i].readable();
    std::size_t begin = m_watched.size();
    for (std::size_t i = 0; i < ends.size(); ++i) {
        m_sources[i]->handle(std::span(polled).subspan(begin, ends[i] - begin));
        begin = ends[i];
    }
}

} // namespace kvloamd
