// SPDX-License-Identifier: BSD-2-Clause
#include "board/DS1IntervalTable.h"

#include <cstddef>

#include "core/ReferenceTable.h"
#include "platform/ActionScheduler_pthread.h"

namespace {

/// Whether `table` is complete: it has handles then. The dynamic type does not show that; while the
/// members of the concrete table are being constructed or destroyed, it is that table's already.
/// Nothing of the object is read, and the reference table's lock orders what its constructors wrote
/// before the tick.
bool hasHandle(Schedulable* table) {
    Object* const object = static_cast<DS1IntervalTable*>(table);
    return ReferenceTable::get_instance()->ReferenceTable::get_refinfo(object) != nullptr;
}

} // namespace

DS1IntervalTable::DS1IntervalTable() : Object(Adopt(), new KVLLockable_pthread(RecursiveLock)) {
    // Every tick looks into the reference table, which must be made before another thread does so.
    ReferenceTable::get_instance();
    ActionScheduler_pthread::GetScheduler()->AddPeriodicWhileReady(this, 1, hasHandle);
}

DS1IntervalTable::~DS1IntervalTable() {
    ActionScheduler_pthread::GetScheduler()->Remove(this);
}

int DS1IntervalTable::GetTimeElapsed() {
    return m_timeElapsed;
}

int DS1IntervalTable::GetValidIntervals() {
    // The ring is marked full before its positions wrap around; so the mark is read after them.
    int const closed = m_next - m_oldest;
    return m_wrapped.load(std::memory_order_relaxed) ? kIntervals : closed;
}

int DS1IntervalTable::GetErrorSeconds(int n) {
    return read(&DS1Interval::ErrorSeconds, n);
}

int DS1IntervalTable::GetSeverelyErrorSeconds(int n) {
    return read(&DS1Interval::SeverelyErrorSeconds, n);
}

int DS1IntervalTable::GetSeverelyErrorFramingSeconds(int n) {
    return read(&DS1Interval::SeverelyErrorFramingSeconds, n);
}

int DS1IntervalTable::GetUnavailableSeconds(int n) {
    return read(&DS1Interval::UnavailableSeconds, n);
}

int DS1IntervalTable::GetPathCodingViolations(int n) {
    return read(&DS1Interval::PathCodingViolations, n);
}

int DS1IntervalTable::GetLineErrorSeconds(int n) {
    return read(&DS1Interval::LineErrorSeconds, n);
}

int DS1IntervalTable::GetBurstyErrorSeconds(int n) {
    return read(&DS1Interval::BurstyErrorSeconds, n);
}

int DS1IntervalTable::GetLineCodeViolations(int n) {
    return read(&DS1Interval::LineCodeViolations, n);
}

int DS1IntervalTable::ScheduledAction() {
    if (!hasHandle(this)) return 0;
    if (m_timeElapsed < kIntervalLength)
        CollectSecond();
    else
        CloseInterval();
    return 0;
}

int DS1IntervalTable::GetTrueIndex(int n) {
    return (m_next - n + kIntervals) % kIntervals;
}

int DS1IntervalTable::ArchiveInterval(DS1Interval interval) {
    m_ring[static_cast<std::size_t>(m_next)] = interval;
    int const next = (m_next + 1) % kIntervals;
    bool const full = next == m_oldest;
    if (full) m_wrapped.store(true, std::memory_order_relaxed);
    m_next = next;
    m_timeElapsed = 0;
    if (full) {
        m_oldest = (m_next + 1) % kIntervals;
        m_ring[static_cast<std::size_t>(m_next)] = DS1Interval();
    }
    return 0;
}

DS1Interval* DS1IntervalTable::interval(int n) {
    if (n == 0) return &m_current;
    int const index = GetTrueIndex(n);
    return index < 0 || index >= kIntervals ? nullptr : &m_ring[static_cast<std::size_t>(index)];
}

int DS1IntervalTable::read(DS1Counter DS1Interval::*counter, int n) {
    DS1Interval const* const record = interval(n);
    return record == nullptr ? 0 : static_cast<int>(record->*counter);
}
