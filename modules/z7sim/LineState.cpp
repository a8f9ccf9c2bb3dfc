// SPDX-License-Identifier: BSD-2-Clause
#include "LineState.h"

#include <cstdlib>

#include "LineClocks.h"
#include "LineStatusDelivery.h"
#include "boardplatform/ds1_line.h"

namespace {

struct AlarmStatus {
    std::uint32_t alarm;
    DS1LineStatusEnum status;
};

constexpr std::uint32_t kFrameLosing =
    kDS1AlarmLossOfSignal | kDS1AlarmLossOfFrame | kDS1AlarmIndication;

/// The alarms that are a status as they are.
constexpr AlarmStatus kStatuses[] = {
    {kDS1AlarmRemote, DS1LineStatusRcvFarEndLOF},
    {kDS1AlarmSendingRemote, DS1LineStatusXmtFarEndLOF},
    {kDS1AlarmSendingIndication, DS1LineStatusXmtAIS},
    {kDS1AlarmLoopback, DS1LineStatusLoopbackState},
    {kDS1AlarmTimeSlot16, DS1LineStatusT16AIS},
    {kDS1AlarmRemoteMultiframe, DS1LineStatusRcvFarEndLOMF},
    {kDS1AlarmSendingRemoteMultiframe, DS1LineStatusXmtFarEndLOMF},
    {kDS1AlarmTestCode, DS1LineStatusRcvTestCode},
};

long clocksApart() {
    return LineClocks::inUse().system() - LineClocks::inUse().monotonic();
}

} // namespace

int lineStatusOf(std::uint32_t alarms, LinePerformance const& performance) {
    LineDefects const failures = performance.failures();
    // What follows from a defect that is no failure yet is not shown either.
    if ((alarms & kFrameLosing) != 0 && failures == LineDefects())
        alarms &= ~kDS1AlarmSendingRemote;
    int status = performance.unavailable() ? DS1LineStatusUnavailSigState : 0;
    if (failures.lossOfSignal) status |= DS1LineStatusLossOfSignal;
    if (failures.outOfFrame) status |= DS1LineStatusLossOfFrame;
    if (failures.alarmIndication) status |= DS1LineStatusRcvAIS;
    for (auto const& each : kStatuses)
        if ((alarms & each.alarm) != 0) status |= each.status;
    return status == 0 ? static_cast<int>(DS1LineStatusNoAlarm) : status;
}

LineState::LineState() : m_number(LineStatusDelivery::instance().reserve()) {}

LineState::Date LineState::Date::now() {
    return {LineClocks::inUse().system(), ::clocksApart()};
}

long LineState::Date::inUse() const {
    if (seconds == 0) return 0;
    // Read one after the other, the clocks seem to differ by a second at times.
    long const shift = ::clocksApart() - clocksApart;
    return std::labs(shift) <= 1 ? seconds : seconds + shift;
}

long LineState::lastChange() const {
    std::scoped_lock const guard(m_mutex);
    return m_changed.inUse();
}

long LineState::availabilityChange() const {
    std::scoped_lock const guard(m_mutex);
    return m_availabilityChanged.inUse();
}

void LineState::begin(std::uint32_t alarms, LinePerformance const& performance) {
    m_unavailable = performance.unavailable();
    m_status.store(lineStatusOf(alarms, performance), std::memory_order_relaxed);
}

void LineState::update(std::uint32_t alarms, LinePerformance const& performance) {
    int const now = lineStatusOf(alarms, performance);
    if (now == status()) return;
    {
        std::scoped_lock const guard(m_mutex);
        m_changed = Date::now();
        if (performance.unavailable() != m_unavailable)
            m_availabilityChanged = m_changed.secondsBefore(performance.decidedAfter());
    }
    m_unavailable = performance.unavailable();
    m_status.store(now, std::memory_order_relaxed);
    LineStatusDelivery::instance().post(m_number, static_cast<DS1LineStatusEnum>(now));
}
