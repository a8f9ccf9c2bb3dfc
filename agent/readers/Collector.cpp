// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Collector.h"

#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <utility>

namespace kvloamd {

namespace {

/// A request that comes while boards are read has the processor at once, should there be one only.
/// Not the least: where others keep all processors busy, boards are still read.
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
    // Of this thread only. Without it, everything works, with some requests a few ms later.
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
    // Goes once there is a newer one, when no request uses it any more: giving all its rows back
    // takes a while, which is no request's to spend.
    std::shared_ptr<Snapshot const> former;
    std::unique_lock lock(m_mutex);
    while (!m_stop) {
        m_wake.wait_until(lock, m_snapshot->begun + m_pace.idle,
                          [this] { return m_stop || m_requested || m_eventful; });
        // Events come in crowds: one snapshot shows them all.
        if (!m_requested)
            m_wake.wait_until(lock, m_snapshot->begun + m_pace.eventPause,
                              [this] { return m_stop; });
        if (m_stop) return;
        m_requested = false;
        m_eventful = false;
        std::shared_ptr<Snapshot const> snapshot = m_snapshot;
        lock.unlock();
        snapshot = collect(snapshot.get());
        lock.lock();
        m_snapshot.swap(snapshot);
        lock.unlock();
        former = std::move(snapshot);
        m_renewed();
        lock.lock();
    }
}

std::shared_ptr<Snapshot const> Collector::collect(Snapshot const* former) {
    auto snapshot = std::make_shared<Snapshot>();
    snapshot->begun = Clock::now();
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
