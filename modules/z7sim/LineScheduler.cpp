// SPDX-License-Identifier: BSD-2-Clause
#include "LineScheduler.h"

#include <cerrno>
#include <ctime>

#include <algorithm>
#include <mutex>

std::atomic<LineScheduler*> LineScheduler::s_instance{nullptr};
std::atomic<long> LineScheduler::s_time{0};
std::atomic<std::uint64_t> LineScheduler::s_passNumber{0};

LineScheduler& LineScheduler::instance() {
    static std::mutex mutex;
    if (LineScheduler* const made = s_instance.load(std::memory_order_acquire)) return *made;
    std::scoped_lock const guard(mutex);
    if (s_instance.load(std::memory_order_relaxed) == nullptr) {
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC, &now);
        s_time.store(static_cast<long>(now.tv_sec), std::memory_order_relaxed);
        auto* const scheduler = new LineScheduler;
        scheduler->Start();
        s_instance.store(scheduler, std::memory_order_release);
    }
    return *s_instance.load(std::memory_order_relaxed);
}

LineScheduler::LineScheduler() : ActionScheduler_pthread(time) {}

LineScheduler::~LineScheduler() = default;

void LineScheduler::Run() {
    timespec next{};
    clock_gettime(CLOCK_MONOTONIC, &next);
    for (;;) {
        // A pass stays at the same moment of its second; those whose moment has passed are left
        // out.
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC, &now);
        bool const missed = now.tv_nsec >= next.tv_nsec;
        next.tv_sec = std::max(next.tv_sec + 1, now.tv_sec + (missed ? 1 : 0));
        while (clock_nanosleep(CLOCK_MONOTONIC, TIMER_ABSTIME, &next, nullptr) == EINTR) {
        }
        pass(static_cast<long>(next.tv_sec));
    }
}

void LineScheduler::pass(long time) {
    lock_list();
    s_time.store(time, std::memory_order_relaxed);
    s_passNumber.store(passNumber() + 1, std::memory_order_relaxed);
    // Everything is due: entries have a period of a second, and are a second older at the least.
    m_nextWakeUp = std::min(m_nextWakeUp, time);
    run_pass(time);
    unlock_list();
}
