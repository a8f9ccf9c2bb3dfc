// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/ThresholdWatch.h"

#include <algorithm>
#include <chrono>
#include <string>
#include <utility>

#include "agent/alarms/AlarmSources.h"
#include "agent/readers/BoardFaults.h"

namespace kvloamd {

namespace {

constexpr std::chrono::seconds kPause{1};

/// The row of this index; null if there is none.
template <class Row, auto Index>
Row const* find(Rows<Row> const& rows, std::uint32_t index) {
    auto const found = std::ranges::lower_bound(rows, index, {}, Index);
    return found == rows.end() || (*found).*Index != index ? nullptr : &*found;
}

Condition conditionOf(Snapshot const& snapshot, std::uint32_t ifIndex) {
    auto const* const interface =
        find<InterfaceRow, &InterfaceRow::ifIndex>(snapshot.interfaces.interfaces, ifIndex);
    if (interface == nullptr) return {};
    return interfaceCondition(
        AlarmKind::ThresholdES15m, *interface,
        find<BoardRow, &BoardRow::boardIndex>(snapshot.boards, interface->boardIndex));
}

} // namespace

ThresholdWatch::ThresholdWatch(AlarmList& list, Settings const& settings, TypeLimits const& limits)
    : m_list(list), m_settings(settings), m_limits(limits) {}

ThresholdWatch::~ThresholdWatch() {
    {
        std::scoped_lock const guard(m_mutex);
        m_stop = true;
    }
    m_wake.notify_one();
    if (m_thread.joinable()) m_thread.join();
}

void ThresholdWatch::configure(TypeLimits const& limits) {
    std::scoped_lock const guard(m_mutex);
    m_limits = limits;
}

void ThresholdWatch::update(Snapshot& snapshot, std::vector<PlacedLine> const& lines) {
    TypeLimits limits;
    {
        std::scoped_lock const guard(m_mutex);
        limits = m_limits;
    }
    std::map<std::uint32_t, PlacedLine const*> placed;
    for (PlacedLine const& line : lines)
        placed.emplace(line.ifIndex, &line);
    auto const watched = std::make_shared<Lines>();
    for (LineRow const& line : snapshot.interfaces.lines) {
        if (!line.keepsHistory()) continue;
        snapshot.thresholds.push_back({line.ifIndex, limits.of(line.lineType)});
        LineLimits const own = limitsOf(snapshot.thresholds.back());
        auto const at = placed.find(line.ifIndex);
        if (own == LineLimits{} || at == placed.end()) continue;
        watched->push_back({line.ifIndex, *at->second, conditionOf(snapshot, line.ifIndex), own});
    }
    // The former lines are released without the lock, because that may destroy them.
    std::shared_ptr<Lines const> former = watched;
    {
        std::scoped_lock const guard(m_mutex);
        m_lines.swap(former);
        m_isNew = true;
    }
    m_wake.notify_one();
}

LineLimits ThresholdWatch::limitsOf(ThresholdRow const& row) const {
    LineLimits limits = row.limits;
    for (std::size_t threshold = 0; threshold < kThresholds; ++threshold)
        if (auto const own = m_settings.find({thresholdSetting(threshold), row.ifIndex}))
            limits[threshold] = *own;
    return limits;
}

void ThresholdWatch::start() {
    m_thread = std::thread([this] { run(); });
}

void ThresholdWatch::run() {
    std::unique_lock lock(m_mutex);
    auto next = Clock::now();
    while (!m_stop) {
        m_wake.wait(lock, [this] { return m_stop || m_isNew || !m_lines->empty(); });
        m_wake.wait_until(lock, next, [this] { return m_stop; });
        if (m_stop) return;
        lock.unlock();
        Instant const now = Instant::now();
        look(now);
        // What a delay has cost is not made up for.
        next = std::max(next, now.steady - kPause) + kPause;
        lock.lock();
    }
}

void ThresholdWatch::look(Instant now) {
    std::shared_ptr<Lines const> lines;
    {
        std::scoped_lock const guard(m_mutex);
        lines = m_lines;
        m_isNew = false;
    }
    m_histories.begin(now.steady);
    std::vector<Condition> present;
    std::map<std::uint32_t, Known> known;
    for (Line const& line : *lines) {
        Known& about = known[line.ifIndex];
        if (auto const former = m_known.find(line.ifIndex); former != m_known.end())
            about = former->second;
        lookAt(line, about);
        for (std::size_t threshold = 0; threshold < kThresholds; ++threshold) {
            if (!about.crossed[threshold]) continue;
            Condition condition = line.condition;
            condition.key.kind = thresholdKind(threshold);
            condition.text = "limit " + std::to_string(line.limits[threshold]);
            present.push_back(std::move(condition));
        }
    }
    m_known.swap(known);
    m_list.compare(AlarmScope::Thresholds, present, now.steady, now);
}

void ThresholdWatch::lookAt(Line const& line, Known& known) {
    readGuarded(line.placed.boardIndex, "line counters", [&] {
        auto const table = line.placed.line->GetIntervalTable();
        if (table.get() == nullptr) return;
        LineRow row;
        m_histories.read(table, row);
        // In the middle of a second, the counts may not fit together; the next look sees them.
        if (row.isWhole) known.crossed = known.thresholds.look(line.limits, row);
    });
}

} // namespace kvloamd
