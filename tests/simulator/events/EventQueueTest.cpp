// SPDX-License-Identifier: BSD-2-Clause
// The event service's queue while no events are delivered.
#include <cstdint>
#include <cstring>
#include <future>
#include <memory>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/events/EventService.h"

namespace {

using namespace kvlsim;
using testing::SizeIs;

constexpr auto kStarted = static_cast<std::uint32_t>(EventId::boardStarted);
constexpr auto kLost = static_cast<std::uint32_t>(EventId::eventsLost);

/// A `Holder` is a handler that blocks the delivery thread in the first message, and records all
/// later ones.
class Holder final : public VqxEventService::CEventHandlerAdaptor {
  public:
    struct Heard {
        std::uint32_t id = 0;
        std::uint32_t value = 0;
        bool operator==(Heard const&) const = default;
    };

    int HandleEvent(AdminCallbackMsg* message, void*) override {
        if (!m_held) {
            m_held = true;
            inside.set_value();
            letGo.get_future().wait();
            return 1;
        }
        Heard one{message->id, 0};
        std::memcpy(&one.value, message->payload, sizeof one.value);
        heard.push_back(one);
        return 1;
    }

    std::promise<void> inside;
    std::promise<void> letGo;
    std::vector<Heard> heard; ///< the delivery thread's, until the events are drained

  private:
    bool m_held = false;
};

class EventQueueTest : public testing::Test {
  protected:
    EventQueueTest() {
        consumer->channel = "ADMIN";
        consumer->filters = {{&holder, nullptr, kStarted, 1}, {&holder, nullptr, kLost, 1}};
        service.start(consumer);
        announce(0);
        holder.inside.get_future().wait();
    }
    ~EventQueueTest() override { service.close(consumer); }

    std::uint64_t announce(std::size_t board) {
        return service.announce({kStarted, static_cast<std::int32_t>(board)});
    }
    void fill() {
        for (std::size_t i = 1; i <= kMaxQueuedEvents; ++i)
            announce(i);
    }
    void drain() {
        holder.letGo.set_value();
        service.waitDelivered(service.announced());
    }

    // Never destroyed, as in a platform: it is stopped when the process ends.
    static EventService& made() {
        static auto* const one = new EventService;
        return *one;
    }
    EventService& service = made();
    std::uint64_t const before = service.lost();
    Holder holder;
    std::shared_ptr<EventConsumer> consumer = std::make_shared<EventConsumer>();
};

TEST_F(EventQueueTest, FullQueueLosesNothing) {
    fill();
    EXPECT_EQ(service.lost() - before, 0U);
    drain();
    EXPECT_THAT(holder.heard, SizeIs(kMaxQueuedEvents));
}

TEST_F(EventQueueTest, WhatIsLostIsCountedAndAnnouncedWhereItIsMissing) {
    fill();
    testing::internal::CaptureStderr();
    for (int i = 0; i < 3; ++i)
        announce(70000);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "kvlsim: 65536 events wait for delivery; further ones are lost until a handler "
              "returns\n");
    EXPECT_EQ(service.lost() - before, 3U);
    drain();
    ASSERT_THAT(holder.heard, SizeIs(kMaxQueuedEvents + 1));
    EXPECT_EQ(holder.heard[kMaxQueuedEvents - 1], (Holder::Heard{kStarted, kMaxQueuedEvents}));
    EXPECT_EQ(holder.heard.back(), (Holder::Heard{kLost, 3}));
}

TEST_F(EventQueueTest, EventsAfterALossAreDeliveredBehindIt) {
    fill();
    announce(70000);
    drain();
    service.waitDelivered(announce(5));
    ASSERT_THAT(holder.heard, SizeIs(kMaxQueuedEvents + 2));
    EXPECT_EQ(holder.heard[kMaxQueuedEvents], (Holder::Heard{kLost, 1}));
    EXPECT_EQ(holder.heard.back(), (Holder::Heard{kStarted, 5}));
}

TEST_F(EventQueueTest, WaitingForALostEventWaitsForTheAnnouncementOfTheLoss) {
    fill();
    std::uint64_t const number = announce(70000);
    EXPECT_EQ(announce(70001), number);
    holder.letGo.set_value();
    EXPECT_TRUE(service.waitDelivered(number));
    EXPECT_EQ(holder.heard.back(), (Holder::Heard{kLost, 2}));
}

} // namespace
