// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimEthernetFeature.h"

#include <cstdio>

#include <utility>

#include "HostEthernet.h"
#include "ObjectAttributes.h"
#include "SimulatedEthernet.h"

Z7SimEthernetFeature::Z7SimEthernetFeature(ReferenceCounter<KVL::Ethernet> ethernet)
    : m_ethernet(std::move(ethernet)) {
    SetFeatureName("Ethernet");
}

Z7SimEthernetFeature::~Z7SimEthernetFeature() = default;

ReferenceCounter<KVL::Ethernet>
Z7SimEthernetFeature::GetNextEthernet(ReferenceCounter<KVL::Ethernet> /*previous*/) {
    return {};
}

std::optional<HostDevice> readHostDevice(long board) {
    std::string const name = textAttribute(board, "ETHERNET_DEVICE");
    if (name.empty()) return std::nullopt;
    if (HostDevice::isName(name)) return HostDevice(name);
    std::fprintf(stderr,
                 "z7sim: board %ld has the ETHERNET_DEVICE \"%s\"; write a network device of this "
                 "host, at most 15 characters without '/'. The board goes without it.\n",
                 board, name.c_str());
    return std::nullopt;
}

ReferenceCounter<KVL::EthernetFeature> makeEthernetFeature(long board,
                                                           std::optional<HostDevice> const& host) {
    if (host) return {new Z7SimEthernetFeature(new HostEthernet(*host))};
    std::string const address = textAttribute(board, "ETHERNET_ADDRESS");
    if (address.empty()) return {};
    return {new Z7SimEthernetFeature(new SimulatedEthernet(board, address))};
}
