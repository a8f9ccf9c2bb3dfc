// SPDX-License-Identifier: BSD-2-Clause
#include "LineStatusDelivery.h"

#include <utility>

namespace {
constexpr std::size_t kMostChanges = 65536;
}

LineStatusDelivery& LineStatusDelivery::instance() {
    static auto* const delivery = [] {
        auto* const made = new LineStatusDelivery;
        made->m_thread.Start();
        return made;
    }();
    return *delivery;
}

std::uint64_t LineStatusDelivery::reserve() {
    std::scoped_lock const guard(m_mutex);
    return ++m_lastNumber;
}

void LineStatusDelivery::open(std::uint64_t number, ReferenceCounter<DS1LineFeatureZ7> feature,
                              ReferenceCounter<DS1LineDevice> line) {
    Line opened{std::move(feature), std::move(line)};
    std::scoped_lock const guard(m_mutex);
    std::swap(m_lines[number], opened);
}

void LineStatusDelivery::close(std::uint64_t number) {
    // Handles must not be dropped under the lock: lines wait for the scheduler when they are
    // deleted.
    Line closed;
    std::scoped_lock const guard(m_mutex);
    auto const found = m_lines.find(number);
    if (found == m_lines.end()) return;
    closed = std::move(found->second);
    m_lines.erase(found);
}

void LineStatusDelivery::post(std::uint64_t number, DS1LineStatusEnum status) {
    std::scoped_lock const guard(m_mutex);
    if (m_changes.size() >= kMostChanges) return;
    m_changes.push_back({number, status});
    ++m_posted;
    m_changed.notify_all();
}

void LineStatusDelivery::drain() {
    std::unique_lock guard(m_mutex);
    m_changed.wait(guard, [this, posted = m_posted] { return m_delivered >= posted; });
}

void LineStatusDelivery::Run() {
    std::unique_lock guard(m_mutex);
    for (;;) {
        m_changed.wait(guard, [this] { return !m_changes.empty(); });
        Change const change = m_changes.front();
        m_changes.pop_front();
        guard.unlock();
        deliver(change);
        guard.lock();
        ++m_delivered;
        m_changed.notify_all();
    }
}

void LineStatusDelivery::deliver(Change const& change) {
    Line changed;
    {
        std::scoped_lock const guard(m_mutex);
        if (auto const found = m_lines.find(change.number); found != m_lines.end())
            changed = found->second;
    }
    if (changed.feature.get() == nullptr) return;
    changed.feature->NotifyLineStatusListeners(changed.line, change.status);
}
