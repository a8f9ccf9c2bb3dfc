// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimISDNChannels.h"

#include <cstring>
#include <mutex>
#include <utility>

#include "CopyText.h"
#include "ObjectAttributes.h"
#include "board/Interface.h"

namespace {

constexpr int kDialup = 1; ///< of ISDN-MIB's isdnBearerChannelType

/// The numbers of ISDN-MIB's IsdnSignalingProtocol.
int protocolOf(long device) {
    auto const protocol = numberAttribute(device, kISDNProtocol);
    if (!protocol) return KVL::kNotSupported;
    switch (static_cast<ISDNProtocol>(*protocol)) {
    case ISDNProtocol::national2:
        return 10; // ni2
    case ISDNProtocol::ess4:
        return 5;
    case ISDNProtocol::dms100:
        return 7;
    case ISDNProtocol::etsi:
        return 3;
    case ISDNProtocol::qsig:
        return 23;
    case ISDNProtocol::ins1500:
        return 18;
    }
    return 1; // other
}

} // namespace

Z7SimBChannel::Z7SimBChannel(std::string const& name, int timeSlot, int board,
                             ReferenceCounter<DS1LineDevice> line)
    : ISDNBChannelZ7(name.c_str()), m_timeSlot(timeSlot), m_line(std::move(line)) {
    ISDNBChannelZ7::SetBoardIndex(board);
}

Z7SimBChannel::~Z7SimBChannel() = default;

int Z7SimBChannel::GetChannelType() {
    return kDialup;
}

ISDNCallDetails Z7SimBChannel::GetCall() {
    std::scoped_lock const guard(m_mutex);
    return m_call;
}

void Z7SimBChannel::setCall(ISDNCallRecord const& record) {
    ISDNCallDetails call;
    static_assert(sizeof call.peerAddress >= sizeof record.peer &&
                  sizeof call.peerSubAddress >= sizeof record.peerSubAddress);
    std::memcpy(call.peerAddress, record.peer, sizeof record.peer - 1);
    std::memcpy(call.peerSubAddress, record.peerSubAddress, sizeof record.peerSubAddress - 1);
    call.origin = record.origin;
    call.informationType = record.information;
    call.multirate = record.multirate == 1 ? 1 : 2;
    call.chargedUnits = record.chargedUnits;
    call.setupTime = static_cast<long>(record.setupTime);
    call.connectTime = static_cast<long>(record.connectTime);
    std::scoped_lock const guard(m_mutex);
    m_call = call;
}

Z7SimDChannel::Z7SimDChannel(std::string const& name, long device, int bearers, int board,
                             ReferenceCounter<DS1LineDevice> line)
    : ISDNDChannelZ7(name.c_str()),
      m_protocol(protocolOf(device)),
      m_bearers(bearers),
      m_device(device),
      m_callingAddress(textAttribute(device, kISDNCallingAddress)),
      m_callingSubAddress(textAttribute(device, kISDNCallingSubAddress).substr(0, 63)),
      m_line(std::move(line)) {
    ISDNDChannelZ7::SetBoardIndex(board);
}

Z7SimDChannel::~Z7SimDChannel() = default;

int Z7SimDChannel::GetCallingAddress(char* address) {
    return copyText(m_callingAddress, address);
}

int Z7SimDChannel::GetCallingSubAddress(char* address) {
    return copyText(m_callingSubAddress, address);
}

int Z7SimDChannel::GetCounts(ISDNSignallingCounts& counts) {
    ISDNSignallingCounters read{};
    if (bytesAttribute(m_device, kISDNSignallingCounters, &read, sizeof read) != sizeof read)
        return 1;
    counts = {read.inCalls,      read.inConnected, read.outCalls, read.outConnected,
              read.chargedUnits, read.peerSabme,   read.recvdFrmr};
    return 0;
}
