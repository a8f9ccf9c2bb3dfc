// SPDX-License-Identifier: BSD-2-Clause
// The event adaptors with the simulated event service.

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "access/ExternalEventAdaptor.h"
#include "access/ExternalFaultEventAdaptor.h"
#include "core/ReferenceTable.h"
#include "tests/support/KeptForGood.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/Slots.h"

namespace {

using Told = std::vector<std::pair<std::uint32_t, int>>;

class EventLog final : public ExternalEventListener {
  public:
    int ProcessExternalEvent(ReferenceCounter<ExternalEvent> event) override {
        told.emplace_back(event->GetEventID(), event->GetData());
        onEvent();
        return 0;
    }
    Told told;
    std::function<void()> onEvent = [] {};
};

class ExternalEventAdaptorTest : public testing::Test {
  protected:
    ExternalEventAdaptorTest() { sim::load({sim::board(5, "S5")}); }

    /// A listener that receives only this test's events.
    EventLog& listen() {
        auto& log = keptForGood<EventLog>();
        EXPECT_EQ(m_adaptor->AddExternalEventListener(&log), 0);
        return log;
    }
    int handle(std::uint32_t id, std::int32_t board = 0) {
        AdminCallbackMsg message{};
        message.id = id;
        message.payload = &board;
        return m_adaptor->HandleEvent(&message, nullptr);
    }

    ReferenceCounter<ExternalEventAdaptor> m_adaptor = ExternalEventAdaptor::get_instance();
};

TEST_F(ExternalEventAdaptorTest, MessageThatConcernsAllBoardsCarriesNoBoard) {
    EventLog const& log = listen();
    sim::deliver(0x40003);
    EXPECT_EQ(log.told, (Told{{0x40003, 0}}));
}

TEST_F(ExternalEventAdaptorTest, MessageThatConcernsOneBoardCarriesIt) {
    EventLog const& log = listen();
    sim::deliver(0x40006, 7);
    EXPECT_EQ(log.told, (Told{{0x40006, 7}}));
}

TEST_F(ExternalEventAdaptorTest, AllTenMessagesAreSubscribed) {
    EventLog const& log = listen();
    Told expected;
    for (std::uint32_t id = 0x40001; id <= 0x40004; ++id) {
        sim::deliver(id);
        expected.emplace_back(id, 0);
    }
    for (std::uint32_t id = 0x40005; id <= 0x4000A; ++id) {
        sim::deliver(id, 3);
        expected.emplace_back(id, 3);
    }
    EXPECT_EQ(log.told, expected);
}

TEST_F(ExternalEventAdaptorTest, NegativeBoardIdentifierStaysNegative) {
    EventLog const& log = listen();
    handle(0x40008, -9);
    EXPECT_EQ(log.told, (Told{{0x40008, -9}}));
}

TEST_F(ExternalEventAdaptorTest, UnknownMessagesArePrintedAndReachNobody) {
    EventLog const& log = listen();
    testing::internal::CaptureStdout();
    EXPECT_EQ(handle(0x40000), 1);
    EXPECT_EQ(handle(0x4000B), 1);
    EXPECT_EQ(handle(0xFFFFFFFF), 1);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "UNKNOWN MSG:262144\nUNKNOWN MSG:262155\nUNKNOWN MSG:4294967295\n");
    EXPECT_TRUE(log.told.empty());
}

TEST_F(ExternalEventAdaptorTest, KnownMessageAnswersOne) {
    EXPECT_EQ(handle(0x40001), 1);
    EXPECT_EQ(handle(0x4000A), 1);
}

TEST_F(ExternalEventAdaptorTest, EventIsReleasedAtOnceWhenNobodyKeepsIt) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    handle(0x40002);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(ExternalEventAdaptorTest, ListenerAddedTwiceIsCalledOnce) {
    EventLog& log = listen();
    m_adaptor->AddExternalEventListener(&log);
    handle(0x40004);
    EXPECT_EQ(log.told.size(), 1U);
}

TEST_F(ExternalEventAdaptorTest, ListenersAreCalledInTheOrderOfAddition) {
    std::string calls;
    EventLog& first = listen();
    EventLog& second = listen();
    first.onEvent = [&] { calls += '1'; };
    second.onEvent = [&] { calls += '2'; };
    handle(0x40001);
    first.onEvent = second.onEvent = [] {};
    EXPECT_EQ(calls, "12");
}

TEST_F(ExternalEventAdaptorTest, ListenerAddedDuringADeliveryIsCalledInIt) {
    EventLog& first = listen();
    EventLog* added = nullptr;
    first.onEvent = [&] {
        if (added == nullptr) added = &listen();
    };
    handle(0x40001);
    first.onEvent = [] {};
    EXPECT_EQ(added->told.size(), 1U);
}

TEST_F(ExternalEventAdaptorTest, DroppingEveryHandleLeavesTheInstanceAlive) {
    ExternalEventAdaptor* const instance = m_adaptor.get();
    EventLog const& log = listen();
    m_adaptor = {};
    EXPECT_EQ(ExternalEventAdaptor::get_instance().get(), instance);
    sim::deliver(0x40002);
    EXPECT_EQ(log.told.size(), 1U);
}

TEST_F(ExternalEventAdaptorTest, UnregisteringDoesNotEndTheSubscription) {
    EventLog const& log = listen();
    m_adaptor->unregister_for_events();
    sim::deliver(0x40002);
    EXPECT_EQ(log.told.size(), 1U);
}

TEST_F(ExternalEventAdaptorTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&ExternalEvent::GetEventID), 2);
    EXPECT_EQ(slotOf(&ExternalEventListener::ProcessExternalEvent), 0);
    EXPECT_EQ(slotOf(&VqxEventService::CEventHandlerAdaptor::HandleEvent), 0);
    EXPECT_EQ(slotOf(&ExternalEventAdaptor::HandleEvent), 2);
}

struct Fault {
    std::uint32_t id;
    int board;
    int value;
    bool operator==(Fault const&) const = default;
};

class FaultLog final : public ExternalFaultEventListener {
  public:
    int ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) override {
        told.push_back({event->GetEventID(), event->GetBoardID(), event->GetFault()});
        onEvent();
        return 0;
    }
    std::vector<Fault> told;
    std::function<void()> onEvent = [] {};
};

class ExternalFaultEventAdaptorTest : public testing::Test {
  protected:
    ExternalFaultEventAdaptorTest() {
        sim::load({sim::board(5, "S5", "LOGICAL ID: 2, VORN_DRIVER_BOARD_ID: 105"),
                   sim::board(6, "S6", "VORN_DRIVER_BOARD_ID: 106"), sim::board(7, "S7")});
        m_adaptor->AddExternalFaultEventListener(&m_log);
    }
    ~ExternalFaultEventAdaptorTest() override {
        m_adaptor->RemoveExternalFaultEventListener(&m_log);
    }
    static void fault(int board, int value, bool cleared = false) {
        sim::command(
            {{"command", "fault"}, {"board", board}, {"value", value}, {"cleared", cleared}});
        sim::drain();
    }

    ReferenceCounter<ExternalFaultEventAdaptor> m_adaptor =
        ExternalFaultEventAdaptor::get_instance();
    FaultLog m_log;
};

TEST_F(ExternalFaultEventAdaptorTest, FaultCarriesTheLogicalIdentifierAndTheValue) {
    fault(5, 0xBEEF);
    fault(5, 1, true);
    EXPECT_EQ(m_log.told, (std::vector<Fault>{{0x30001, 2, 0xBEEF}, {0x30002, 2, 1}}));
}

TEST_F(ExternalFaultEventAdaptorTest, BoardWithoutLogicalIdentifierIsNamedByItsDriverIdentifier) {
    fault(6, 3);
    EXPECT_EQ(m_log.told, (std::vector<Fault>{{0x30001, 106, 3}}));
}

TEST_F(ExternalFaultEventAdaptorTest, LogicalIdentifierMinusOneCountsAsNone) {
    sim::set(5, "LOGICAL ID", -1);
    fault(5, 3);
    EXPECT_EQ(m_log.told, (std::vector<Fault>{{0x30001, 105, 3}}));
}

TEST_F(ExternalFaultEventAdaptorTest, BoardWithoutAnyIdentifierIsMinusOne) {
    fault(7, 4);
    EXPECT_EQ(m_log.told, (std::vector<Fault>{{0x30001, -1, 4}}));
}

TEST_F(ExternalFaultEventAdaptorTest, UnknownMessagesArePrintedAndReachNobody) {
    AdminCallbackMsg message{};
    message.id = 0x30003;
    testing::internal::CaptureStdout();
    EXPECT_EQ(m_adaptor->HandleEvent(&message, nullptr), 1);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), "UNKNOWN MSG:196611\n");
    EXPECT_TRUE(m_log.told.empty());
}

TEST_F(ExternalFaultEventAdaptorTest, RemovedListenerIsNotCalledAnyMore) {
    EXPECT_EQ(m_adaptor->RemoveExternalFaultEventListener(&m_log), 0);
    EXPECT_EQ(m_adaptor->RemoveExternalFaultEventListener(&m_log), 1);
    fault(5, 1);
    EXPECT_TRUE(m_log.told.empty());
}

TEST_F(ExternalFaultEventAdaptorTest, ListenerThatRemovesItselfEndsTheWalk) {
    FaultLog second;
    m_adaptor->AddExternalFaultEventListener(&second);
    m_log.onEvent = [&] { m_adaptor->RemoveExternalFaultEventListener(&m_log); };
    fault(5, 1);
    EXPECT_EQ(m_log.told.size(), 1U);
    EXPECT_TRUE(second.told.empty());
    fault(5, 2);
    EXPECT_EQ(second.told.size(), 1U);
    m_adaptor->RemoveExternalFaultEventListener(&second);
}

TEST_F(ExternalFaultEventAdaptorTest, EventIsReleasedAtOnceWhenNobodyKeepsIt) {
    m_adaptor->RemoveExternalFaultEventListener(&m_log);
    int const before = ReferenceTable::get_instance()->referenced_objects();
    fault(5, 1);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(ExternalFaultEventAdaptorTest, DroppingEveryHandleLeavesTheInstanceAlive) {
    ExternalFaultEventAdaptor* const instance = m_adaptor.get();
    m_adaptor = {};
    m_adaptor = ExternalFaultEventAdaptor::get_instance();
    EXPECT_EQ(m_adaptor.get(), instance);
}

TEST_F(ExternalFaultEventAdaptorTest, AdministrativeMessagesDoNotReachFaultListeners) {
    sim::deliver(0x40006, 5);
    EXPECT_TRUE(m_log.told.empty());
}

} // namespace
