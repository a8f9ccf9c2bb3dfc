// SPDX-License-Identifier: BSD-2-Clause
// Channels, the walks over them, and the events of their status changes.
#include <typeinfo>
#include <vector>

#include <gtest/gtest.h>

#include "board/ISDNFeature.h"
#include "core/HandleWalk.h"
#include "core/ReferenceTable.h"
#include "tests/support/PlainChannels.h"
#include "tests/support/Slots.h"

namespace {

using BChannel = ReferenceCounter<ISDNBChannel>;
using DChannel = ReferenceCounter<ISDNDChannel>;

/// Channels in two vectors.
class ListedChannels final : public ISDNFeature {
  public:
    int AddISDNStatusListener(ISDNChannelStatusListener* /*listener*/) override { return 0; }
    BChannel GetFirstChannel(BChannel /*kind*/) override { return KVL::first_in(bearers); }
    BChannel GetNextChannel(BChannel previous) override { return KVL::next_in(bearers, previous); }
    DChannel GetFirstChannel(DChannel /*kind*/) override { return KVL::first_in(signallers); }
    DChannel GetNextChannel(DChannel previous) override {
        return KVL::next_in(signallers, previous);
    }

    std::vector<BChannel> bearers;
    std::vector<DChannel> signallers;
};

class ISDNFeatureTest : public testing::Test {
  protected:
    void add(char const* name) { m_feature->bearers.emplace_back(new PlainBChannel(name)); }
    ISDNBChannel* bearer(std::size_t i) { return m_feature->bearers[i].get(); }

    ListedChannels* m_feature = new ListedChannels;
    ReferenceCounter<ISDNFeature> m_handle{m_feature};
};

TEST_F(ISDNFeatureTest, FeatureWithoutChannelsHasNeitherAFirstNorANext) {
    EXPECT_EQ(m_feature->GetFirstBChannel().get(), nullptr);
    EXPECT_EQ(m_feature->GetNextBChannel(BChannel()).get(), nullptr);
    EXPECT_EQ(m_feature->GetFirstDChannel().get(), nullptr);
    EXPECT_EQ(m_feature->GetNextDChannel(DChannel()).get(), nullptr);
    EXPECT_EQ(m_feature->FindBChannel("B1").get(), nullptr);
    EXPECT_EQ(m_feature->FindBChannel("").get(), nullptr);
}

TEST_F(ISDNFeatureTest, FindAnswersTheFirstOfTwoEqualNames) {
    add("B0");
    add("B1");
    add("B1");
    EXPECT_EQ(m_feature->FindBChannel("B1").get(), bearer(1));
    EXPECT_EQ(m_feature->FindBChannel("B2").get(), nullptr);
}

TEST_F(ISDNFeatureTest, FindLooksAtBearerChannelsOnly) {
    m_feature->signallers.emplace_back(new PlainDChannel("D1"));
    EXPECT_EQ(m_feature->FindBChannel("D1").get(), nullptr);
}

TEST_F(ISDNFeatureTest, BearerChannelsAreWalkedInTheirOrder) {
    add("B1");
    add("B2");
    EXPECT_EQ(m_feature->GetFirstBChannel().get(), bearer(0));
    EXPECT_EQ(m_feature->GetNextBChannel(m_feature->bearers[0]).get(), bearer(1));
    EXPECT_EQ(m_feature->GetNextBChannel(m_feature->bearers[1]).get(), nullptr);
}

TEST_F(ISDNFeatureTest, SignallingChannelsAreWalkedInTheirOrder) {
    auto& channels = m_feature->signallers;
    channels.emplace_back(new PlainDChannel("D1"));
    channels.emplace_back(new PlainDChannel("D2"));
    EXPECT_EQ(m_feature->GetFirstDChannel().get(), channels[0].get());
    EXPECT_EQ(m_feature->GetNextDChannel(channels[0]).get(), channels[1].get());
    EXPECT_EQ(m_feature->GetNextDChannel(channels[1]).get(), nullptr);
}

TEST_F(ISDNFeatureTest, FeatureAnswersToItsIdentifier) {
    EXPECT_TRUE(m_feature->interfaces()->is_element(ISDNFeature::iid()));
    EXPECT_STREQ(ISDNFeature::iid().tostring(), typeid(ISDNFeature).name());
}

TEST_F(ISDNFeatureTest, OperationsKeepTheirSlots) {
    using FirstB = BChannel (ISDNFeature::*)(BChannel);
    using FirstD = DChannel (ISDNFeature::*)(DChannel);
    int slot = 2;
    EXPECT_EQ(slotOf(&ISDNFeature::AddISDNStatusListener), slot++);
    EXPECT_EQ(slotOf(static_cast<FirstB>(&ISDNFeature::GetFirstChannel)), slot++);
    EXPECT_EQ(slotOf(&ISDNFeature::GetFirstBChannel), slot++);
    EXPECT_EQ(slotOf(static_cast<FirstB>(&ISDNFeature::GetNextChannel)), slot++);
    EXPECT_EQ(slotOf(&ISDNFeature::GetNextBChannel), slot++);
    EXPECT_EQ(slotOf(static_cast<FirstD>(&ISDNFeature::GetFirstChannel)), slot++);
    EXPECT_EQ(slotOf(&ISDNFeature::GetFirstDChannel), slot++);
    EXPECT_EQ(slotOf(static_cast<FirstD>(&ISDNFeature::GetNextChannel)), slot++);
    EXPECT_EQ(slotOf(&ISDNFeature::GetNextDChannel), slot++);
}

TEST(ISDNChannelTest, BearerChannelOperationsKeepTheirSlots) {
    int slot = 2;
    EXPECT_EQ(slotOf(&ISDNBChannel::GetName), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::GetChannelType), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::GetOperStatus), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::GetChannelNumber), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::GetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::SetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannel::AddISDNStatusListener), slot++);
}

TEST(ISDNChannelTest, SignallingChannelOperationsKeepTheirSlots) {
    int slot = 2;
    EXPECT_EQ(slotOf(&ISDNDChannel::GetName), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::GetProtocol), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::GetOperStatus), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::GetBChannelCount), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::GetCallingAddress), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::GetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::SetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNDChannel::AddISDNStatusListener), slot++);
}

class ISDNChannelStatusEventTest : public testing::Test {
  protected:
    static int objects() { return ReferenceTable::get_instance()->referenced_objects(); }

    int m_before = objects();
};

TEST_F(ISDNChannelStatusEventTest, BearerEventKeepsItsChannelAliveUntilItGoes) {
    ReferenceCounter<ISDNBChannelStatusEvent> event(new ISDNBChannelStatusEvent(
        ISDNBChannelStatusConnected, BChannel(new PlainBChannel("B1"))));
    EXPECT_EQ(objects(), m_before + 2);
    EXPECT_EQ(event->GetChannelStatus(), ISDNBChannelStatusConnected);
    char name[64];
    event->GetBChannel()->GetName(name);
    EXPECT_STREQ(name, "B1");
    event = {};
    EXPECT_EQ(objects(), m_before);
}

TEST_F(ISDNChannelStatusEventTest, SignallingEventKeepsItsChannelAliveUntilItGoes) {
    ReferenceCounter<ISDNDChannelStatusEvent> event(
        new ISDNDChannelStatusEvent(ISDNDChannelStatusL2Active, DChannel(new PlainDChannel("D1"))));
    EXPECT_EQ(objects(), m_before + 2);
    EXPECT_EQ(event->GetChannelStatus(), ISDNDChannelStatusL2Active);
    char name[64];
    event->GetDChannel()->GetName(name);
    EXPECT_STREQ(name, "D1");
    event = {};
    EXPECT_EQ(objects(), m_before);
}

TEST_F(ISDNChannelStatusEventTest, StatusesHaveTheValuesOfTheMib) {
    EXPECT_EQ(ISDNBChannelStatusIdle, 1);
    EXPECT_EQ(ISDNBChannelStatusConnecting, 2);
    EXPECT_EQ(ISDNBChannelStatusConnected, 3);
    EXPECT_EQ(ISDNBChannelStatusActive, 4);
    EXPECT_EQ(ISDNDChannelStatusInactive, 1);
    EXPECT_EQ(ISDNDChannelStatusL1Active, 2);
    EXPECT_EQ(ISDNDChannelStatusL2Active, 3);
}

TEST_F(ISDNChannelStatusEventTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&ISDNBChannelStatusEvent::GetChannelStatus), 2);
    EXPECT_EQ(slotOf(&ISDNBChannelStatusEvent::GetBChannel), 3);
    EXPECT_EQ(slotOf(&ISDNDChannelStatusEvent::GetChannelStatus), 2);
    EXPECT_EQ(slotOf(&ISDNDChannelStatusEvent::GetDChannel), 3);
    EXPECT_EQ(slotOf(&ISDNChannelStatusListener::ProcessBChannelStatusEvent), 0);
    EXPECT_EQ(slotOf(&ISDNChannelStatusListener::ProcessDChannelStatusEvent), 1);
}

TEST_F(ISDNChannelStatusEventTest, ListenerIsFoundAtTheAddressOfItsFirstBase) {
    class Listener final : public ISDNChannelStatusListener {
        int ProcessBChannelStatusEvent(ReferenceCounter<ISDNBChannelStatusEvent>) override {
            return 0;
        }
        int ProcessDChannelStatusEvent(ReferenceCounter<ISDNDChannelStatusEvent>) override {
            return 0;
        }
    };
    Listener listener;
    ISDNChannelStatusListener* const channelListener = &listener;
    EventListener* const base = channelListener;
    EXPECT_EQ(static_cast<void*>(base), static_cast<void*>(channelListener));
    EXPECT_EQ(static_cast<ISDNChannelStatusListener*>(base), channelListener);
}

} // namespace
