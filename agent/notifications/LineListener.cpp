// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/LineListener.h"

#include "agent/notifications/StandardNotifications.h"
#include "agent/readers/BoardFaults.h"
#include "agent/readers/BoardFeatures.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

int LineListener::ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) {
    DS1LineStatusEvent* const received = event.get();
    if (received == nullptr) return 0;
    ReferenceCounter<DS1LineDevice> line = received->GetLine();
    DS1LineDevice* const changed = line.get();
    if (changed == nullptr) return 0;
    Change change{std::move(line), received->GetLineStatus(), changed->GetLineStatusLastChange(),
                  changed->GetLineStatusChangeTrapEnable(), Clock::now()};
    std::scoped_lock const guard(m_mutex);
    if (m_stopped) return 0;
    auto const place = m_places.find(changed);
    if (place != m_places.end())
        enqueue(place->second.ifIndex, change);
    else if (m_waiting.size() < kMostWaiting)
        m_waiting.push_back(std::move(change));
    else
        ++m_counters.notificationsDropped;
    if (m_changed) m_changed();
    return 0;
}

void LineListener::listen(Rows<BoardRow> const& boards, ChangeTimes& times) {
    {
        std::scoped_lock const guard(m_mutex);
        m_times = &times;
    }
    decltype(m_features) present;
    for (BoardRow const& row : boards) {
        auto const board = m_manager.GetBoardByIndex(static_cast<int>(row.boardIndex));
        Board* const asked = board.get();
        if (asked == nullptr) continue;
        readGuarded(row.boardIndex, "line features", [&] {
            forEachFeature<DS1LineFeature>(*asked, [&](DS1LineFeature& feature) {
                if (!m_features.contains(&feature)) feature.AddLineStatusListener(this);
                present.emplace(&feature, ReferenceCounter<DS1LineFeature>(&feature));
            });
        });
    }
    m_features = std::move(present);
}

void LineListener::place(std::vector<PlacedLine> const& lines) {
    decltype(m_places) places;
    for (PlacedLine const& placed : lines)
        places.emplace(placed.line.get(), placed);
    // Dropping a change or a former place may destroy its line, which must not happen under the
    // lock.
    std::vector<Change> waiting;
    std::scoped_lock const guard(m_mutex);
    m_places.swap(places);
    waiting.swap(m_waiting);
    for (Change const& change : waiting)
        if (auto const place = m_places.find(change.line.get()); place != m_places.end())
            enqueue(place->second.ifIndex, change);
}

void LineListener::enqueue(std::uint32_t ifIndex, Change const& change) {
    if (m_observer) m_observer(ifIndex, change.status);
    int const enable =
        m_settings.find({Setting::LineStatusChangeTraps, ifIndex}).value_or(change.enable);
    if (enable != kEnabled) return;
    std::uint32_t const ticks = change.lastChange < 0
                                    ? m_times->uptime().at(change.when)
                                    : m_times->at(ifIndex, change.lastChange, change.when);
    m_queue.push(
        lineStatusChange(ifIndex, change.status, m_counters.sysUpTime(ticks), change.when));
}

void LineListener::start(std::function<void()> changed) {
    std::scoped_lock const guard(m_mutex);
    m_stopped = false;
    m_changed = std::move(changed);
}

void LineListener::stop() {
    std::scoped_lock const guard(m_mutex);
    m_stopped = true;
    m_changed = nullptr;
}

void applySettings(Settings const& settings, std::vector<PlacedLine> const& lines) {
    for (PlacedLine const& placed : lines) {
        auto const set = settings.find({Setting::LineStatusChangeTraps, placed.ifIndex});
        DS1LineDevice* const line = placed.line.get();
        if (!set) continue;
        // A line that refuses is not an error: the agent itself obeys the setting.
        readGuarded(placed.boardIndex, "lines' settings", [&] {
            if (line->GetLineStatusChangeTrapEnable() != *set)
                line->SetLineStatusChangeTrapEnable(*set);
        });
    }
}

} // namespace kvloamd
