// SPDX-License-Identifier: BSD-2-Clause
#include "z7/ISDNFeatureZ7.h"

#include <utility>

#include "core/HandleWalk.h"
#include "z7/ISDNChannelZ7.h"

ISDNFeatureZ7::ISDNFeatureZ7() = default;

ISDNFeatureZ7::~ISDNFeatureZ7() = default;

int ISDNFeatureZ7::AddISDNStatusListener(ISDNChannelStatusListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

ReferenceCounter<ISDNBChannel>
ISDNFeatureZ7::GetFirstChannel(ReferenceCounter<ISDNBChannel> /*kind*/) {
    return KVL::first_in(m_bearerChannels);
}

ReferenceCounter<ISDNBChannel>
ISDNFeatureZ7::GetNextChannel(ReferenceCounter<ISDNBChannel> previous) {
    return KVL::next_in(m_bearerChannels, previous);
}

ReferenceCounter<ISDNDChannel>
ISDNFeatureZ7::GetFirstChannel(ReferenceCounter<ISDNDChannel> /*kind*/) {
    return KVL::first_in(m_signallingChannels);
}

ReferenceCounter<ISDNDChannel>
ISDNFeatureZ7::GetNextChannel(ReferenceCounter<ISDNDChannel> previous) {
    return KVL::next_in(m_signallingChannels, previous);
}

ReferenceCounter<ISDNBChannel> ISDNFeatureZ7::GetBChannel(char* name) {
    return KVL::find_named(
        GetFirstBChannel(), [this](auto const& channel) { return GetNextChannel(channel); }, name);
}

ReferenceCounter<ISDNBChannel> ISDNFeatureZ7::GetBChannel(long /*index*/) {
    return KVL::past_all(GetFirstBChannel(),
                         [this](auto const& channel) { return GetNextChannel(channel); });
}

ReferenceCounter<ISDNDChannel> ISDNFeatureZ7::GetDChannel(char* name) {
    return KVL::find_named(
        GetFirstDChannel(), [this](auto const& channel) { return GetNextChannel(channel); }, name);
}

ReferenceCounter<ISDNDChannel> ISDNFeatureZ7::GetDChannel(long /*index*/) {
    return KVL::past_all(GetFirstDChannel(),
                         [this](auto const& channel) { return GetNextChannel(channel); });
}

int ISDNFeatureZ7::NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel> channel,
                                                 ISDNBChannelStatusEnum status) {
    KVL::notify_channel_status(m_listeners, this, std::move(channel), status);
    return 0;
}

int ISDNFeatureZ7::NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel> channel,
                                                 ISDNDChannelStatusEnum status) {
    KVL::notify_channel_status(m_listeners, this, std::move(channel), status);
    return 0;
}
