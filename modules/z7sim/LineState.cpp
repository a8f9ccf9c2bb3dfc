// SPDX-License-Identifier: BSD-2-Clause
#include "LineState.h"

#include <ctime>

#include "LineStatusDelivery.h"
#include "boardplatform/ds1_line.h"

namespace {

struct AlarmStatus {
    std::uint32_t alarm;
    DS1LineStatusEnum status;
};

constexpr AlarmStatus kStatuses[] = {
    {kDS1AlarmLossOfSignal, DS1LineStatusLossOfSignal},
    {kDS1AlarmLossOfFrame, DS1LineStatusLossOfFrame},
    {kDS1AlarmIndication, DS1LineStatusRcvAIS},
    {kDS1AlarmRemote, DS1LineStatusRcvFarEndLOF},
    {kDS1AlarmSendingRemote, DS1LineStatusXmtFarEndLOF},
    {kDS1AlarmSendingIndication, DS1LineStatusXmtAIS},
    {kDS1AlarmLoopback, DS1LineStatusLoopbackState},
    {kDS1AlarmTimeSlot16, DS1LineStatusT16AIS},
    {kDS1AlarmRemoteMultiframe, DS1LineStatusRcvFarEndLOMF},
    {kDS1AlarmSendingRemoteMultiframe, DS1LineStatusXmtFarEndLOMF},
    {kDS1AlarmTestCode, DS1LineStatusRcvTestCode},
};

} // namespace

int lineStatusOf(std::uint32_t alarms, bool unavailable) {
    int status = unavailable ? DS1LineStatusUnavailSigState : 0;
    for (auto const& each : kStatuses)
        if ((alarms & each.alarm) != 0) status |= each.status;
    return status == 0 ? static_cast<int>(DS1LineStatusNoAlarm) : status;
}

void LineState::begin(std::uint32_t alarms, bool unavailable) {
    m_status.store(lineStatusOf(alarms, unavailable), std::memory_order_relaxed);
}

void LineState::update(std::uint32_t alarms, bool unavailable) {
    int const now = lineStatusOf(alarms, unavailable);
    if (now == status()) return;
    m_lastChange.store(static_cast<long>(std::time(nullptr)), std::memory_order_relaxed);
    m_status.store(now, std::memory_order_relaxed);
    LineStatusDelivery::instance().post(m_number, m_line, static_cast<DS1LineStatusEnum>(now));
}
