// SPDX-License-Identifier: BSD-2-Clause
#include "board/ISDNChannel.h"

#include <utility>

ISDNBChannel::ISDNBChannel() = default;

ISDNBChannel::~ISDNBChannel() = default;

ISDNDChannel::ISDNDChannel() = default;

ISDNDChannel::~ISDNDChannel() = default;

ISDNBChannelStatusEvent::ISDNBChannelStatusEvent(ISDNBChannelStatusEnum status,
                                                 ReferenceCounter<ISDNBChannel> channel)
    : m_status(status), m_channel(std::move(channel)) {}

ISDNBChannelStatusEvent::~ISDNBChannelStatusEvent() = default;

ISDNBChannelStatusEnum ISDNBChannelStatusEvent::GetChannelStatus() {
    return m_status;
}

ReferenceCounter<ISDNBChannel> ISDNBChannelStatusEvent::GetBChannel() {
    return m_channel;
}

ISDNDChannelStatusEvent::ISDNDChannelStatusEvent(ISDNDChannelStatusEnum status,
                                                 ReferenceCounter<ISDNDChannel> channel)
    : m_status(status), m_channel(std::move(channel)) {}

ISDNDChannelStatusEvent::~ISDNDChannelStatusEvent() = default;

ISDNDChannelStatusEnum ISDNDChannelStatusEvent::GetChannelStatus() {
    return m_status;
}

ReferenceCounter<ISDNDChannel> ISDNDChannelStatusEvent::GetDChannel() {
    return m_channel;
}
