// SPDX-License-Identifier: BSD-2-Clause
// The simulated event service: queueing, delivery, stop.
#include "simulator/events/EventService.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>

#include "simulator/base/ThreadStart.h"

namespace kvlsim {

std::string_view channelOf(std::uint32_t id) {
    switch (id >> 16) {
    case 3:
        return "FAULT";
    case 4:
    case 5:
        return "ADMIN";
    default:
        return {};
    }
}

EventService::Message EventService::messageFor(Announcement const& announcement) {
    Message message;
    message.id = announcement.id;
    if (announcement.channel) {
        message.setPayload(*announcement.channel);
    } else if (announcement.board) {
        message.setPayload(*announcement.board);
        if (channelOf(announcement.id) == "FAULT")
            message.setPayload(announcement.fault, sizeof(std::int32_t));
    }
    return message;
}

bool EventService::lose() {
    ++m_lost;
    bool const first = m_lostHere == 0;
    if (first) {
        m_queue.push_back({static_cast<std::uint32_t>(EventId::eventsLost), true, {}});
        ++m_announced;
    }
    m_queue.back().setPayload(++m_lostHere);
    return first;
}

std::uint64_t EventService::announce(Announcement const& announcement) {
    Message const message = messageFor(announcement);
    std::unique_lock lock(m_mutex);
    if (m_stopped) return m_announced;
    ensureThread();
    if (m_queue.size() < kMaxQueuedEvents) {
        m_lostHere = 0;
        m_queue.push_back(message);
        m_work.notify_one();
        return ++m_announced;
    }
    bool const report = lose();
    std::uint64_t const number = m_announced;
    lock.unlock();
    if (report)
        std::fprintf(stderr,
                     "kvlsim: %zu events wait for delivery; further ones are lost until a handler "
                     "returns\n",
                     kMaxQueuedEvents);
    return number;
}

bool EventService::waitDelivered(std::uint64_t number) {
    std::unique_lock lock(m_mutex);
    if (std::this_thread::get_id() == m_threadId) return false;
    m_progress.wait(lock, [&] { return m_delivered >= number || m_stopped; });
    return m_delivered >= number;
}

bool EventService::onDeliveryThread() {
    std::lock_guard const lock(m_mutex);
    return std::this_thread::get_id() == m_threadId;
}

std::uint64_t EventService::announced() {
    std::lock_guard const lock(m_mutex);
    return m_announced;
}

std::uint64_t EventService::delivered() {
    std::lock_guard const lock(m_mutex);
    return m_delivered;
}

std::uint64_t EventService::lost() {
    std::lock_guard const lock(m_mutex);
    return m_lost;
}

std::size_t EventService::startedConsumers() {
    std::lock_guard const lock(m_mutex);
    return m_consumers->size();
}

void EventService::start(std::shared_ptr<EventConsumer> const& consumer) {
    std::lock_guard const lock(m_mutex);
    if (consumer->started || consumer->closed) return;
    if (!m_stopped) ensureThread();
    consumer->started = true;
    consumer->startedAfter = m_announced;
    auto consumers = std::make_shared<Consumers>(*m_consumers);
    consumers->push_back(consumer);
    m_consumers = std::move(consumers);
}

void EventService::close(std::shared_ptr<EventConsumer> const& consumer) {
    std::unique_lock lock(m_mutex);
    consumer->closed = true;
    auto consumers = std::make_shared<Consumers>(*m_consumers);
    std::erase(*consumers, consumer);
    m_consumers = std::move(consumers);
    if (std::this_thread::get_id() == m_threadId) return; // from its own callback
    m_progress.wait(lock, [&] { return m_current != consumer.get(); });
}

void EventService::onProgress(std::function<void()> progress) {
    std::lock_guard const lock(m_mutex);
    m_onProgress = std::move(progress);
}

void EventService::stop() {
    std::unique_lock lock(m_mutex);
    m_stopped = true;
    m_queue.clear();
    m_work.notify_all();
    m_progress.notify_all();
    if (!m_thread.joinable()) return;
    std::thread thread = std::move(m_thread);
    lock.unlock();
    if (thread.get_id() == std::this_thread::get_id())
        thread.detach(); // a handler ends the process: it cannot wait for itself
    else
        thread.join();
}

void EventService::ensureThread() {
    if (m_thread.joinable()) return;
    // Registered now, so that the thread has ended before objects that are older than it are
    // destroyed: it may call their handlers.
    static pid_t const process = getpid();
    static EventService* const service = this;
    std::atexit([] {
        // A child made by fork() has no such thread, and perhaps a lock that nobody will release.
        if (getpid() == process) service->stop();
    });
    m_thread = startThread("kvlsim-events", [this] { run(); });
    m_threadId = m_thread.get_id();
}

void EventService::run() {
    std::unique_lock lock(m_mutex);
    while (true) {
        m_work.wait(lock, [this] { return m_stopped || !m_queue.empty(); });
        if (m_stopped) return;
        Message message = m_queue.front();
        m_queue.pop_front();
        deliver(lock, message, m_delivered + 1);
        ++m_delivered;
        m_progress.notify_all();
        if (m_onProgress) m_onProgress();
    }
}

void EventService::deliver(std::unique_lock<std::mutex>& lock, Message& message,
                           std::uint64_t number) {
    std::string_view const channel = channelOf(message.id);
    std::shared_ptr<Consumers const> const consumers = m_consumers;
    for (auto const& consumer : *consumers) {
        if (consumer->channel != channel || consumer->startedAfter >= number) continue;
        m_current = consumer.get();
        for (auto const& filter : consumer->filters) {
            if (m_stopped || consumer->closed) break;
            if (filter.id != message.id || filter.enabled == 0 || filter.handler == nullptr)
                continue;
            lock.unlock();
            // Each handler gets a copy of the message, because a handler may change it.
            auto payload = message.payload;
            AdminCallbackMsg callback{};
            callback.id = message.id;
            callback.payload = message.hasPayload ? payload.data() : nullptr;
            filter.handler->HandleEvent(&callback, filter.context);
            lock.lock();
        }
        m_current = nullptr;
        m_progress.notify_all();
    }
}

} // namespace kvlsim
