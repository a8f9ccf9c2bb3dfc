// SPDX-License-Identifier: BSD-2-Clause
#include "platform/ActionScheduler.h"

#include "platform/ActionList.h"

ActionScheduler::ActionScheduler() : m_list(std::make_unique<KVL::ActionList>()) {}

ActionScheduler::~ActionScheduler() = default;

int ActionScheduler::AddPeriodic(Schedulable* target, long period) {
    ListLock const lock(*this);
    if (check_on_list(target)) return 1;
    put_item_on_list(target, period, 0);
    return 0;
}

int ActionScheduler::AddPeriodicWhileReady(Schedulable* target, long period,
                                           bool (*ready)(Schedulable*)) {
    ListLock const lock(*this);
    if (check_on_list(target)) return 1;
    put_item_on_list(target, period, 0);
    m_list->setReady(target, ready);
    return 0;
}

int ActionScheduler::AddOneTimeAction(Schedulable* target, long when) {
    ListLock const lock(*this);
    if (check_on_list(target)) return 1;
    put_item_on_list(target, 0, when);
    return 0;
}

bool ActionScheduler::check_on_list(Schedulable* target) {
    return find_item_on_list(target) != nullptr;
}

SchedItem* ActionScheduler::find_item_on_list(Schedulable* target) {
    return m_list->find(target);
}

void ActionScheduler::run_pass(long now) {
    if (now >= m_nextWakeUp)
        m_nextWakeUp = m_list->callDue(now, kNever);
    else if (!m_list->empty())
        m_nextWakeUp = m_list->firstDue();
    if (m_list->empty()) m_nextWakeUp = kNever;
}
