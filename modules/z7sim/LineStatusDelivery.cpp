// SPDX-License-Identifier: BSD-2-Clause
#include "LineStatusDelivery.h"

#include <utility>

#include "Z7SimLineFeature.h"

namespace {
constexpr std::size_t kMostNotes = 65536;
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

void LineStatusDelivery::open(std::uint64_t number, ReferenceCounter<Z7SimLineFeature> feature) {
    std::scoped_lock const guard(m_mutex);
    m_features.emplace(number, std::move(feature));
}

void LineStatusDelivery::close(std::uint64_t number) {
    // The last handle must go without the lock: lines wait for the scheduler when they are deleted.
    ReferenceCounter<Z7SimLineFeature> closed;
    std::scoped_lock const guard(m_mutex);
    auto const found = m_features.find(number);
    if (found == m_features.end()) return;
    closed = std::move(found->second);
    m_features.erase(found);
}

void LineStatusDelivery::post(std::uint64_t number, int line, DS1LineStatusEnum status) {
    std::scoped_lock const guard(m_mutex);
    if (m_notes.size() >= kMostNotes) return;
    m_notes.push_back({number, line, status});
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
        m_changed.wait(guard, [this] { return !m_notes.empty(); });
        Note const note = m_notes.front();
        m_notes.pop_front();
        guard.unlock();
        deliver(note);
        guard.lock();
        ++m_delivered;
        m_changed.notify_all();
    }
}

void LineStatusDelivery::deliver(Note const& note) {
    ReferenceCounter<Z7SimLineFeature> feature;
    {
        std::scoped_lock const guard(m_mutex);
        if (auto const found = m_features.find(note.number); found != m_features.end())
            feature = found->second;
    }
    if (feature.get() == nullptr) return;
    feature->NotifyLineStatusListeners(feature->lineAt(note.line), note.status);
}
