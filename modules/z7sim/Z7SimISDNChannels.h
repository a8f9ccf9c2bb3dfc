// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a board, whose states follow the platform's messages.
#pragma once

#include <atomic>
#include <mutex>
#include <string>

#include "board/ISDNCall.h"
#include "board/ISDNChannelOnLine.h"
#include "boardplatform/isdn_channels.h"
#include "z7/ISDNChannelZ7.h"

/// A `ChannelState` is a channel's state, which comes with messages and, before the first of them,
/// from a reading of the platform. Thread-safe.
template <class State>
class ChannelState {
  public:
    int get() const { return m_state; }
    /// Takes what the platform answered, unless a message has come already: what was read may be
    /// older than the message, and if it is not, there are more messages to come.
    void adopt(State state) {
        int unread = kUnread;
        m_state.compare_exchange_strong(unread, state);
    }
    /// Takes what a message said. Returns whether that is a change.
    bool change(State state) { return m_state.exchange(state) != state; }

  private:
    static constexpr int kUnread = 0;
    std::atomic<int> m_state{kUnread};
};

/// A bearer channel of a trunk.
class Z7SimBChannel final : public ISDNBChannelZ7,
                            public ISDNChannelOnLine,
                            public ISDNCallChannel {
  public:
    /// `timeSlot`: from 1. `board`: the board's handle in the device mapper. `line`: the trunk's
    /// line, may be empty.
    Z7SimBChannel(std::string const& name, int timeSlot, int board,
                  ReferenceCounter<DS1LineDevice> line);
    ~Z7SimBChannel() override;

    /// All calls are dialled.
    int GetChannelType() override;
    int GetOperStatus() override { return m_state.get(); }
    int GetChannelNumber() override { return m_timeSlot; }
    ReferenceCounter<DS1LineDevice> GetLine() override { return m_line; }

    ISDNCallDetails GetCall() override;

    ChannelState<ISDNBChannelStatusEnum>& state() { return m_state; }
    /// Takes the platform's record of the channel's call.
    void setCall(ISDNCallRecord const& record);

  private:
    std::mutex m_mutex; ///< guards the call
    ISDNCallDetails m_call;
    int const m_timeSlot;
    ReferenceCounter<DS1LineDevice> const m_line;
    ChannelState<ISDNBChannelStatusEnum> m_state;
};

/// The signalling channel of a trunk.
class Z7SimDChannel final : public ISDNDChannelZ7,
                            public ISDNChannelOnLine,
                            public ISDNCountingChannel {
  public:
    /// `device`: the trunk's handle in the device mapper; its protocol and address are read now.
    Z7SimDChannel(std::string const& name, long device, int bearers, int board,
                  ReferenceCounter<DS1LineDevice> line);
    ~Z7SimDChannel() override;

    /// `KVL::kNotSupported` when the platform knows no protocol.
    int GetProtocol() override { return m_protocol; }
    int GetOperStatus() override { return m_state.get(); }
    int GetBChannelCount() override { return m_bearers; }
    /// Empty when the trunk has none.
    int GetCallingAddress(char* address) override;
    ReferenceCounter<DS1LineDevice> GetLine() override { return m_line; }
    /// Asks the platform.
    int GetCounts(ISDNSignallingCounts& counts) override;
    int GetCallingSubAddress(char* address) override;

    ChannelState<ISDNDChannelStatusEnum>& state() { return m_state; }

  private:
    int const m_protocol;
    int const m_bearers;
    long const m_device;
    std::string const m_callingAddress;
    std::string const m_callingSubAddress;
    ReferenceCounter<DS1LineDevice> const m_line;
    ChannelState<ISDNDChannelStatusEnum> m_state;
};
