// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a Z7 board and the notification of their status changes.
#include <string>

#include <gtest/gtest.h>

#include "core/ReferenceTable.h"
#include "tests/support/ChannelLog.h"
#include "tests/support/PlainChannels.h"
#include "tests/support/Slots.h"
#include "z7/ISDNFeatureZ7.h"

namespace {

using BChannel = ReferenceCounter<ISDNBChannel>;
using DChannel = ReferenceCounter<ISDNDChannel>;

class Channels final : public ISDNFeatureZ7 {
  public:
    BChannel addBearer(char const* name) {
        return m_bearerChannels.emplace_back(new PlainBChannel(name));
    }
    DChannel addSignalling(char const* name) {
        return m_signallingChannels.emplace_back(new PlainDChannel(name));
    }
};

int objects() {
    return ReferenceTable::get_instance()->referenced_objects();
}

class ISDNFeatureZ7Test : public testing::Test {
  protected:
    BChannel bearer(std::string name) { return m_feature->GetBChannel(name.data()); }
    DChannel signalling(std::string name) { return m_feature->GetDChannel(name.data()); }

    Channels* m_feature = new Channels;
    ReferenceCounter<ISDNFeature> m_handle{m_feature};
};

TEST_F(ISDNFeatureZ7Test, NewFeatureHasNoChannels) {
    EXPECT_EQ(m_feature->GetFirstBChannel().get(), nullptr);
    EXPECT_EQ(m_feature->GetFirstDChannel().get(), nullptr);
    EXPECT_EQ(m_feature->FindBChannel("x").get(), nullptr);
    EXPECT_EQ(bearer("x").get(), nullptr);
    EXPECT_EQ(signalling("x").get(), nullptr);
    EXPECT_EQ(m_feature->GetBChannel(0L).get(), nullptr);
    EXPECT_EQ(m_feature->GetDChannel(0L).get(), nullptr);
}

TEST_F(ISDNFeatureZ7Test, ChannelsAreWalkedByTheirKindInTheOrderOfTheirEntry) {
    BChannel const b1 = m_feature->addBearer("B1");
    DChannel const d = m_feature->addSignalling("D");
    BChannel const b2 = m_feature->addBearer("B2");
    EXPECT_EQ(m_feature->GetFirstChannel(BChannel()).get(), b1.get());
    EXPECT_EQ(m_feature->GetNextChannel(b1).get(), b2.get());
    EXPECT_EQ(m_feature->GetNextChannel(b2).get(), nullptr);
    EXPECT_EQ(m_feature->GetFirstChannel(DChannel()).get(), d.get());
    EXPECT_EQ(m_feature->GetNextChannel(d).get(), nullptr);
}

TEST_F(ISDNFeatureZ7Test, FirstChannelIsTheSameWhateverTheArgument) {
    BChannel const b1 = m_feature->addBearer("B1");
    BChannel const b2 = m_feature->addBearer("B2");
    EXPECT_EQ(m_feature->GetFirstChannel(b2).get(), b1.get());
}

TEST_F(ISDNFeatureZ7Test, ChannelOfNoneOfTheFeatureHasNoSuccessor) {
    m_feature->addBearer("B1");
    m_feature->addSignalling("D");
    EXPECT_EQ(m_feature->GetNextChannel(BChannel(new PlainBChannel("B1"))).get(), nullptr);
    EXPECT_EQ(m_feature->GetNextChannel(DChannel(new PlainDChannel("D"))).get(), nullptr);
    EXPECT_EQ(m_feature->GetNextChannel(BChannel()).get(), nullptr);
}

TEST_F(ISDNFeatureZ7Test, ChannelIsFoundByItsNameAmongItsKind) {
    m_feature->addBearer("B1");
    BChannel const b2 = m_feature->addBearer("B2");
    m_feature->addBearer("B2");
    DChannel const d = m_feature->addSignalling("D");
    EXPECT_EQ(bearer("B2").get(), b2.get());
    EXPECT_EQ(m_feature->FindBChannel("B2").get(), b2.get());
    EXPECT_EQ(signalling("D").get(), d.get());
    EXPECT_EQ(bearer("D").get(), nullptr);
    EXPECT_EQ(signalling("B2").get(), nullptr);
}

TEST_F(ISDNFeatureZ7Test, ChannelIsFoundByNoIndex) {
    m_feature->addBearer("B1");
    m_feature->addBearer("B2");
    m_feature->addSignalling("D");
    for (long const index : {-1L, 0L, 1L, 2L}) {
        EXPECT_EQ(m_feature->GetBChannel(index).get(), nullptr) << index;
        EXPECT_EQ(m_feature->GetDChannel(index).get(), nullptr) << index;
    }
}

TEST_F(ISDNFeatureZ7Test, NotificationWithoutListenersLeavesNothingBehind) {
    int const before = objects();
    EXPECT_EQ(m_feature->NotifyBChannelStatusListeners(BChannel(new PlainBChannel("B1")),
                                                       ISDNBChannelStatusActive),
              0);
    EXPECT_EQ(m_feature->NotifyDChannelStatusListeners(DChannel(new PlainDChannel("D")),
                                                       ISDNDChannelStatusL1Active),
              0);
    EXPECT_EQ(objects(), before);
}

TEST_F(ISDNFeatureZ7Test, ListenersGetOneBearerEventInTheirOrder) {
    ChannelLog first, second;
    std::string order;
    first.meanwhile = [&] { order += "first "; };
    second.meanwhile = [&] { order += "second "; };
    EXPECT_EQ(m_feature->AddISDNStatusListener(&first), 0);
    EXPECT_EQ(m_feature->AddISDNStatusListener(&second), 0);
    BChannel const channel = m_feature->addBearer("B1");
    EXPECT_EQ(m_feature->NotifyBChannelStatusListeners(channel, ISDNBChannelStatusConnecting), 0);
    EXPECT_EQ(order, "first second ");
    ASSERT_EQ(first.bearer.size(), 1U);
    ASSERT_EQ(second.bearer.size(), 1U);
    EXPECT_EQ(first.bearer[0].get(), second.bearer[0].get());
    EXPECT_EQ(first.bearer[0]->GetBChannel().get(), channel.get());
    EXPECT_EQ(first.bearer[0]->GetChannelStatus(), ISDNBChannelStatusConnecting);
    EXPECT_TRUE(first.signalling.empty());
}

TEST_F(ISDNFeatureZ7Test, ListenersGetOneSignallingEventInTheirOrder) {
    ChannelLog first, second;
    std::string order;
    first.meanwhile = [&] { order += "first "; };
    second.meanwhile = [&] { order += "second "; };
    m_feature->AddISDNStatusListener(&first);
    m_feature->AddISDNStatusListener(&second);
    DChannel const channel = m_feature->addSignalling("D");
    EXPECT_EQ(m_feature->NotifyDChannelStatusListeners(channel, ISDNDChannelStatusL2Active), 0);
    EXPECT_EQ(order, "first second ");
    ASSERT_EQ(first.signalling.size(), 1U);
    ASSERT_EQ(second.signalling.size(), 1U);
    EXPECT_EQ(first.signalling[0].get(), second.signalling[0].get());
    EXPECT_EQ(first.signalling[0]->GetDChannel().get(), channel.get());
    EXPECT_EQ(first.signalling[0]->GetChannelStatus(), ISDNDChannelStatusL2Active);
    EXPECT_TRUE(first.bearer.empty());
}

TEST_F(ISDNFeatureZ7Test, EveryNotificationHasAnEventOfItsOwn) {
    ChannelLog log;
    m_feature->AddISDNStatusListener(&log);
    BChannel const channel = m_feature->addBearer("B1");
    m_feature->NotifyBChannelStatusListeners(channel, ISDNBChannelStatusIdle);
    m_feature->NotifyBChannelStatusListeners(channel, ISDNBChannelStatusIdle);
    ASSERT_EQ(log.bearer.size(), 2U);
    EXPECT_NE(log.bearer[0].get(), log.bearer[1].get());
}

TEST_F(ISDNFeatureZ7Test, ListenerAddedTwiceIsCalledOnce) {
    ChannelLog log;
    EXPECT_EQ(m_feature->AddISDNStatusListener(&log), 0);
    EXPECT_EQ(m_feature->AddISDNStatusListener(&log), 0);
    m_feature->NotifyBChannelStatusListeners(m_feature->addBearer("B1"), ISDNBChannelStatusIdle);
    EXPECT_EQ(log.bearer.size(), 1U);
}

TEST_F(ISDNFeatureZ7Test, ListenerAddedDuringANotificationIsCalledToo) {
    ChannelLog first, late;
    first.meanwhile = [&] { m_feature->AddISDNStatusListener(&late); };
    m_feature->AddISDNStatusListener(&first);
    m_feature->NotifyBChannelStatusListeners(m_feature->addBearer("B1"), ISDNBChannelStatusIdle);
    ASSERT_EQ(late.bearer.size(), 1U);
    EXPECT_EQ(late.bearer[0].get(), first.bearer[0].get());
}

TEST_F(ISDNFeatureZ7Test, OperationsKeepTheirSlotsBehindThoseOfTheAbstractFeature) {
    using BByName = BChannel (ISDNFeatureZ7::*)(char*);
    using BByIndex = BChannel (ISDNFeatureZ7::*)(long);
    using DByName = DChannel (ISDNFeatureZ7::*)(char*);
    using DByIndex = DChannel (ISDNFeatureZ7::*)(long);
    EXPECT_EQ(slotOf(&ISDNFeatureZ7::AddISDNStatusListener), 2);
    EXPECT_EQ(slotOf(&ISDNFeatureZ7::GetNextDChannel), 10);
    EXPECT_EQ(slotOf(static_cast<BByName>(&ISDNFeatureZ7::GetBChannel)), 11);
    EXPECT_EQ(slotOf(static_cast<BByIndex>(&ISDNFeatureZ7::GetBChannel)), 12);
    EXPECT_EQ(slotOf(static_cast<DByName>(&ISDNFeatureZ7::GetDChannel)), 13);
    EXPECT_EQ(slotOf(static_cast<DByIndex>(&ISDNFeatureZ7::GetDChannel)), 14);
    EXPECT_EQ(slotOf(&ISDNFeatureZ7::NotifyBChannelStatusListeners), 15);
    EXPECT_EQ(slotOf(&ISDNFeatureZ7::NotifyDChannelStatusListeners), 16);
}

} // namespace
