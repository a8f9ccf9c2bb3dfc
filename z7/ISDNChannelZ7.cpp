// SPDX-License-Identifier: BSD-2-Clause
#include "z7/ISDNChannelZ7.h"

#include <cstddef>
#include <cstring>
#include <utility>

namespace {

/// Copies as much of `from` as fits, terminated.
template <std::size_t size>
void copyBounded(char (&to)[size], char const* from) {
    std::size_t const length = strnlen(from, size - 1);
    std::memcpy(to, from, length);
    to[length] = '\0';
}

} // namespace

ISDNBChannelZ7::ISDNBChannelZ7(char const* name) {
    copyBounded(m_name, name);
}

ISDNBChannelZ7::~ISDNBChannelZ7() = default;

int ISDNBChannelZ7::GetName(char* name) {
    std::strcpy(name, m_name);
    return 0;
}

int ISDNBChannelZ7::GetBoardIndex() {
    return m_boardIndex;
}

int ISDNBChannelZ7::SetBoardIndex(int index) {
    m_boardIndex = index;
    return 0;
}

int ISDNBChannelZ7::AddISDNStatusListener(ISDNChannelStatusListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

int ISDNBChannelZ7::NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel> channel,
                                                  ISDNBChannelStatusEnum status) {
    KVL::notify_channel_status(m_listeners, this, std::move(channel), status);
    return 0;
}

ISDNDChannelZ7::ISDNDChannelZ7(char const* name) {
    copyBounded(m_name, name);
}

ISDNDChannelZ7::~ISDNDChannelZ7() = default;

int ISDNDChannelZ7::GetName(char* name) {
    std::strcpy(name, m_name);
    return 0;
}

int ISDNDChannelZ7::GetBoardIndex() {
    return m_boardIndex;
}

int ISDNDChannelZ7::SetBoardIndex(int index) {
    m_boardIndex = index;
    return 0;
}

int ISDNDChannelZ7::AddISDNStatusListener(ISDNChannelStatusListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

int ISDNDChannelZ7::NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel> channel,
                                                  ISDNDChannelStatusEnum status) {
    KVL::notify_channel_status(m_listeners, this, std::move(channel), status);
    return 0;
}

namespace KVL {

void notify_channel_status(ListenerTable& listeners, Object* guard,
                           ReferenceCounter<ISDNBChannel>&& channel,
                           ISDNBChannelStatusEnum status) {
    ReferenceCounter<ISDNBChannelStatusEvent> const event(
        new ISDNBChannelStatusEvent(status, std::move(channel)));
    for_each_listener<ISDNChannelStatusListener>(
        listeners, guard, [&](auto* listener) { listener->ProcessBChannelStatusEvent(event); });
}

void notify_channel_status(ListenerTable& listeners, Object* guard,
                           ReferenceCounter<ISDNDChannel>&& channel,
                           ISDNDChannelStatusEnum status) {
    ReferenceCounter<ISDNDChannelStatusEvent> const event(
        new ISDNDChannelStatusEvent(status, std::move(channel)));
    for_each_listener<ISDNChannelStatusListener>(
        listeners, guard, [&](auto* listener) { listener->ProcessDChannelStatusEvent(event); });
}

} // namespace KVL
