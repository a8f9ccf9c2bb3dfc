// SPDX-License-Identifier: BSD-2-Clause
// The simulated event service, through the platform's consumer: order, filters, ends of consumers.
#include "boardplatform/vqx_event_service.h"

#include <array>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <functional>
#include <future>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/exports/Control.h"

namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::IsEmpty;
using VqxEventService::VqxAdminConsumer;
using Filter = VqxEventService::AdminConsumer::FilterCallbackAssoc;

/// A `Seen` is one delivery as a handler saw it.
struct Seen {
    std::uint32_t id = 0;
    std::optional<std::int32_t> board;
    void* context = nullptr;

    bool operator==(Seen const& other) const { return id == other.id && board == other.board; }
};

void PrintTo(Seen const& seen, std::ostream* out) {
    *out << std::hex << seen.id << " board " << std::dec << seen.board.value_or(-1);
}

/// A `Recorder` is a handler that records its deliveries.
class Recorder final : public VqxEventService::CEventHandlerAdaptor {
  public:
    int HandleEvent(AdminCallbackMsg* message, void* context) override {
        Seen seen{message->id, std::nullopt, context};
        if (message->payload != nullptr) {
            std::int32_t board = 0;
            std::memcpy(&board, message->payload, sizeof board);
            seen.board = board;
            std::memcpy(&lastFault, static_cast<char*>(message->payload) + 4, sizeof lastFault);
        }
        lastThread = std::this_thread::get_id();
        {
            std::lock_guard const lock(m_mutex);
            m_seen.push_back(seen);
        }
        if (react) react(message);
        return 1;
    }

    std::vector<Seen> seen() {
        std::lock_guard const lock(m_mutex);
        return m_seen;
    }

    std::function<void(AdminCallbackMsg*)> react; ///< set before the first event
    std::uint16_t lastFault = 0;
    std::thread::id lastThread;

  private:
    std::mutex m_mutex;
    std::vector<Seen> m_seen;
};

/// A `Gate` is opened by one thread while others wait for it.
class Gate {
  public:
    void open() {
        std::lock_guard const lock(m_mutex);
        m_open = true;
        m_opened.notify_all();
    }
    void pass() {
        std::unique_lock lock(m_mutex);
        m_opened.wait(lock, [this] { return m_open; });
    }

  private:
    std::mutex m_mutex;
    std::condition_variable m_opened;
    bool m_open = false;
};

class EventServiceTest : public testing::Test {
  protected:
    EventServiceTest() {
        kvlsim::loadChassis("boards:\n"
                            "  - {handle: 5, attributes: {SERIAL_NUMBER: \"S5\"}}\n"
                            "  - {handle: 6, attributes: {SERIAL_NUMBER: \"S6\"}}\n");
    }

    static std::unique_ptr<VqxAdminConsumer> consumer(char const* channel,
                                                      std::vector<Filter> filters) {
        auto made = std::make_unique<VqxAdminConsumer>(
            channel, L"Test", filters.data(), static_cast<int>(filters.size()), nullptr, 0);
        return made;
    }

    std::unique_ptr<VqxAdminConsumer> started(char const* channel, std::vector<Filter> filters) {
        auto made = consumer(channel, std::move(filters));
        EXPECT_EQ(made->Start(), 0);
        return made;
    }

    static void announce(std::uint32_t id, std::optional<std::int32_t> board = {}) {
        json command = {{"command", "event"}, {"id", id}};
        if (board) command["board"] = *board;
        json const reply = kvlsim::execute(command);
        ASSERT_EQ(reply["ok"], true) << reply;
    }

    static void drain() { ASSERT_EQ(kvlsim::execute({{"command", "drain"}})["ok"], true); }

    Recorder recorder;
};

TEST_F(EventServiceTest, EventsArriveInTheOrderOfTheirAnnouncement) {
    auto const admin =
        started("ADMIN", {{&recorder, nullptr, 0x40007, 1}, {&recorder, nullptr, 0x40003, 1}});
    announce(0x40007, 5);
    announce(0x40003);
    announce(0x40007, 6);
    drain();
    EXPECT_THAT(recorder.seen(),
                ElementsAre(Seen{0x40007, 5}, Seen{0x40003, {}}, Seen{0x40007, 6}));
}

TEST_F(EventServiceTest, OnlySubscribedAndEnabledIdentifiersAreDelivered) {
    auto const admin =
        started("ADMIN", {{&recorder, nullptr, 0x40001, 1}, {&recorder, nullptr, 0x40002, 0}});
    announce(0x40002);
    announce(0x40003);
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40001, {}}));
}

TEST_F(EventServiceTest, HandlersGetTheirContext) {
    int context = 0;
    auto const admin = started("ADMIN", {{&recorder, &context, 0x40001, 1}});
    announce(0x40001);
    drain();
    ASSERT_EQ(recorder.seen().size(), 1U);
    EXPECT_EQ(recorder.seen().front().context, &context);
}

TEST_F(EventServiceTest, EveryFilterEntryForAnIdentifierIsServed) {
    int context = 0;
    auto const admin =
        started("ADMIN", {{&recorder, nullptr, 0x40001, 1}, {&recorder, &context, 0x40001, 1}});
    announce(0x40001);
    drain();
    ASSERT_EQ(recorder.seen().size(), 2U);
    EXPECT_EQ(recorder.seen()[0].context, nullptr);
    EXPECT_EQ(recorder.seen()[1].context, &context);
}

TEST_F(EventServiceTest, EveryStartedConsumerIsServed) {
    Recorder other;
    auto const one = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    auto const two = started("ADMIN", {{&other, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40001, {}}));
    EXPECT_THAT(other.seen(), ElementsAre(Seen{0x40001, {}}));
}

TEST_F(EventServiceTest, ChannelsAreKeptApart) {
    auto const fault =
        started("FAULT", {{&recorder, nullptr, 0x40001, 1}, {&recorder, nullptr, 0x30001, 1}});
    announce(0x40001);
    announce(0x30001, 5);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x30001, 5}));
}

TEST_F(EventServiceTest, FaultsCarryBoardAndValue) {
    auto const fault =
        started("FAULT", {{&recorder, nullptr, 0x30001, 1}, {&recorder, nullptr, 0x30002, 1}});
    kvlsim::execute({{"command", "fault"}, {"board", 6}, {"value", 0xBEEF}});
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x30001, 6}));
    EXPECT_EQ(recorder.lastFault, 0xBEEF);
    kvlsim::execute({{"command", "fault"}, {"board", 6}, {"value", 7}, {"cleared", true}});
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x30001, 6}, Seen{0x30002, 6}));
    EXPECT_EQ(recorder.lastFault, 7);
}

TEST_F(EventServiceTest, NothingIsDeliveredBeforeStart) {
    auto const admin = consumer("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), IsEmpty());
}

TEST_F(EventServiceTest, EventsAnnouncedBeforeStartAreNotDeliveredAfterIt) {
    Gate gate;
    Recorder first;
    first.react = [&](AdminCallbackMsg*) { gate.pass(); };
    auto const holding = started("ADMIN", {{&first, nullptr, 0x40002, 1}});
    announce(0x40002); // holds the queue, so that the next one waits in it
    announce(0x40001);
    auto const late = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    gate.open();
    drain();
    EXPECT_THAT(recorder.seen(), IsEmpty());
}

TEST_F(EventServiceTest, SecondStartChangesNothing) {
    auto const admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    EXPECT_EQ(admin->Start(), 0);
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40001, {}}));
}

TEST_F(EventServiceTest, ConsumerOfAnUnknownChannelDoesNotStart) {
    EXPECT_NE(consumer("WEATHER", {{&recorder, nullptr, 0x40001, 1}})->Start(), 0);
    EXPECT_NE(consumer(nullptr, {{&recorder, nullptr, 0x40001, 1}})->Start(), 0);
}

TEST_F(EventServiceTest, FiltersAreCopiedAtConstruction) {
    Filter filter{&recorder, nullptr, 0x40001, 1};
    VqxAdminConsumer admin("ADMIN", L"Test", &filter, 1, nullptr, 0);
    filter = Filter{};
    admin.Start();
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40001, {}}));
}

TEST_F(EventServiceTest, HandlersMayChangeTheirMessageWithoutHarmToOthers) {
    Recorder scribbler;
    scribbler.react = [](AdminCallbackMsg* message) {
        std::memset(message->payload, 0xFF, 8);
        message->id = 0;
    };
    auto const one = started("ADMIN", {{&scribbler, nullptr, 0x40007, 1}});
    auto const two = started("ADMIN", {{&recorder, nullptr, 0x40007, 1}});
    announce(0x40007, 5);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40007, 5}));
}

TEST_F(EventServiceTest, DeliveryHasAThreadOfItsOwn) {
    auto const admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    EXPECT_NE(recorder.lastThread, std::thread::id());
    EXPECT_NE(recorder.lastThread, std::this_thread::get_id());
}

TEST_F(EventServiceTest, DestroyedConsumerIsServedNoMore) {
    auto admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    admin.reset();
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), IsEmpty());
}

TEST_F(EventServiceTest, ConsumerMayBeDestroyedFromItsOwnCallback) {
    std::unique_ptr<VqxAdminConsumer> admin;
    recorder.react = [&](AdminCallbackMsg*) { admin.reset(); };
    admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}, {&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40001, {}}));
}

TEST_F(EventServiceTest, ConsumerMayDestroyAnotherFromItsCallback) {
    std::unique_ptr<VqxAdminConsumer> other;
    Recorder first;
    first.react = [&](AdminCallbackMsg*) { other.reset(); };
    auto const one = started("ADMIN", {{&first, nullptr, 0x40001, 1}});
    other = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    EXPECT_THAT(recorder.seen(), IsEmpty());
}

TEST_F(EventServiceTest, ConsumerMayStartAnotherFromItsCallback) {
    std::unique_ptr<VqxAdminConsumer> other;
    Recorder first;
    first.react = [&](AdminCallbackMsg*) {
        if (!other) other = started("ADMIN", {{&recorder, nullptr, 0x40002, 1}});
    };
    auto const one = started("ADMIN", {{&first, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    announce(0x40002);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40002, {}}));
}

TEST_F(EventServiceTest, DestructorWaitsForADeliveryUnderWay) {
    Gate inside;
    Gate leave;
    std::atomic<bool> left = false;
    recorder.react = [&](AdminCallbackMsg*) {
        inside.open();
        leave.pass();
        left = true;
    };
    auto admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    inside.pass();
    auto destroyed = std::async(std::launch::async, [&] {
        admin.reset();
        return left.load();
    });
    // The test passes however long this takes; a destructor that does not wait has ended by then.
    EXPECT_EQ(destroyed.wait_for(std::chrono::milliseconds(50)), std::future_status::timeout);
    leave.open();
    EXPECT_TRUE(destroyed.get());
}

TEST_F(EventServiceTest, ConsumersComeAndGoWhileEventsFlow) {
    std::atomic<bool> done = false;
    std::thread announcer([&] {
        for (int i = 0; i < 1000; ++i)
            announce(0x40001);
        done = true;
    });
    std::vector<std::thread> subscribers;
    for (int i = 0; i < 2; ++i)
        subscribers.emplace_back([&] {
            while (!done.load()) {
                Recorder own;
                auto const admin = started("ADMIN", {{&own, nullptr, 0x40001, 1}});
            }
        });
    auto const admin = started("ADMIN", {{&recorder, nullptr, 0x40002, 1}});
    announcer.join();
    for (auto& thread : subscribers)
        thread.join();
    announce(0x40002);
    drain();
    EXPECT_THAT(recorder.seen(), ElementsAre(Seen{0x40002, {}}));
}

TEST_F(EventServiceTest, DrainOnTheDeliveryThreadIsAnErrorNotADeadlock) {
    json reply;
    recorder.react = [&](AdminCallbackMsg*) { reply = kvlsim::execute({{"command", "drain"}}); };
    auto const admin = started("ADMIN", {{&recorder, nullptr, 0x40001, 1}});
    announce(0x40001);
    drain();
    EXPECT_EQ(reply["ok"], false);
    EXPECT_THAT(reply["error"].get<std::string>(), testing::HasSubstr("delivery thread"));
}

TEST_F(EventServiceTest, HandlersMayUseThePlatformTheyAreCalledFrom) {
    std::vector<int> conditions;
    recorder.react = [&](AdminCallbackMsg*) {
        json const reply = kvlsim::execute({{"command", "show"}, {"board", 5}});
        conditions.push_back(reply["boards"][0]["attributes"]["BOARD_CONDITION"].get<int>());
    };
    auto const admin = started("ADMIN", {{&recorder, nullptr, 0x40008, 1}});
    kvlsim::execute({{"command", "stop"}, {"board", 5}});
    drain();
    EXPECT_THAT(conditions, ElementsAre(4));
}

} // namespace
