// SPDX-License-Identifier: BSD-2-Clause
// The simulated event service: one queue, one delivery thread, the consumers of this process.
#pragma once

#include <array>
#include <condition_variable>
#include <cstdint>
#include <cstring>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "boardplatform/isdn_channels.h"
#include "boardplatform/vqx_event_service.h"

namespace kvlsim {

/// The identifiers of administrative and fault events.
enum class EventId : std::uint32_t {
    faultRaised = 0x30001,
    faultCleared = 0x30002,
    systemStarted = 0x40001,
    systemStopped = 0x40002,
    systemStartPending = 0x40003,
    systemStopPending = 0x40004,
    boardRemoved = 0x40005,
    boardFailed = 0x40006,
    boardStarted = 0x40007,
    boardStopped = 0x40008,
    boardStartPending = 0x40009,
    boardStopPending = 0x4000A,
    eventsLost = 0x50003, ///< events were lost here; the payload is their number, 32 bits
};

/// The most events that wait for delivery. Further ones are lost.
inline constexpr std::size_t kMaxQueuedEvents = 65536;

/// The channel that carries an identifier: "ADMIN" the 0x4.... and the 0x5...., "FAULT" the
/// 0x3....; else empty.
std::string_view channelOf(std::uint32_t id);

/// An `Announcement` is an event before it is queued.
struct Announcement {
    std::uint32_t id = 0;
    std::optional<std::int32_t> board;
    std::uint16_t fault = 0;                    ///< carried by the fault channel's messages only
    std::optional<ISDNChannelMsg> channel = {}; ///< the payload in the place of board and fault
};

/// An `EventConsumer` is one subscriber. Its fields are guarded by the service's lock, except those
/// that never change.
struct EventConsumer {
    std::string channel;
    std::vector<VqxEventService::AdminConsumer::FilterCallbackAssoc> filters;
    std::uint64_t startedAfter = 0; ///< number of the last event announced before it started
    bool started = false;
    bool closed = false;
};

/// An `EventService` is the queue of events and the thread that delivers them; thread-safe.
/// Handlers run on the delivery thread, one message at a time, without any lock of the service
/// held.
class EventService {
  public:
    /// Queues an event; returns the number of the last event in the queue. Numbers count from 1.
    /// When the queue is full the event is lost: one `EventId::eventsLost` takes the place of all
    /// that are lost one after the other, and the first of them is reported on standard error.
    std::uint64_t announce(Announcement const& announcement);

    /// Waits until event `number` and all before it are delivered. Returns false when that will not
    /// happen: called on the delivery thread, or delivery has been stopped.
    bool waitDelivered(std::uint64_t number);
    bool onDeliveryThread();

    std::uint64_t announced();
    std::uint64_t delivered();
    /// How many events were lost because the queue was full.
    std::uint64_t lost();
    std::size_t startedConsumers();

    /// Delivers to this consumer all events announced from now on. Throws std::system_error when
    /// the delivery thread cannot be made.
    void start(std::shared_ptr<EventConsumer> const& consumer);
    /// Ends delivery to this consumer; waits for a delivery under way on another thread.
    void close(std::shared_ptr<EventConsumer> const& consumer);

    /// Called after each delivered event on the delivery thread, under the service's lock; an empty
    /// function takes it away.
    void onProgress(std::function<void()> progress);

    /// Stops and joins the delivery thread; what is still queued is dropped.
    void stop();

  private:
    using Consumers = std::vector<std::shared_ptr<EventConsumer>>;

    struct Message {
        std::uint32_t id = 0;
        bool hasPayload = false;
        std::array<unsigned char, sizeof(ISDNChannelMsg)> payload{};

        template <typename Value>
        void setPayload(Value const& value, std::size_t offset = 0) {
            hasPayload = true;
            std::memcpy(payload.data() + offset, &value, sizeof value);
        }
    };

    static Message messageFor(Announcement const& announcement);
    /// Counts one lost event; returns whether it is the first since the queue had room.
    bool lose();

    void ensureThread();
    void run();
    void deliver(std::unique_lock<std::mutex>& lock, Message& message, std::uint64_t number);

    std::mutex m_mutex;
    std::condition_variable m_work;     ///< a message is queued, or stop
    std::condition_variable m_progress; ///< a delivery or a consumer has ended, or stop
    std::deque<Message> m_queue;
    std::uint64_t m_announced = 0;
    std::uint64_t m_delivered = 0;
    std::uint64_t m_lost = 0;
    std::uint32_t m_lostHere = 0; ///< since the queue had room; the last message says so unless 0
    std::shared_ptr<Consumers const> m_consumers = std::make_shared<Consumers const>();
    EventConsumer const* m_current = nullptr; ///< whose handler may be running
    std::function<void()> m_onProgress;
    std::thread m_thread;
    std::thread::id m_threadId;
    bool m_stopped = false;
};

} // namespace kvlsim
