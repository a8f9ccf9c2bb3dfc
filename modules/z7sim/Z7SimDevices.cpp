// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimDevices.h"

#include <utility>

#include "ObjectAttributes.h"
#include "boardplatform/ds1_line.h"

Z7SimVoiceDevice::Z7SimVoiceDevice(DevMapDeviceIf const& record, DevicePlace place)
    : Z7SimDevice(record, place),
      m_coderType(numberAttributeOr(record.Auid(), "CODER_TYPE", -1)),
      m_channelState(numberAttributeOr(record.Auid(), "CHANNEL_STATE", -1)),
      m_gain(numberAttributeOr(record.Auid(), "GAIN", -1)),
      m_echoCancellation(numberAttributeOr(record.Auid(), "ECHO_CANCELLATION", -1)) {}

Z7SimVoiceDevice::~Z7SimVoiceDevice() = default;

TrunkFacts::TrunkFacts(long device, ReferenceCounter<DS1LineDevice> ds1Line)
    : lineNumber(ds1Line.get() == nullptr ? -1 : ds1Line->GetLineIndex()),
      lineType(ds1Line.get() == nullptr ? numberAttributeOr(device, kDS1LineType, -1)
                                        : ds1Line->GetLineType()),
      protocolType(numberAttributeOr(device, "Protocol_Type_0", -1)),
      line(std::move(ds1Line)) {}

int TrunkFacts::lineStatus() const {
    return line.get() == nullptr ? -1 : line->GetLineStatus();
}

Z7SimISDNDevice::Z7SimISDNDevice(DevMapDeviceIf const& record, DevicePlace place, TrunkFacts facts,
                                 ReferenceCounter<ISDNDChannel> signalling)
    : Z7SimTrunk(record, place, std::move(facts)), m_signalling(std::move(signalling)) {}

Z7SimISDNDevice::~Z7SimISDNDevice() = default;

int Z7SimISDNDevice::GetBChannelCount() {
    return m_signalling.get() == nullptr ? -1 : m_signalling->GetBChannelCount();
}

int Z7SimISDNDevice::GetDChannelStatus() {
    return m_signalling.get() == nullptr ? -1 : m_signalling->GetOperStatus();
}

Z7SimSTNDevice::Z7SimSTNDevice(DevMapDeviceIf const& record, DevicePlace place)
    : Z7SimDevice(record, place), m_timeSlots(static_cast<int>(record.ChannelCount())) {}

Z7SimSTNDevice::~Z7SimSTNDevice() = default;
