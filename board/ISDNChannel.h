// SPDX-License-Identifier: BSD-2-Clause
// The abstract ISDN channels and their status changes.
#pragma once

#include "core/Event.h"
#include "core/ReferenceCounter.h"

/// The states of a bearer channel: ISDN-MIB's isdnBearerOperStatus (RFC 2127).
enum ISDNBChannelStatusEnum : int {
    ISDNBChannelStatusIdle = 1,
    ISDNBChannelStatusConnecting = 2,
    ISDNBChannelStatusConnected = 3,
    ISDNBChannelStatusActive = 4
};

/// The states of a signalling channel: ISDN-MIB's isdnLapdOperStatus (RFC 2127).
enum ISDNDChannelStatusEnum : int {
    ISDNDChannelStatusInactive = 1,
    ISDNDChannelStatusL1Active = 2,
    ISDNDChannelStatusL2Active = 3
};

class ISDNChannelStatusListener;

/// An `ISDNBChannel` is a bearer channel. The concrete class says which operations are thread-safe.
class KVLOAM_API ISDNBChannel : public Object {
  public:
    ISDNBChannel();
    ~ISDNBChannel() override;

    /// Writes the terminated name, at most 63 characters. Returns 0.
    virtual int GetName(char* name) = 0;
    /// ISDN-MIB's isdnBearerChannelType.
    virtual int GetChannelType() = 0;
    /// An `ISDNBChannelStatusEnum`.
    virtual int GetOperStatus() = 0;
    /// The time slot of the channel in its line, from 1.
    virtual int GetChannelNumber() = 0;
    /// The index of the channel's board, as its module numbers boards; -1 until it is set.
    virtual int GetBoardIndex() = 0;
    virtual int SetBoardIndex(int index) = 0;
    /// Adds a listener for this channel only. It is not owned. Returns 0.
    virtual int AddISDNStatusListener(ISDNChannelStatusListener* listener) = 0;
};

/// An `ISDNDChannel` is a signalling channel. The concrete class says which operations are
/// thread-safe.
class KVLOAM_API ISDNDChannel : public Object {
  public:
    ISDNDChannel();
    ~ISDNDChannel() override;

    /// Writes the terminated name, at most 63 characters. Returns 0.
    virtual int GetName(char* name) = 0;
    /// ISDN-MIB's isdnSignalingProtocol.
    virtual int GetProtocol() = 0;
    /// An `ISDNDChannelStatusEnum`.
    virtual int GetOperStatus() = 0;
    /// The number of bearer channels that it controls.
    virtual int GetBChannelCount() = 0;
    /// Writes a terminated text of at most 255 characters. Returns 0.
    virtual int GetCallingAddress(char* address) = 0;
    /// As in `ISDNBChannel`.
    virtual int GetBoardIndex() = 0;
    virtual int SetBoardIndex(int index) = 0;
    virtual int AddISDNStatusListener(ISDNChannelStatusListener* listener) = 0;
};

/// An `ISDNBChannelStatusEvent` is a status change of a bearer channel. It keeps the channel alive.
class KVLOAM_API ISDNBChannelStatusEvent : public Event {
  public:
    ISDNBChannelStatusEvent(ISDNBChannelStatusEnum status, ReferenceCounter<ISDNBChannel> channel);
    ~ISDNBChannelStatusEvent() override;

    virtual ISDNBChannelStatusEnum GetChannelStatus();
    virtual ReferenceCounter<ISDNBChannel> GetBChannel();

  private:
    ISDNBChannelStatusEnum m_status;
    ReferenceCounter<ISDNBChannel> m_channel;
};

/// An `ISDNDChannelStatusEvent` is a status change of a signalling channel. It keeps the channel
/// alive.
class KVLOAM_API ISDNDChannelStatusEvent : public Event {
  public:
    ISDNDChannelStatusEvent(ISDNDChannelStatusEnum status, ReferenceCounter<ISDNDChannel> channel);
    ~ISDNDChannelStatusEvent() override;

    virtual ISDNDChannelStatusEnum GetChannelStatus();
    virtual ReferenceCounter<ISDNDChannel> GetDChannel();

  private:
    ISDNDChannelStatusEnum m_status;
    ReferenceCounter<ISDNDChannel> m_channel;
};

/// An `ISDNChannelStatusListener` receives status changes of both kinds of channels, on the thread
/// that notifies. All listeners of a notification receive the same event object; a listener that
/// keeps the handle keeps the event.
class KVLOAM_API ISDNChannelStatusListener : public EventListener {
  public:
    /// The results are ignored.
    virtual int ProcessBChannelStatusEvent(ReferenceCounter<ISDNBChannelStatusEvent> event) = 0;
    virtual int ProcessDChannelStatusEvent(ReferenceCounter<ISDNDChannelStatusEvent> event) = 0;

  protected:
    ~ISDNChannelStatusListener() = default;
};
