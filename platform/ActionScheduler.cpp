// SPDX-License-Identifier: BSD-2-Clause
#include "platform/ActionScheduler.h"

#include <algorithm>
#include <limits>
#include <utility>

ActionScheduler::~ActionScheduler() {
    for (auto const& entry : m_list)
        delete entry.second;
}

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
                        [=](auto const& entry) { return entry.second->target == target; });
}

void ActionScheduler::insert(SchedItem* item) {
    m_list.emplace(item->due, item);
}

void ActionScheduler::run_pass(long now) {
    if (now >= m_nextWakeUp)
        callDue(now);
    else if (!m_list.empty())
        m_nextWakeUp = m_list.begin()->first;
    if (m_list.empty()) m_nextWakeUp = kNever;
}

void ActionScheduler::callDue(long now) {
    long next = kNever;
    while (!m_list.empty() && m_list.begin()->first <= now) {
        SchedItem* const item = m_list.begin()->second;
        item->target->ScheduledAction();
        // The list's nodes are used again: thousands of entries come by every second.
        auto node = m_list.extract(m_list.begin());
        if (item->period <= 0) {
            delete item;
            continue;
        }
        item->due = add_saturated(item->due, item->period);
        node.key() = item->due;
        next = std::min(next, item->due);
        m_called.push_back(std::move(node));
    }
    for (auto& node : m_called) {
        bool const last = m_list.empty() || m_list.rbegin()->first <= node.key();
        if (last)
            m_list.insert(m_list.end(), std::move(node));
        else
            m_list.insert(std::move(node));
    }
    m_called.clear();
    m_nextWakeUp = next;
}

long ActionScheduler::add_saturated(long time, long seconds) {
    long sum = 0;
    if (!__builtin_add_overflow(time, seconds, &sum)) return sum;
    return seconds < 0 ? std::numeric_limits<long>::min() : std::numeric_limits<long>::max();
}
