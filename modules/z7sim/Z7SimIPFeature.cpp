// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimIPFeature.h"

#include <utility>

#include "IPAddresses.h"

Z7SimIPFeature::Z7SimIPFeature(ReferenceCounter<KVL::Interface> interface)
    : m_interface(std::move(interface)) {
    SetFeatureName("IP");
}

Z7SimIPFeature::~Z7SimIPFeature() = default;

ReferenceCounter<KVL::Interface>
Z7SimIPFeature::GetNextInterface(ReferenceCounter<KVL::Interface> /*previous*/) {
    return {};
}

ReferenceCounter<KVL::InterfaceFeature>
makeIPFeature(long board, std::optional<HostDevice> const& host,
              ReferenceCounter<KVL::EthernetFeature> const& ethernet) {
    auto addresses = readBoardAddresses(board);
    if (!addresses && host) addresses = readHostAddresses(host->name());
    if (!addresses || addresses->empty()) return {};
    ReferenceCounter<KVL::Ethernet> below;
    if (ethernet.get() != nullptr) below = ethernet->GetFirstEthernet();
    return {new Z7SimIPFeature(ReferenceCounter<KVL::Interface>(
        new Z7SimIPInterface(std::move(*addresses), std::move(below))))};
}
