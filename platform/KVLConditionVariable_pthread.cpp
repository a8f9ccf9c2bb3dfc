// SPDX-License-Identifier: BSD-2-Clause
#include "platform/KVLConditionVariable_pthread.h"

#include <sys/time.h>

#include <cerrno>
#include <ctime>
#include <limits>

KVLConditionVariable_pthread::KVLConditionVariable_pthread() {
    pthread_mutex_init(&m_mutex, nullptr);
    pthread_cond_init(&m_condition, nullptr);
}

KVLConditionVariable_pthread::~KVLConditionVariable_pthread() {
    pthread_cond_destroy(&m_condition);
    pthread_mutex_destroy(&m_mutex);
}

void KVLConditionVariable_pthread::grab(int /*reserved*/) {
    pthread_mutex_lock(&m_mutex);
}

void KVLConditionVariable_pthread::release() {
    pthread_mutex_unlock(&m_mutex);
}

void KVLConditionVariable_pthread::wait(int seconds) {
    if (seconds < 1) {
        pthread_cond_wait(&m_condition, &m_mutex);
        return;
    }
    timeval now{};
    gettimeofday(&now, nullptr);
    // A 32-bit time_t could wrap into the past: the deadline is its last second at most.
    auto const latest = std::numeric_limits<std::time_t>::max();
    timespec deadline{};
    deadline.tv_sec = now.tv_sec > latest - seconds ? latest : now.tv_sec + seconds;
    if (pthread_cond_timedwait(&m_condition, &m_mutex, &deadline) == ETIMEDOUT)
        throw WaitTimedOutException();
}

void KVLConditionVariable_pthread::notify() {
    pthread_mutex_lock(&m_mutex);
    pthread_cond_signal(&m_condition);
    pthread_mutex_unlock(&m_mutex);
}

void KVLConditionVariable_pthread::notify_all() {
    pthread_mutex_lock(&m_mutex);
    pthread_cond_broadcast(&m_condition);
    pthread_mutex_unlock(&m_mutex);
}
