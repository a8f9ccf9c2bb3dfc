// SPDX-License-Identifier: BSD-2-Clause
// The devices of a board by kind, as the device mapper described them when the board started.
#pragma once

#include "access/DevMapDeviceIf.h"
#include "board/ISDNChannel.h"
#include "core/ReferenceCounter.h"
#include "z7/Z7Device.h"

/// DS1-MIB's dsx1LineStatus of the line of `device`; -1 when it is not known.
int lineStatus(long device);

/// Where a device is on its board.
struct DevicePlace {
    int board = -1; ///< the board's index
    int number = 0; ///< among the devices of its kind, from 1
};

/// What every device answers. `Kind` is one of `Z7Device`'s abstract classes.
template <class Kind>
class Z7SimDevice : public Kind {
  public:
    Z7SimDevice(DevMapDeviceIf const& record, DevicePlace place)
        : Kind(record.Name().c_str()), m_place(place) {
        this->m_type = static_cast<int>(record.DeviceType());
    }

    /// Up: the devices of a board run as long as the board does.
    int GetStatus() override { return 1; }
    int GetBoardIndex() override { return m_place.board; }
    int GetDeviceNumber() override { return m_place.number; }

  private:
    DevicePlace const m_place;
};

/// A pool of voice channels. What the platform does not say is -1.
class Z7SimVoiceDevice final : public Z7SimDevice<Z7VoiceDevice> {
  public:
    Z7SimVoiceDevice(DevMapDeviceIf const& record, DevicePlace place);
    ~Z7SimVoiceDevice() override;

    int GetCoderType() override { return m_coderType; }
    int GetChannelState() override { return m_channelState; }
    int GetGain() override { return m_gain; }
    int GetEchoCancellation() override { return m_echoCancellation; }

  private:
    int const m_coderType;
    int const m_channelState;
    int const m_gain;
    int const m_echoCancellation;
};

/// What a trunk reads of itself when it is made. What the platform does not say is -1.
struct TrunkFacts {
    /// `line`: the number of the trunk's line on the board, from 1.
    TrunkFacts(long device, int line);

    long device;
    int lineNumber;
    int lineType;
    int protocolType;
};

/// A trunk of either kind: `Z7TRKDevice` or `Z7ISDNDevice`.
template <class Kind>
class Z7SimTrunk : public Z7SimDevice<Kind> {
  public:
    Z7SimTrunk(DevMapDeviceIf const& record, DevicePlace place, int line)
        : Z7SimDevice<Kind>(record, place), m_facts(record.Auid(), line) {}

    int GetLineNumber() override { return m_facts.lineNumber; }
    int GetLineType() override { return m_facts.lineType; }
    int GetLineStatus() override { return lineStatus(m_facts.device); }
    int GetProtocolType() override { return m_facts.protocolType; }

  private:
    TrunkFacts const m_facts;
};

/// A trunk that carries ISDN. It asks its signalling channel; without one it answers -1.
class Z7SimISDNDevice final : public Z7SimTrunk<Z7ISDNDevice> {
  public:
    Z7SimISDNDevice(DevMapDeviceIf const& record, DevicePlace place, int line,
                    ReferenceCounter<ISDNDChannel> signalling);
    ~Z7SimISDNDevice() override;

    int GetBChannelCount() override;
    int GetDChannelStatus() override;

  private:
    ReferenceCounter<ISDNDChannel> const m_signalling;
};

/// A station or switching interface with as many time slots as it has channels.
class Z7SimSTNDevice final : public Z7SimDevice<Z7STNDevice> {
  public:
    Z7SimSTNDevice(DevMapDeviceIf const& record, DevicePlace place);
    ~Z7SimSTNDevice() override;

    int GetTimeSlotCount() override { return m_timeSlots; }

  private:
    int const m_timeSlots;
};
