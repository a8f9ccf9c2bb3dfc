// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/AlarmThread.h"

#include <utility>

namespace kvloamd {

AlarmThread::AlarmThread(Advance advance)
    : m_advance(std::move(advance)), m_thread([this] { run(); }) {}

AlarmThread::~AlarmThread() {
    {
        std::scoped_lock const guard(m_mutex);
        m_stop = true;
    }
    m_wake.notify_one();
    m_thread.join();
}

void AlarmThread::wake() {
    {
        std::scoped_lock const guard(m_mutex);
        m_isWoken = true;
    }
    m_wake.notify_one();
}

void AlarmThread::run() {
    Clock::time_point next = Clock::time_point::max();
    Clock::time_point last; // long ago
    std::unique_lock lock(m_mutex);
    for (;;) {
        m_wake.wait_until(lock, next, [this] { return m_stop || m_isWoken; });
        m_wake.wait_until(lock, last + kPause, [this] { return m_stop; });
        if (m_stop) return;
        m_isWoken = false;
        lock.unlock();
        last = Clock::now();
        next = m_advance();
        lock.lock();
    }
}

} // namespace kvloamd
