// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of the reference board: their answers and their status events.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "ISDNMonitor.h"
#include "Z7SimBoard.h"
#include "Z7SimISDNChannels.h"
#include "board/ISDNCall.h"
#include "board/ISDNChannelOnLine.h"
#include "board/Interface.h"
#include "core/ReferenceTable.h"
#include "tests/modules/z7sim/ChannelLog.h"
#include "tests/modules/z7sim/PluggedBoard.h"

namespace {

using Entries = ChannelLog::Entries;

class Z7SimISDNFeatureTest : public PluggedBoard {
  protected:
    static std::string trunk(int handle, int bearers, std::string const& attributes = "",
                             int type = 514) {
        return device(handle, type, attributes,
                      "channels: {bearers: " + std::to_string(bearers) + "}");
    }
    static void setUpCall(int trunk, int channel, char const* state = "active") {
        sim::command(
            {{"command", "call-setup"}, {"trunk", trunk}, {"channel", channel}, {"state", state}});
        sim::drain();
    }
    static void releaseCall(int trunk, int channel) {
        sim::command({{"command", "call-release"}, {"trunk", trunk}, {"channel", channel}});
        sim::drain();
    }
    static void setSignalling(int trunk, char const* state) {
        sim::command({{"command", "call-signalling"}, {"trunk", trunk}, {"state", state}});
        sim::drain();
    }
    /// A message as the platform would deliver it, true or not.
    static void deliver(std::uint32_t id, ISDNChannelMsg change) {
        AdminCallbackMsg message{};
        message.id = id;
        message.payload = &change;
        ISDNMonitor::instance().HandleEvent(&message, nullptr);
    }

    ReferenceCounter<ISDNFeature> isdn() { return feature<ISDNFeature>(); }
    ReferenceCounter<ISDNBChannel> bearer(char const* name) { return isdn()->FindBChannel(name); }
    std::vector<std::string> bearerNames() {
        std::vector<std::string> names;
        auto const channels = isdn();
        for (auto channel = channels->GetFirstBChannel(); channel.get() != nullptr;
             channel = channels->GetNextBChannel(channel))
            names.push_back(nameOf(*channel.get()));
        return names;
    }
    std::vector<std::string> signallingNames() {
        std::vector<std::string> names;
        auto const channels = isdn();
        for (auto channel = channels->GetFirstDChannel(); channel.get() != nullptr;
             channel = channels->GetNextDChannel(channel))
            names.push_back(nameOf(*channel.get()));
        return names;
    }
    template <class Channel>
    static std::string nameOf(Channel& channel) {
        char name[64];
        EXPECT_EQ(channel.GetName(name), 0);
        return name;
    }
    /// A trunk with a line and one bearer channel.
    static std::string trunkOnLine(int handle, std::string const& attributes) {
        return device(handle, 514, attributes, "line: {type: esf}, channels: {bearers: 1}");
    }
    /// The index of the line that a channel of either kind names; -1 when it names none.
    template <class Channel>
    static int lineIndexOf(ReferenceCounter<Channel> const& channel) {
        auto* const onLine = dynamic_cast<ISDNChannelOnLine*>(channel.get());
        if (onLine == nullptr) return -1;
        auto const line = onLine->GetLine();
        return line.get() == nullptr ? -1 : line->GetLineIndex();
    }
    /// Listens to the feature, and to the first channel of each kind.
    void listen() {
        isdn()->AddISDNStatusListener(&m_featureLog);
        isdn()->GetFirstBChannel()->AddISDNStatusListener(&m_channelLog);
        isdn()->GetFirstDChannel()->AddISDNStatusListener(&m_channelLog);
    }

    Entries m_heard;
    ChannelLog m_featureLog{"feature", &m_heard};
    ChannelLog m_channelLog{"channel", &m_heard};
};

TEST_F(Z7SimISDNFeatureTest, BoardWithoutTrunksHasNoFeature) {
    plugIn("", device(301, 514));
    EXPECT_EQ(isdn().get(), nullptr);
}

TEST_F(Z7SimISDNFeatureTest, FeatureIsCalledISDN) {
    plugIn("", trunk(301, 2));
    EXPECT_STREQ(isdn()->GetFeatureName(), "ISDN");
}

TEST_F(Z7SimISDNFeatureTest, BearersOfAT1TakeTheFirstTimeSlots) {
    plugIn("", trunk(301, 23));
    auto const names = bearerNames();
    ASSERT_EQ(names.size(), 23U);
    EXPECT_EQ(names.front(), "B1.1");
    EXPECT_EQ(names[15], "B1.16");
    EXPECT_EQ(names.back(), "B1.23");
    EXPECT_EQ(bearer("B1.16")->GetChannelNumber(), 16);
}

TEST_F(Z7SimISDNFeatureTest, BearersOfAnE1LeaveTheSignallingSlotOut) {
    plugIn("", trunk(301, 30));
    auto const names = bearerNames();
    ASSERT_EQ(names.size(), 30U);
    EXPECT_EQ(names[14], "B1.15");
    EXPECT_EQ(names[15], "B1.17");
    EXPECT_EQ(names.back(), "B1.31");
    EXPECT_EQ(bearer("B1.17")->GetChannelNumber(), 17);
}

TEST_F(Z7SimISDNFeatureTest, BearersOfAFullE1TakeEverySlot) {
    plugIn("", trunk(301, 31));
    auto const names = bearerNames();
    ASSERT_EQ(names.size(), 31U);
    EXPECT_EQ(names[15], "B1.16");
    EXPECT_EQ(names.back(), "B1.31");
}

TEST_F(Z7SimISDNFeatureTest, TrunksAreNumberedAsTheDeviceMapperListsThem) {
    // By type, then by place: 303 comes last, and 302 is no trunk.
    plugIn("", trunk(303, 1, "NAME: third", 516) + trunk(301, 2, "NAME: first") + device(302, 514) +
                   trunk(304, 1, "NAME: second"));
    EXPECT_EQ(bearerNames(), (std::vector<std::string>{"B1.1", "B1.2", "B2.1", "B3.1"}));
    EXPECT_EQ(signallingNames(), (std::vector<std::string>{"D1", "D2", "D3"}));
}

TEST_F(Z7SimISDNFeatureTest, BearerAnswersEveryQuery) {
    plugIn("", trunk(301, 2));
    auto const channel = isdn()->GetFirstBChannel();
    EXPECT_EQ(nameOf(*channel.get()), "B1.1");
    EXPECT_EQ(channel->GetChannelType(), 1);
    EXPECT_EQ(channel->GetOperStatus(), ISDNBChannelStatusIdle);
    EXPECT_EQ(channel->GetChannelNumber(), 1);
    EXPECT_EQ(channel->GetBoardIndex(), 5);
}

TEST_F(Z7SimISDNFeatureTest, SignallingChannelAnswersEveryQuery) {
    plugIn("", trunk(301, 2, "Protocol_Type_0: 4, CALLING_ADDRESS: '5550100'"));
    auto const channel = isdn()->GetFirstDChannel();
    char address[256];
    EXPECT_EQ(nameOf(*channel.get()), "D1");
    EXPECT_EQ(channel->GetProtocol(), 3); // etsi
    EXPECT_EQ(channel->GetOperStatus(), ISDNDChannelStatusL2Active);
    EXPECT_EQ(channel->GetBChannelCount(), 2);
    EXPECT_EQ(channel->GetCallingAddress(address), 0);
    EXPECT_STREQ(address, "5550100");
    EXPECT_EQ(channel->GetBoardIndex(), 5);
}

TEST_F(Z7SimISDNFeatureTest, ChannelsKnowTheLineOfTheirTrunkEvenIfTrunksHaveOneName) {
    plugIn("", trunkOnLine(301, "NAME: same") + trunkOnLine(302, "NAME: same"));
    EXPECT_EQ(lineIndexOf(bearer("B1.1")), 1);
    EXPECT_EQ(lineIndexOf(bearer("B2.1")), 2);
    auto const first = isdn()->GetFirstDChannel();
    EXPECT_EQ(lineIndexOf(first), 1);
    EXPECT_EQ(lineIndexOf(isdn()->GetNextDChannel(first)), 2);
}

TEST_F(Z7SimISDNFeatureTest, ChannelsOfATrunkWithoutALineKnowNone) {
    plugIn("", trunkOnLine(301, "") + trunk(302, 1));
    EXPECT_EQ(lineIndexOf(bearer("B1.1")), 1);
    EXPECT_EQ(lineIndexOf(bearer("B2.1")), -1);
    EXPECT_EQ(lineIndexOf(isdn()->GetNextDChannel(isdn()->GetFirstDChannel())), -1);
}

TEST_F(Z7SimISDNFeatureTest, ProtocolsOfThePlatformHaveTheNumbersOfTheStandard) {
    std::string trunks;
    for (int const platform : {-1, 0, 1, 2, 3, 4, 5, 6, 7})
        trunks += trunk(302 + platform, 2, "Protocol_Type_0: " + std::to_string(platform));
    plugIn("", trunks);
    std::vector<int> protocols;
    auto const channels = isdn();
    for (auto channel = channels->GetFirstDChannel(); channel.get() != nullptr;
         channel = channels->GetNextDChannel(channel))
        protocols.push_back(channel->GetProtocol());
    EXPECT_EQ(protocols, (std::vector<int>{1, 1, 10, 5, 7, 3, 23, 18, 1}));
}

TEST_F(Z7SimISDNFeatureTest, TrunkWithoutProtocolAndAddressSaysSo) {
    plugIn("", trunk(301, 2, "NAME: primary-rate"));
    char address[256] = "before";
    EXPECT_EQ(isdn()->GetFirstDChannel()->GetProtocol(), KVL::kNotSupported);
    EXPECT_EQ(isdn()->GetFirstDChannel()->GetCallingAddress(address), 0);
    EXPECT_STREQ(address, "");
}

TEST_F(Z7SimISDNFeatureTest, BearerKnowsItsCallAndKeepsIt) {
    plugIn("", trunk(301, 2));
    auto const channel = bearer("B1.2");
    auto* const calling = dynamic_cast<ISDNCallChannel*>(channel.get());
    ASSERT_NE(calling, nullptr);
    EXPECT_EQ(calling->GetCall().origin, 1);
    sim::command({{"command", "call-setup"},
                  {"trunk", 301},
                  {"channel", 2},
                  {"state", "connecting"},
                  {"incoming", true},
                  {"peer", "5550199"},
                  {"subaddress", "7"},
                  {"information", "audio-31"}});
    sim::drain();
    ISDNCallDetails const call = calling->GetCall();
    EXPECT_STREQ(call.peerAddress, "5550199");
    EXPECT_STREQ(call.peerSubAddress, "7");
    EXPECT_EQ(call.origin, 3);
    EXPECT_EQ(call.informationType, 6);
    EXPECT_EQ(call.multirate, 2);
    EXPECT_GT(call.setupTime, 0);
    EXPECT_EQ(call.connectTime, 0);
    releaseCall(301, 2);
    EXPECT_STREQ(calling->GetCall().peerAddress, "5550199");
}

TEST_F(Z7SimISDNFeatureTest, ChargeOfACallIsKnownWithoutAChangeOfState) {
    plugIn("", trunk(301, 1));
    setUpCall(301, 1);
    auto const channel = bearer("B1.1");
    listen();
    sim::command({{"command", "call-charge"}, {"trunk", 301}, {"channel", 1}, {"units", 12}});
    sim::drain();
    EXPECT_EQ(dynamic_cast<ISDNCallChannel&>(*channel.get()).GetCall().chargedUnits, 12U);
    EXPECT_TRUE(m_heard.empty());
}

TEST_F(Z7SimISDNFeatureTest, SignallingChannelCountsCallsAndLinks) {
    plugIn("", trunk(301, 2, "CALLING_SUBADDRESS: '42'"));
    auto const channel = isdn()->GetFirstDChannel();
    auto* const counting = dynamic_cast<ISDNCountingChannel*>(channel.get());
    ASSERT_NE(counting, nullptr);
    setUpCall(301, 1);
    setUpCall(301, 2, "connecting");
    setSignalling(301, "l1");
    setSignalling(301, "l2");
    ISDNSignallingCounts counts;
    ASSERT_EQ(counting->GetCounts(counts), 0);
    EXPECT_EQ(counts.inCalls, 0U);
    EXPECT_EQ(counts.outCalls, 2U);
    EXPECT_EQ(counts.outConnected, 1U);
    EXPECT_EQ(counts.peerSabme, 1U);
    EXPECT_EQ(counts.recvdFrmr, 0U);
    char address[64];
    EXPECT_EQ(counting->GetCallingSubAddress(address), 0);
    EXPECT_STREQ(address, "42");
}

TEST_F(Z7SimISDNFeatureTest, StatesAreThoseOfThePlatformAtTheStart) {
    load("", trunk(301, 3));
    setUpCall(301, 2, "connecting");
    setUpCall(301, 3);
    setSignalling(301, "l1");
    attach();
    EXPECT_EQ(bearer("B1.1")->GetOperStatus(), ISDNBChannelStatusIdle);
    EXPECT_EQ(bearer("B1.2")->GetOperStatus(), ISDNBChannelStatusConnecting);
    EXPECT_EQ(bearer("B1.3")->GetOperStatus(), ISDNBChannelStatusActive);
    EXPECT_EQ(isdn()->GetFirstDChannel()->GetOperStatus(), ISDNDChannelStatusL1Active);
}

TEST_F(Z7SimISDNFeatureTest, CallIsToldToTheFeatureThenToTheChannel) {
    plugIn("", trunk(301, 2));
    listen();
    setUpCall(301, 1);
    EXPECT_EQ(m_heard, (Entries{"feature B1.1 2", "channel B1.1 2", "feature B1.1 3",
                                "channel B1.1 3", "feature B1.1 4", "channel B1.1 4"}));
    EXPECT_EQ(bearer("B1.1")->GetOperStatus(), ISDNBChannelStatusActive);
}

TEST_F(Z7SimISDNFeatureTest, ReleaseIsToldOnce) {
    plugIn("", trunk(301, 2));
    setUpCall(301, 1);
    listen();
    releaseCall(301, 1);
    EXPECT_EQ(m_heard, (Entries{"feature B1.1 1", "channel B1.1 1"}));
    EXPECT_EQ(bearer("B1.1")->GetOperStatus(), ISDNBChannelStatusIdle);
}

TEST_F(Z7SimISDNFeatureTest, SignallingChangeIsToldToTheFeatureThenToTheChannel) {
    plugIn("", trunk(301, 2));
    listen();
    setSignalling(301, "inactive");
    setSignalling(301, "l2");
    EXPECT_EQ(m_heard, (Entries{"feature D1 1", "channel D1 1", "feature D1 3", "channel D1 3"}));
    EXPECT_EQ(isdn()->GetFirstDChannel()->GetOperStatus(), ISDNDChannelStatusL2Active);
}

TEST_F(Z7SimISDNFeatureTest, ChannelListenersHearOfTheirChannelOnly) {
    plugIn("", trunk(301, 2) + trunk(302, 2));
    bearer("B1.2")->AddISDNStatusListener(&m_channelLog);
    setUpCall(301, 1, "connecting");
    setUpCall(302, 2, "connecting");
    EXPECT_TRUE(m_heard.empty());
    setUpCall(301, 2, "connecting");
    EXPECT_EQ(m_heard, (Entries{"channel B1.2 2"}));
}

TEST_F(Z7SimISDNFeatureTest, MessagesReachTheChannelsOfTheirTrunk) {
    plugIn("", trunk(301, 30) + trunk(302, 30));
    isdn()->AddISDNStatusListener(&m_featureLog);
    setUpCall(302, 16, "connecting");
    EXPECT_EQ(m_heard, (Entries{"feature B2.17 2"}));
}

TEST_F(Z7SimISDNFeatureTest, MessageOfThePresentStateTellsNobody) {
    plugIn("", trunk(301, 2));
    setUpCall(301, 1);
    listen();
    deliver(kISDNBearerChanged, {5, 301, 1, 4});
    deliver(kISDNBearerChanged, {5, 301, 2, 1});
    deliver(kISDNSignallingChanged, {5, 301, 0, 3});
    EXPECT_TRUE(m_heard.empty());
    deliver(kISDNSignallingChanged, {5, 301, 0, 2});
    EXPECT_EQ(m_heard, (Entries{"feature D1 2", "channel D1 2"}));
}

TEST_F(Z7SimISDNFeatureTest, MessagesThatMakeNoSenseAreIgnored) {
    plugIn("", trunk(301, 2));
    listen();
    for (ISDNChannelMsg const& change :
         {ISDNChannelMsg{5, 301, 0, 2}, ISDNChannelMsg{5, 301, 3, 2}, ISDNChannelMsg{5, 301, -1, 2},
          ISDNChannelMsg{5, 301, 1, 0}, ISDNChannelMsg{5, 301, 1, 5}, ISDNChannelMsg{5, 9, 1, 2}})
        deliver(kISDNBearerChanged, change);
    for (ISDNChannelMsg const& change :
         {ISDNChannelMsg{5, 301, 1, 2}, ISDNChannelMsg{5, 301, 0, 0}, ISDNChannelMsg{5, 301, 0, 4}})
        deliver(kISDNSignallingChanged, change);
    AdminCallbackMsg empty{};
    empty.id = kISDNBearerChanged;
    EXPECT_EQ(ISDNMonitor::instance().HandleEvent(&empty, nullptr), 1);
    EXPECT_TRUE(m_heard.empty());
    EXPECT_EQ(bearer("B1.1")->GetOperStatus(), ISDNBChannelStatusIdle);
    EXPECT_EQ(isdn()->GetFirstDChannel()->GetOperStatus(), ISDNDChannelStatusL2Active);
}

TEST_F(Z7SimISDNFeatureTest, FeatureOfAStoppedBoardHearsNothingMore) {
    plugIn("", trunk(301, 2));
    listen();
    auto const kept = isdn();
    stop();
    EXPECT_EQ(isdn().get(), nullptr);
    setUpCall(301, 1);
    EXPECT_TRUE(m_heard.empty());
    EXPECT_EQ(kept->GetFirstBChannel()->GetOperStatus(), ISDNBChannelStatusIdle);
}

TEST_F(Z7SimISDNFeatureTest, FeatureOfABoardThatHasGoneHearsNothingMore) {
    plugIn("", trunk(301, 2));
    listen();
    auto const kept = isdn();
    sim::command({{"command", "remove"}, {"board", 5}});
    sim::drain();
    deliver(kISDNBearerChanged, {5, 301, 1, 2});
    EXPECT_TRUE(m_heard.empty());
}

TEST_F(Z7SimISDNFeatureTest, FeatureIsBackOnceAfterEveryStart) {
    plugIn("", trunk(301, 2));
    int objects = 0;
    for (int round = 1; round <= 3; ++round) {
        stop();
        EXPECT_EQ(countFeatures<ISDNFeature>(), 0);
        start();
        EXPECT_EQ(countFeatures<ISDNFeature>(), 1);
        EXPECT_EQ(bearerNames().size(), 2U);
        // The factories of former tests have found the board as well by the first start.
        int const present = ReferenceTable::get_instance()->referenced_objects();
        if (round == 1) objects = present;
        EXPECT_EQ(present, objects);
    }
}

TEST_F(Z7SimISDNFeatureTest, CallsSetUpWhileTheBoardIsStoppedAreSeenAfterItsStart) {
    plugIn("", trunk(301, 2));
    stop();
    setUpCall(301, 2);
    start();
    EXPECT_EQ(bearer("B1.2")->GetOperStatus(), ISDNBChannelStatusActive);
    listen();
    releaseCall(301, 2);
    EXPECT_EQ(m_heard, (Entries{"feature B1.2 1"}));
}

TEST_F(Z7SimISDNFeatureTest, BoardThatDoesNotComeUpMakesNoFeature) {
    plugIn("BOARD_CONDITION: 4", trunk(301, 2));
    int const objects = ReferenceTable::get_instance()->referenced_objects();
    sim::set(5, "BOARD_PRESENT", 0);
    static_cast<Z7SimBoard*>(m_board.get())->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(m_board->GetStatus(), BoardStatusStopped);
    EXPECT_EQ(isdn().get(), nullptr);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), objects);
}

TEST_F(Z7SimISDNFeatureTest, ForgottenBoardLeavesNoFeatureBehind) {
    load("", trunk(301, 2));
    m_factory->GetBoardIdentifiers();
    int const objects = ReferenceTable::get_instance()->referenced_objects();
    // NOLINTNEXTLINE(bugprone-unused-raii): gone with its only handle
    ReferenceCounter<Board>(m_factory->MakeBoard(5));
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), objects);
}

TEST(ChannelStateTest, WhatWasReadDoesNotUndoAMessage) {
    ChannelState<ISDNBChannelStatusEnum> state;
    EXPECT_TRUE(state.change(ISDNBChannelStatusConnected));
    state.adopt(ISDNBChannelStatusIdle);
    EXPECT_EQ(state.get(), ISDNBChannelStatusConnected);
}

} // namespace
