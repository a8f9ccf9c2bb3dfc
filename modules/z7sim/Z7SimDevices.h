// SPDX-License-Identifier: BSD-2-Clause
// The devices of a board by kind, as the device mapper described them when the board started.
#pragma once

#include <utility>

#include "access/DevMapDeviceIf.h"
#include "board/DS1LineDevice.h"
#include "board/ISDNChannel.h"
#include "core/ReferenceCounter.h"
#include "z7/Z7Device.h"

/// Where a device is on its board.
struct DevicePlace {
    int board = -1; ///< the board's index
    int number = 0; ///< among the devices of its kind, from 1
};

/// The answers that all devices share. `Kind` is one of `Z7Device`'s abstract classes.
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

/// A pool of voice channels. What the platform does not know is -1.
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

/// The answers of a trunk, read when it is constructed, except for the status of its line. -1
/// stands for what the platform does not know, and for everything about the line if there is none.
struct TrunkFacts {
    /// `ds1Line`: an empty handle when the trunk has no line.
    TrunkFacts(long device, ReferenceCounter<DS1LineDevice> ds1Line);

    int lineStatus() const;

    int lineNumber; ///< the line's `GetLineIndex`
    int lineType;
    int protocolType;
    ReferenceCounter<DS1LineDevice> line;
};

/// A trunk of either kind: `Z7TRKDevice` or `Z7ISDNDevice`.
template <class Kind>
class Z7SimTrunk : public Z7SimDevice<Kind> {
  public:
    Z7SimTrunk(DevMapDeviceIf const& record, DevicePlace place, TrunkFacts facts)
        : Z7SimDevice<Kind>(record, place), m_facts(std::move(facts)) {}

    int GetLineNumber() override { return m_facts.lineNumber; }
    int GetLineType() override { return m_facts.lineType; }
    int GetLineStatus() override { return m_facts.lineStatus(); }
    int GetProtocolType() override { return m_facts.protocolType; }

  private:
    TrunkFacts const m_facts;
};

/// A trunk that carries ISDN. It asks its signalling channel; without one it answers -1.
class Z7SimISDNDevice final : public Z7SimTrunk<Z7ISDNDevice> {
  public:
    Z7SimISDNDevice(DevMapDeviceIf const& record, DevicePlace place, TrunkFacts facts,
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
