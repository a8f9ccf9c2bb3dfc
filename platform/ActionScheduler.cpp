// SPDX-License-Identifier: BSD-2-Clause
#include "platform/ActionScheduler.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <utility>

namespace {

/// How many entries ahead a pass looks: some hundred nanoseconds where actions are short.
constexpr std::ptrdiff_t kAhead = 12;

/// Where an action's first fields are: three cache lines have an interval table's running interval.
/// Nothing is read, so that an object that is smaller, or gone, does no harm.
void fetch(Schedulable const* target) {
    auto const address = reinterpret_cast<std::uintptr_t>(target);
    for (std::uintptr_t offset = 0; offset <= 128; offset += 64)
        __builtin_prefetch(reinterpret_cast<void const*>(address + offset), 1);
}

bool earlier(SchedItem const& a, SchedItem const& b) {
    return a.due < b.due;
}

} // namespace

ActionScheduler::~ActionScheduler() = default;

int ActionScheduler::AddPeriodic(Schedulable* target, long period) {
    lock_list();
    bool const known = check_on_list(target);
    if (!known) put_item_on_list(target, period, 0);
    unlock_list();
    return known ? 1 : 0;
}

int ActionScheduler::AddOneTimeAction(Schedulable* target, long when) {
    lock_list();
    bool const known = check_on_list(target);
    if (!known) put_item_on_list(target, 0, when);
    unlock_list();
    return known ? 1 : 0;
}

bool ActionScheduler::check_on_list(Schedulable* target) {
    return find_item_on_list(target) != m_list.end();
}

ActionScheduler::List::iterator ActionScheduler::find_item_on_list(Schedulable* target) {
    return std::find_if(m_list.begin(), m_list.end(),
                        [=](SchedItem const& item) { return item.target == target; });
}

void ActionScheduler::insert(SchedItem const& item) {
    m_list.insert(firstAfter(item.due), item);
}

void ActionScheduler::run_pass(long now) {
    if (now >= m_nextWakeUp)
        callDue(now);
    else if (!m_list.empty())
        m_nextWakeUp = m_list.front().due;
    if (m_list.empty()) m_nextWakeUp = kNever;
}

ActionScheduler::List::iterator ActionScheduler::firstAfter(long time) {
    return std::upper_bound(m_list.begin(), m_list.end(), time,
                            [](long limit, SchedItem const& item) { return limit < item.due; });
}

void ActionScheduler::callDue(long now) {
    // Thousands of entries of one period come by every second: they keep their places.
    auto const notDue = firstAfter(now);
    auto kept = m_list.begin();
    long next = kNever;
    long latest = std::numeric_limits<long>::min();
    bool inOrder = true;
    for (auto entry = m_list.begin(); entry != notDue; ++entry) {
        // Targets lie all over memory; the next ones are fetched while this one works.
        if (notDue - entry > kAhead) fetch(entry[kAhead].target);
        entry->target->ScheduledAction();
        if (entry->period <= 0) continue;
        entry->due = add_saturated(entry->due, entry->period);
        next = std::min(next, entry->due);
        inOrder = inOrder && latest <= entry->due;
        latest = std::max(latest, entry->due);
        if (kept != entry) *kept = *entry;
        ++kept;
    }
    auto const rest = m_list.erase(kept, notDue);
    if (!inOrder) std::stable_sort(m_list.begin(), rest, earlier);
    if (rest != m_list.end() && latest >= rest->due) {
        // Behind those that are due at the same time and were not called.
        auto const called = std::rotate(m_list.begin(), rest, m_list.end());
        std::inplace_merge(m_list.begin(), called, m_list.end(), earlier);
    }
    m_nextWakeUp = next;
}

long ActionScheduler::add_saturated(long time, long seconds) {
    long sum = 0;
    if (!__builtin_add_overflow(time, seconds, &sum)) return sum;
    return seconds < 0 ? std::numeric_limits<long>::min() : std::numeric_limits<long>::max();
}
