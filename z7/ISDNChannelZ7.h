// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of Z7 boards.
#pragma once

#include <atomic>

#include "board/ISDNChannel.h"
#include "core/ListenerTable.h"

/// An `ISDNBChannelZ7` is a bearer channel with a name, a board index and listeners of its own.
/// Thread-safe; the channel's lock guards the listeners.
class KVLOAM_API ISDNBChannelZ7 : public virtual ISDNBChannel {
  public:
    static constexpr int kMaxNameLength = 11;

    /// Copies `name`, cut to `kMaxNameLength` characters. The board index is -1.
    explicit ISDNBChannelZ7(char const* name);
    ~ISDNBChannelZ7() override;

    int GetName(char* name) override;
    int GetBoardIndex() override;
    int SetBoardIndex(int index) override;
    int AddISDNStatusListener(ISDNChannelStatusListener* listener) override;

    /// Passes one event of `channel`, a handle of this channel, to the channel's own listeners, on
    /// the caller's thread. Returns 0.
    int NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel> channel,
                                      ISDNBChannelStatusEnum status);

  private:
    ListenerTable m_listeners;
    char m_name[kMaxNameLength + 1];
    std::atomic<int> m_boardIndex{-1};
};

/// An `ISDNDChannelZ7` is a signalling channel, otherwise like the bearer channel.
/// Deliberate: its base is not virtual, unlike the bearer channel's; modules depend on both.
class KVLOAM_API ISDNDChannelZ7 : public ISDNDChannel {
  public:
    static constexpr int kMaxNameLength = 7;

    /// Copies `name`, cut to `kMaxNameLength` characters. The board index is -1.
    explicit ISDNDChannelZ7(char const* name);
    ~ISDNDChannelZ7() override;

    int GetName(char* name) override;
    int GetBoardIndex() override;
    int SetBoardIndex(int index) override;
    int AddISDNStatusListener(ISDNChannelStatusListener* listener) override;

    /// As in `ISDNBChannelZ7`.
    int NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel> channel,
                                      ISDNDChannelStatusEnum status);

  private:
    ListenerTable m_listeners;
    char m_name[kMaxNameLength + 1];
    std::atomic<int> m_boardIndex{-1};
};

namespace KVL {

/// Creates one event and passes it to every ISDN channel status listener of `listeners`, in order.
/// `guard` as in `for_each_listener`.
void notify_channel_status(ListenerTable& listeners, Object* guard,
                           ReferenceCounter<ISDNBChannel>&& channel, ISDNBChannelStatusEnum status);
void notify_channel_status(ListenerTable& listeners, Object* guard,
                           ReferenceCounter<ISDNDChannel>&& channel, ISDNDChannelStatusEnum status);

} // namespace KVL
