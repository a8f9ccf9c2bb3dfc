// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Collector.h"

#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <exception>
#include <string>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

/// On a single processor, a request that arrives while boards are read is served at once. Not the
/// lowest priority: boards must be read even if other programs keep all processors busy.
constexpr int kNiceness = 15;

} // namespace

Collector::Collector(ReadRows readRows, Clock::time_point started, std::function<void()> renewed,
                     CollectorPace pace)
    : m_readRows(std::move(readRows)),
      m_uptime(started),
      m_renewed(std::move(renewed)),
      m_pace(pace) {
    std::promise<void> first;
    std::future<void> firstDone = first.get_future();
    m_thread =
        std::thread([this, promise = std::move(first)]() mutable { begin(std::move(promise)); });
    try {
        firstDone.get();
    } catch (...) {
        m_thread.join();
        throw;
    }
}

Collector::~Collector() {
    {
        std::scoped_lock const guard(m_mutex);
        m_stop = true;
    }
    m_wake.notify_one();
    m_thread.join();
}

std::shared_ptr<Snapshot const> Collector::snapshot() {
    std::scoped_lock const guard(m_mutex);
    if (Clock::now() - m_snapshot->begun > m_pace.requestAge && !m_requested) {
        m_requested = true;
        m_wake.notify_one();
    }
    return m_snapshot;
}

std::shared_ptr<Snapshot const> Collector::newest() {
    std::scoped_lock const guard(m_mutex);
    return m_snapshot;
}

void Collector::renew() {
    {
        std::scoped_lock const guard(m_mutex);
        m_eventful = true;
    }
    m_wake.notify_one();
}

void Collector::begin(std::promise<void> first) {
    // For this thread only. If it fails, some requests are answered a few ms later.
    setpriority(PRIO_PROCESS, static_cast<id_t>(gettid()), kNiceness);
    try {
        m_snapshot = collect(nullptr);
    } catch (...) {
        first.set_exception(std::current_exception());
        return;
    }
    first.set_value();
    run();
}

void Collector::run() {
    // Destroyed here, after the next snapshot: freeing all rows takes a while, which must not delay
    // a request.
    std::shared_ptr<Snapshot const> former;
    std::unique_lock lock(m_mutex);
    while (!m_stop) {
        m_wake.wait_until(lock, m_tried + m_pace.idle,
                          [this] { return m_stop || m_requested || m_eventful; });
        // Events come in bursts; one snapshot shows them all.
        if (!m_requested)
            m_wake.wait_until(lock, m_tried + m_pace.eventPause, [this] { return m_stop; });
        if (m_stop) return;
        m_requested = false;
        m_eventful = false;
        std::shared_ptr<Snapshot const> snapshot = m_snapshot;
        lock.unlock();
        std::shared_ptr<Snapshot const> renewed = tryToCollect(snapshot.get());
        lock.lock();
        if (!renewed) continue;
        snapshot = std::move(renewed);
        m_snapshot.swap(snapshot);
        lock.unlock();
        former = std::move(snapshot);
        m_renewed();
        lock.lock();
    }
}

std::shared_ptr<Snapshot const> Collector::tryToCollect(Snapshot const* former) {
    std::string why;
    try {
        auto snapshot = collect(former);
        if (std::exchange(m_failing, false))
            log(LogLevel::Info, "the boards and the platform can be read again");
        return snapshot;
    } catch (std::exception const& error) {
        why = error.what();
    } catch (...) {
        why = "unknown exception";
    }
    if (!std::exchange(m_failing, true))
        log(LogLevel::Error, "the boards and the platform cannot be read: " + why +
                                 "; the agent answers from its last snapshot and keeps trying");
    return nullptr;
}

std::shared_ptr<Snapshot const> Collector::collect(Snapshot const* former) {
    auto snapshot = std::make_shared<Snapshot>();
    m_tried = snapshot->begun = Clock::now();
    m_readRows(*snapshot);
    snapshot->refreshTime =
        std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - snapshot->begun);
    snapshot->longestRefreshTime = snapshot->refreshTime;
    if (former == nullptr) return snapshot;
    snapshot->number = former->number + 1;
    snapshot->longestRefreshTime = std::max(snapshot->refreshTime, former->longestRefreshTime);
    snapshot->lastChange = snapshot->boards == former->boards ? former->lastChange : m_uptime.now();
    return snapshot;
}

} // namespace kvloamd
