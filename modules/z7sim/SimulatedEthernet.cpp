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
