// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimISDNChannels.h"

#include <cstring>
#include <utility>

#include "ObjectAttributes.h"
#include "board/Interface.h"

namespace {

constexpr int kDialup = 1; ///< of ISDN-MIB's isdnBearerChannelType

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
      m_protocol(numberAttributeOr(device, "Protocol_Type_0", KVL::kNotSupported)),
      m_bearers(bearers),
      m_trunkName(textAttribute(device, "NAME")),
      m_line(std::move(line)) {
    ISDNDChannelZ7::SetBoardIndex(board);
}

Z7SimDChannel::~Z7SimDChannel() = default;

int Z7SimDChannel::GetCallingAddress(char* address) {
    std::memcpy(address, m_trunkName.c_str(), m_trunkName.size() + 1);
    return 0;
}
