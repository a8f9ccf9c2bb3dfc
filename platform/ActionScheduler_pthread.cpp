// SPDX-License-Identifier: BSD-2-Clause
#include "platform/ActionScheduler_pthread.h"

#include <cstdio>

#include "platform/ActionList.h"

ActionScheduler_pthread* ActionScheduler_pthread::s_actionScheduler = nullptr;

ActionScheduler* ActionScheduler_pthread::GetScheduler() {
    if (s_actionScheduler == nullptr) s_actionScheduler = new ActionScheduler_pthread;
    return s_actionScheduler;
}

long ActionScheduler_pthread::now() {
    timespec time{};
    clock_gettime(CLOCK_REALTIME, &time);
    return static_cast<long>(time.tv_sec);
}

ActionScheduler_pthread::ActionScheduler_pthread(Clock clock)
    : KVLThread_pthread(this), m_clock(clock) {
    pthread_mutexattr_init(&m_listMutexAttributes);
    pthread_mutexattr_settype(&m_listMutexAttributes, PTHREAD_MUTEX_NORMAL);
    pthread_mutex_init(&m_listMutex, &m_listMutexAttributes);
    pthread_condattr_init(&m_listChangedAttributes);
    pthread_cond_init(&m_listChanged, &m_listChangedAttributes);
    pthread_condattr_init(&m_startedAttributes);
    pthread_cond_init(&m_started, &m_startedAttributes);
}

ActionScheduler_pthread::ActionScheduler_pthread() : ActionScheduler_pthread(now) {
    ActionScheduler_pthread::lock_list();
    Start();
    while (!m_running && HasThread())
        pthread_cond_wait(&m_started, &m_listMutex);
    ActionScheduler_pthread::unlock_list();
}

ActionScheduler_pthread::~ActionScheduler_pthread() {
    pthread_mutexattr_destroy(&m_listMutexAttributes);
    pthread_mutex_destroy(&m_listMutex);
    pthread_condattr_destroy(&m_listChangedAttributes);
    pthread_cond_destroy(&m_listChanged);
}

void ActionScheduler_pthread::Run() {
    lock_list();
    m_running = true;
    pthread_cond_signal(&m_started);
    for (;;) {
        waitForChange();
        run_pass(m_clock());
    }
}

void ActionScheduler_pthread::waitForChange() {
    if (m_nextWakeUp == kNever) {
        pthread_cond_wait(&m_listChanged, &m_listMutex);
        return;
    }
    m_deadline.tv_sec = static_cast<std::time_t>(m_nextWakeUp);
    m_deadline.tv_nsec = 0;
    pthread_cond_timedwait(&m_listChanged, &m_listMutex, &m_deadline);
}

int ActionScheduler_pthread::Remove(Schedulable* target) {
    ListLock const lock(*this);
    if (!check_on_list(target)) return 1;
    m_list->erase(target);
    pthread_cond_signal(&m_listChanged);
    return 0;
}

int ActionScheduler_pthread::ChangePeriod(Schedulable* target, long period) {
    ListLock const lock(*this);
    SchedItem const* const item = find_item_on_list(target);
    if (item == nullptr || item->period < 1 || item->period == period) return 1;
    long const difference = KVL::add_saturated(period, -item->period);
    m_list->change(target, KVL::add_saturated(item->due, difference), period);
    pthread_cond_signal(&m_listChanged);
    return 0;
}

int ActionScheduler_pthread::put_item_on_list(Schedulable* target, long period, long when) {
    long const due = period >= 1 ? KVL::add_saturated(m_clock(), period) : when;
    m_list->insert({target, due, period});
    if (due < m_nextWakeUp) pthread_cond_signal(&m_listChanged);
    return 0;
}

int ActionScheduler_pthread::remove_item_from_list(SchedItem* /*item*/) {
    return 0;
}

int ActionScheduler_pthread::lock_list() {
    if (int const result = pthread_mutex_lock(&m_listMutex); result != 0)
        std::printf("pthread_mutex_lock error: %d\n", result);
    return 0;
}

int ActionScheduler_pthread::unlock_list() {
    if (int const result = pthread_mutex_unlock(&m_listMutex); result != 0)
        std::printf("pthread_mutex_unlock error: %d\n", result);
    return 0;
}
