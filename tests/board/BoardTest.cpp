// SPDX-License-Identifier: BSD-2-Clause
// A board's features and its status listeners.
#include <functional>
#include <vector>

#include <gtest/gtest.h>

#include "board/EthernetFeature.h"
#include "board/InterfaceFeature.h"
#include "core/ReferenceTable.h"
#include "tests/support/PlainBoard.h"
#include "tests/support/Slots.h"
#include "tests/support/StatusLog.h"

namespace {

using FeatureHandle = ReferenceCounter<Feature>;

class PortFeature final : public KVL::EthernetFeature {
  public:
    PortFeature() { interfaces()->add(iid()); }
    ReferenceCounter<KVL::Ethernet> GetFirstEthernet() override { return {}; }
    ReferenceCounter<KVL::Ethernet>
    GetNextEthernet(ReferenceCounter<KVL::Ethernet> /*previous*/) override {
        return {};
    }
    static KVL::IID iid() { return KVL::IID("11PortFeature"); }
};

class BoardTest : public testing::Test {
  protected:
    FeatureHandle add() {
        FeatureHandle feature(new Feature);
        m_board->AddFeature(feature);
        return feature;
    }
    FeatureHandle addPort() {
        FeatureHandle feature(new PortFeature);
        m_board->AddFeature(feature);
        return feature;
    }
    std::vector<Feature*> walk(KVL::IID const& iid) {
        std::vector<Feature*> features;
        for (FeatureHandle feature = m_board->GetFirstFeature(iid); feature.get() != nullptr;
             feature = m_board->GetNextFeature(feature, iid))
            features.push_back(feature.get());
        return features;
    }

    ReferenceCounter<Board> m_board{new PlainBoard};
    StatusLog m_log;
};

KVL::IID const kAnyPort = KVL::EthernetFeature::iid();

TEST_F(BoardTest, BoardWithoutFeaturesFindsNone) {
    EXPECT_EQ(m_board->GetFeatureListSize(), 0);
    EXPECT_EQ(m_board->GetFirstFeature(kAnyPort).get(), nullptr);
    EXPECT_EQ(m_board->GetFirstFeature(KVL::IID()).get(), nullptr);
}

TEST_F(BoardTest, AddingAFeatureAnswersOne) {
    EXPECT_EQ(m_board->AddFeature(FeatureHandle(new Feature)), 1);
    EXPECT_EQ(m_board->GetFeatureListSize(), 1);
}

TEST_F(BoardTest, FeatureAddedTwiceIsThereTwice) {
    FeatureHandle const feature = add();
    m_board->AddFeature(feature);
    EXPECT_EQ(m_board->GetFeatureListSize(), 2);
}

TEST_F(BoardTest, RemovingAFeatureRemovesItsFirstEntryOnly) {
    FeatureHandle const twice = addPort();
    FeatureHandle const other = addPort();
    m_board->AddFeature(twice);
    EXPECT_EQ(m_board->RemoveFeature(twice), 1);
    EXPECT_EQ(walk(kAnyPort), (std::vector{other.get(), twice.get()}));
}

TEST_F(BoardTest, RemovingAFeatureThatIsNotThereAnswersZero) {
    add();
    EXPECT_EQ(m_board->RemoveFeature(FeatureHandle(new Feature)), 0);
    EXPECT_EQ(m_board->GetFeatureListSize(), 1);
}

TEST_F(BoardTest, RemovingAFeatureDropsItsHandle) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    m_board->RemoveFeature(add());
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(BoardTest, FeaturesAreFoundInTheOrderOfAddition) {
    FeatureHandle const first = addPort();
    add();
    FeatureHandle const second = addPort();
    EXPECT_EQ(walk(kAnyPort), (std::vector{first.get(), second.get()}));
}

TEST_F(BoardTest, BaseIdentifierAlsoFindsFeaturesOfDerivedClasses) {
    FeatureHandle const port = addPort();
    EXPECT_EQ(m_board->GetFirstFeature(KVL::EthernetFeature::iid()).get(), port.get());
    EXPECT_EQ(m_board->GetFirstFeature(PortFeature::iid()).get(), port.get());
    EXPECT_EQ(m_board->GetFirstFeature(KVL::InterfaceFeature::iid()).get(), nullptr);
}

TEST_F(BoardTest, NextFeatureAfterTheLastIsEmpty) {
    FeatureHandle const last = addPort();
    EXPECT_EQ(m_board->GetNextFeature(last, kAnyPort).get(), nullptr);
}

TEST_F(BoardTest, NextFeatureAfterAForeignOneIsEmpty) {
    addPort();
    addPort();
    EXPECT_EQ(m_board->GetNextFeature(FeatureHandle(new PortFeature), kAnyPort).get(), nullptr);
}

TEST_F(BoardTest, NextFeatureAfterAnEmptyHandleIsEmpty) {
    addPort();
    EXPECT_EQ(m_board->GetNextFeature(FeatureHandle(), kAnyPort).get(), nullptr);
}

TEST_F(BoardTest, NextFeatureMayFollowOneThatTheIdentifierDoesNotFit) {
    FeatureHandle const plain = add();
    FeatureHandle const port = addPort();
    EXPECT_EQ(m_board->GetNextFeature(plain, kAnyPort).get(), port.get());
}

TEST_F(BoardTest, BoardKeepsItsFeaturesAlive) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    add();
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before + 1);
    m_board = {};
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before - 1);
}

TEST_F(BoardTest, NotifyingNobodyMakesAndDeletesOneEvent) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    EXPECT_EQ(m_board->NotifyBoardStatusListeners(m_board, BoardStatusStarted), 0);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(BoardTest, ListenerAddedTwiceIsCalledOnce) {
    EXPECT_EQ(m_board->AddBoardStatusListener(&m_log), 0);
    EXPECT_EQ(m_board->AddBoardStatusListener(&m_log), 0);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusStopped);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusStopped}));
}

TEST_F(BoardTest, EventCarriesTheBoardAndTheStatus) {
    ReferenceCounter<Board> const other(new PlainBoard);
    m_board->AddBoardStatusListener(&m_log);
    m_board->NotifyBoardStatusListeners(other, BoardStatusFailed);
    EXPECT_EQ(m_log.statusesOf(other), (std::vector<int>{BoardStatusFailed}));
}

TEST_F(BoardTest, AllListenersSeeOneEventObject) {
    StatusLog second;
    m_board->AddBoardStatusListener(&m_log);
    m_board->AddBoardStatusListener(&second);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusStarted);
    EXPECT_EQ(m_log.entries().at(0).event, second.entries().at(0).event);
}

/// A listener that calls the test back at every event.
class ActingListener final : public BoardStatusListener {
  public:
    explicit ActingListener(std::function<void(ReferenceCounter<BoardStatusEvent>)> act)
        : m_act(std::move(act)) {}
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        m_act(event);
        return 1; // ignored
    }

  private:
    std::function<void(ReferenceCounter<BoardStatusEvent>)> m_act;
};

TEST_F(BoardTest, ListenersAreCalledInTheOrderOfAddition) {
    std::vector<int> calls;
    ActingListener first([&](auto const&) { calls.push_back(1); });
    ActingListener second([&](auto const&) { calls.push_back(2); });
    ActingListener third([&](auto const&) { calls.push_back(3); });
    for (auto* listener : {&second, &first, &third})
        m_board->AddBoardStatusListener(listener);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusStarted);
    EXPECT_EQ(calls, (std::vector{2, 1, 3}));
}

TEST_F(BoardTest, ListenerAddedDuringANotificationIsCalledInIt) {
    ActingListener adding([&](auto const&) { m_board->AddBoardStatusListener(&m_log); });
    m_board->AddBoardStatusListener(&adding);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusStarted);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusStarted}));
}

TEST_F(BoardTest, ListenerMayKeepTheEventBeyondTheNotification) {
    ReferenceCounter<BoardStatusEvent> kept;
    ActingListener keeping([&](auto const& event) { kept = event; });
    m_board->AddBoardStatusListener(&keeping);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusFailed);
    EXPECT_EQ(kept->GetBoardStatus(), BoardStatusFailed);
    EXPECT_EQ(kept->GetBoard().get(), m_board.get());
}

TEST_F(BoardTest, ListenerMayUseTheBoardThatTellsIt) {
    int features = -1;
    ActingListener asking(
        [&](auto const& event) { features = event->GetBoard()->GetFeatureListSize(); });
    m_board->AddBoardStatusListener(&asking);
    m_board->NotifyBoardStatusListeners(m_board, BoardStatusStarted);
    EXPECT_EQ(features, 0);
}

TEST(BoardStatusEventTest, NewEventHasNoBoardAndNoStatus) {
    ReferenceCounter<BoardStatusEvent> const event(new BoardStatusEvent);
    EXPECT_EQ(event->GetBoardStatus(), BoardStatusNone);
    EXPECT_EQ(event->GetBoard().get(), nullptr);
}

TEST(BoardStatusEventTest, EventCanNotBeLocked) {
    ReferenceCounter<BoardStatusEvent> const event(new BoardStatusEvent);
    testing::internal::CaptureStdout();
    EXPECT_EQ(event->lock(), 99);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Attempting to lock a non-lockable object...\n");
}

TEST(BoardStatusEventTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&BoardStatusEvent::GetBoardStatus), 2);
    EXPECT_EQ(slotOf(&BoardStatusEvent::GetBoard), 3);
    EXPECT_EQ(slotOf(&BoardStatusEvent::SetBoardStatus), 4);
    EXPECT_EQ(slotOf(&BoardStatusEvent::SetBoard), 5);
    EXPECT_EQ(slotOf(&BoardStatusListener::ProcessBoardStatusEvent), 0);
}

TEST(BoardSlotTest, QueriesKeepTheirSlots) {
    EXPECT_EQ(slotOf(&Board::GetStatus), 2);
    EXPECT_EQ(slotOf(&Board::GetSecondaryStatus), 3);
    EXPECT_EQ(slotOf(&Board::GetName), 4);
    EXPECT_EQ(slotOf(&Board::GetModel), 5);
    EXPECT_EQ(slotOf(&Board::GetFamily), 6);
    EXPECT_EQ(slotOf(&Board::GetFirmwareName), 7);
    EXPECT_EQ(slotOf(&Board::GetFirmwareVersion), 8);
    EXPECT_EQ(slotOf(&Board::GetSerialNumber), 9);
    EXPECT_EQ(slotOf(&Board::GetLogicalID), 10);
    EXPECT_EQ(slotOf(&Board::GetErrorMessage), 11);
    EXPECT_EQ(slotOf(&Board::GetDeviceChangeDate), 12);
    EXPECT_EQ(slotOf(&Board::GetFunctionalDescription), 13);
    EXPECT_EQ(slotOf(&Board::GetBoardID), 14);
    EXPECT_EQ(slotOf(&Board::GetSharedMemoryBaseAddress), 15);
    EXPECT_EQ(slotOf(&Board::GetIOBaseAddress), 16);
    EXPECT_EQ(slotOf(&Board::GetIRQ), 17);
    EXPECT_EQ(slotOf(&Board::GetShelfID), 18);
    EXPECT_EQ(slotOf(&Board::GetPCISlotNumber), 19);
    EXPECT_EQ(slotOf(&Board::GetBusNumber), 20);
}

TEST(BoardSlotTest, ListenerOperationsFollowTheQueries) {
    EXPECT_EQ(slotOf(&Board::AddBoardStatusListener), 21);
    EXPECT_EQ(slotOf(&Board::NotifyBoardStatusListeners), 22);
}

} // namespace
