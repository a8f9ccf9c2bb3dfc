// SPDX-License-Identifier: BSD-2-Clause
#include "SimulatedEthernet.h"

#include "ObjectAttributes.h"

SimulatedEthernet::SimulatedEthernet(long board, std::string const& address)
    : Z7SimEthernet("Ethernet interface " + address),
      m_board(board),
      m_address(parsePhysAddress(address)),
      m_mtu(number("ETHERNET_MTU")),
      m_speed(number("ETHERNET_SPEED")) {}

SimulatedEthernet::~SimulatedEthernet() = default;

int SimulatedEthernet::number(char const* attribute) const {
    return numberAttributeOr(m_board, attribute, KVL::kNotSupported);
}

int SimulatedEthernet::GetType() {
    return kTypeEthernet;
}

int SimulatedEthernet::GetPhysAddress(char* buffer, int& length) {
    return answerPhysAddress(m_address, buffer, length);
}

int SimulatedEthernet::GetInOctets() {
    return number("ETHERNET_IN_OCTETS");
}

int SimulatedEthernet::GetOutOctets() {
    return number("ETHERNET_OUT_OCTETS");
}

int SimulatedEthernet::GetFCSErrors() {
    return number("ETHERNET_FCS_ERRORS");
}

int SimulatedEthernet::GetInUcastPkts() {
    return number("ETHERNET_IN_PACKETS");
}

int SimulatedEthernet::GetInDiscards() {
    return number("ETHERNET_IN_DISCARDS");
}

int SimulatedEthernet::GetInErrors() {
    return number("ETHERNET_IN_ERRORS");
}

int SimulatedEthernet::GetInUnknownProtos() {
    return number("ETHERNET_IN_UNKNOWN_PROTOCOLS");
}

int SimulatedEthernet::GetOutUcastPkts() {
    return number("ETHERNET_OUT_PACKETS");
}

int SimulatedEthernet::GetOutDiscards() {
    return number("ETHERNET_OUT_DISCARDS");
}

int SimulatedEthernet::GetOutErrors() {
    return number("ETHERNET_OUT_ERRORS");
}

int SimulatedEthernet::GetAlignmentErrors() {
    return number("ETHERNET_ALIGNMENT_ERRORS");
}

int SimulatedEthernet::GetInternalMacTransmitErrors() {
    return number("ETHERNET_MAC_TRANSMIT_ERRORS");
}

int SimulatedEthernet::GetFrameTooLongs() {
    return number("ETHERNET_TOO_LONG_FRAMES");
}

int SimulatedEthernet::GetInternalMacReceiveErrors() {
    return number("ETHERNET_MAC_RECEIVE_ERRORS");
}

int SimulatedEthernet::GetSymbolErrors() {
    return number("ETHERNET_SYMBOL_ERRORS");
}

int SimulatedEthernet::GetDuplexStatus() {
    return number("ETHERNET_DUPLEX");
}

int SimulatedEthernet::GetOperStatus() {
    return number("ETHERNET_OPER_STATUS");
}

int SimulatedEthernet::GetInMulticastPkts() {
    return number("ETHERNET_IN_MULTICASTS");
}

int SimulatedEthernet::GetInBroadcastPkts() {
    return number("ETHERNET_IN_BROADCASTS");
}

int SimulatedEthernet::GetOutMulticastPkts() {
    return number("ETHERNET_OUT_MULTICASTS");
}

int SimulatedEthernet::GetOutBroadcastPkts() {
    return number("ETHERNET_OUT_BROADCASTS");
}
