// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimISDNChannels.h"

#include <utility>

#include "CopyText.h"
#include "ObjectAttributes.h"
#include "board/Interface.h"
#include "boardplatform/isdn_channels.h"

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

Z7SimDChannel::Z7SimDChannel(std::string const& name, long device, int bearers, int board,
                             ReferenceCounter<DS1LineDevice> line)
    : ISDNDChannelZ7(name.c_str()),
      m_protocol(protocolOf(device)),
      m_bearers(bearers),
      m_callingAddress(textAttribute(device, kISDNCallingAddress)),
      m_line(std::move(line)) {
    ISDNDChannelZ7::SetBoardIndex(board);
}

Z7SimDChannel::~Z7SimDChannel() = default;

int Z7SimDChannel::GetCallingAddress(char* address) {
    return copyText(m_callingAddress, address);
}
