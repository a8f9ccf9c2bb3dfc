// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimDevices.h"

#include <utility>

#include "ObjectAttributes.h"
#include "boardplatform/ds1_line.h"

namespace {

int numberOf(long device, char const* attribute) {
    return readNumber(device, attribute).value_or(-1);
}

} // namespace

int lineStatus(long /*device*/) {
    return -1;
}

Z7SimVoiceDevice::Z7SimVoiceDevice(DevMapDeviceIf const& record, DevicePlace place)
    : Z7SimDevice(record, place),
      m_coderType(numberOf(record.Auid(), "CODER_TYPE")),
      m_channelState(numberOf(record.Auid(), "CHANNEL_STATE")),
      m_gain(numberOf(record.Auid(), "GAIN")),
      m_echoCancellation(numberOf(record.Auid(), "ECHO_CANCELLATION")) {}

Z7SimVoiceDevice::~Z7SimVoiceDevice() = default;

TrunkFacts::TrunkFacts(long device_, int line)
    : device(device_),
      lineNumber(line),
      lineType(numberOf(device, kDS1LineType)),
      protocolType(numberOf(device, "Protocol_Type_0")) {}

Z7SimISDNDevice::Z7SimISDNDevice(DevMapDeviceIf const& record, DevicePlace place, int line,
                                 ReferenceCounter<ISDNDChannel> signalling)
    : Z7SimTrunk(record, place, line), m_signalling(std::move(signalling)) {}

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
