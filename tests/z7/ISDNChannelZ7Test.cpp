// SPDX-License-Identifier: BSD-2-Clause
// The channels: names, board index, and their own listeners.
#include <cstring>
#include <string>

#include <gtest/gtest.h>

#include "core/ReferenceTable.h"
#include "tests/support/ChannelLog.h"
#include "tests/support/Slots.h"
#include "z7/ISDNChannelZ7.h"

namespace {

using BChannel = ReferenceCounter<ISDNBChannel>;
using DChannel = ReferenceCounter<ISDNDChannel>;

class BearerChannel final : public ISDNBChannelZ7 {
  public:
    using ISDNBChannelZ7::ISDNBChannelZ7;
    int GetChannelType() override { return 1; }
    int GetOperStatus() override { return ISDNBChannelStatusIdle; }
    int GetChannelNumber() override { return 1; }
};

class SignallingChannel final : public ISDNDChannelZ7 {
  public:
    using ISDNDChannelZ7::ISDNDChannelZ7;
    int GetProtocol() override { return 1; }
    int GetOperStatus() override { return ISDNDChannelStatusInactive; }
    int GetBChannelCount() override { return 23; }
    int GetCallingAddress(char* address) override {
        address[0] = '\0';
        return 0;
    }
};

template <class Channel>
std::string nameOf(char const* name) {
    Channel channel(name);
    char buffer[64];
    std::memset(buffer, '?', sizeof buffer);
    EXPECT_EQ(channel.GetName(buffer), 0);
    return buffer;
}

TEST(ISDNChannelZ7Test, BearerChannelKeepsElevenCharactersOfItsName) {
    EXPECT_EQ(nameOf<BearerChannel>(""), "");
    EXPECT_EQ(nameOf<BearerChannel>("B1"), "B1");
    EXPECT_EQ(nameOf<BearerChannel>("12345678901"), "12345678901");
    EXPECT_EQ(nameOf<BearerChannel>("123456789012"), "12345678901");
}

TEST(ISDNChannelZ7Test, SignallingChannelKeepsSevenCharactersOfItsName) {
    EXPECT_EQ(nameOf<SignallingChannel>(""), "");
    EXPECT_EQ(nameOf<SignallingChannel>("D"), "D");
    EXPECT_EQ(nameOf<SignallingChannel>("1234567"), "1234567");
    EXPECT_EQ(nameOf<SignallingChannel>("12345678"), "1234567");
}

TEST(ISDNChannelZ7Test, BoardIndexIsMinusOneUntilItIsSet) {
    BearerChannel bearer("B1");
    SignallingChannel signalling("D");
    EXPECT_EQ(bearer.GetBoardIndex(), -1);
    EXPECT_EQ(signalling.GetBoardIndex(), -1);
    EXPECT_EQ(bearer.SetBoardIndex(5), 0);
    EXPECT_EQ(signalling.SetBoardIndex(6), 0);
    EXPECT_EQ(bearer.GetBoardIndex(), 5);
    EXPECT_EQ(signalling.GetBoardIndex(), 6);
}

TEST(ISDNChannelZ7Test, BearerChannelTellsItsOwnListenersOnce) {
    auto* const channel = new BearerChannel("B1");
    BChannel const handle(channel);
    BearerChannel other("B2");
    ChannelLog own, foreign;
    EXPECT_EQ(channel->AddISDNStatusListener(&own), 0);
    EXPECT_EQ(channel->AddISDNStatusListener(&own), 0);
    other.AddISDNStatusListener(&foreign);
    EXPECT_EQ(channel->NotifyBChannelStatusListeners(handle, ISDNBChannelStatusActive), 0);
    ASSERT_EQ(own.bearer.size(), 1U);
    EXPECT_EQ(own.bearer[0]->GetBChannel().get(), handle.get());
    EXPECT_EQ(own.bearer[0]->GetChannelStatus(), ISDNBChannelStatusActive);
    EXPECT_TRUE(foreign.bearer.empty());
}

TEST(ISDNChannelZ7Test, SignallingChannelTellsItsOwnListenersOnce) {
    auto* const channel = new SignallingChannel("D");
    DChannel const handle(channel);
    SignallingChannel other("E");
    ChannelLog own, foreign;
    EXPECT_EQ(channel->AddISDNStatusListener(&own), 0);
    EXPECT_EQ(channel->AddISDNStatusListener(&own), 0);
    other.AddISDNStatusListener(&foreign);
    EXPECT_EQ(channel->NotifyDChannelStatusListeners(handle, ISDNDChannelStatusL1Active), 0);
    ASSERT_EQ(own.signalling.size(), 1U);
    EXPECT_EQ(own.signalling[0]->GetDChannel().get(), handle.get());
    EXPECT_EQ(own.signalling[0]->GetChannelStatus(), ISDNDChannelStatusL1Active);
    EXPECT_TRUE(foreign.signalling.empty());
}

TEST(ISDNChannelZ7Test, NotificationWithoutListenersLeavesNothingBehind) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    {
        auto* const bearer = new BearerChannel("B1");
        BChannel const handle(bearer);
        EXPECT_EQ(bearer->NotifyBChannelStatusListeners(handle, ISDNBChannelStatusIdle), 0);
        auto* const signalling = new SignallingChannel("D");
        DChannel const other(signalling);
        EXPECT_EQ(signalling->NotifyDChannelStatusListeners(other, ISDNDChannelStatusInactive), 0);
        EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before + 2);
    }
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST(ISDNChannelZ7Test, ListenerAddedDuringANotificationIsCalledToo) {
    auto* const channel = new BearerChannel("B1");
    BChannel const handle(channel);
    ChannelLog first, late;
    first.meanwhile = [&] { channel->AddISDNStatusListener(&late); };
    channel->AddISDNStatusListener(&first);
    channel->NotifyBChannelStatusListeners(handle, ISDNBChannelStatusIdle);
    EXPECT_EQ(late.bearer.size(), 1U);
}

template <class Derived, class Base>
constexpr bool kHasPlainBase = requires(Base* base) {
    static_cast<Derived*>(base);
};

TEST(ISDNChannelZ7Test, BaseOfTheBearerChannelAloneIsVirtual) {
    EXPECT_FALSE((kHasPlainBase<ISDNBChannelZ7, ISDNBChannel>));
    EXPECT_TRUE((kHasPlainBase<ISDNDChannelZ7, ISDNDChannel>));
}

TEST(ISDNChannelZ7Test, BearerChannelOperationsStandInATableOfTheirOwn) {
    int slot = 2;
    EXPECT_EQ(slotOf(&ISDNBChannelZ7::GetName), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannelZ7::GetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannelZ7::SetBoardIndex), slot++);
    EXPECT_EQ(slotOf(&ISDNBChannelZ7::AddISDNStatusListener), slot++);
}

TEST(ISDNChannelZ7Test, SignallingChannelOperationsKeepTheSlotsOfTheAbstractOnes) {
    EXPECT_EQ(slotOf(&ISDNDChannelZ7::GetName), 2);
    EXPECT_EQ(slotOf(&ISDNDChannelZ7::GetBoardIndex), 7);
    EXPECT_EQ(slotOf(&ISDNDChannelZ7::SetBoardIndex), 8);
    EXPECT_EQ(slotOf(&ISDNDChannelZ7::AddISDNStatusListener), 9);
}

} // namespace
