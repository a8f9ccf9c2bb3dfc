// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimIPInterface.h"

#include <utility>

#include "core/HandleWalk.h"

namespace {

/// What `query` of the Ethernet interface answers; not supported without one.
template <class... Parameters, class... Arguments>
int ask(ReferenceCounter<KVL::Ethernet> const& ethernet,
        int (KVL::Interface::*query)(Parameters...), Arguments&&... arguments) {
    KVL::Ethernet* const interface = ethernet.get();
    if (interface == nullptr) return KVL::kNotSupported;
    return (interface->*query)(std::forward<Arguments>(arguments)...);
}

} // namespace

Z7SimIPInterface::Z7SimIPInterface(Addresses addresses, ReferenceCounter<KVL::Ethernet> ethernet)
    : m_addresses(std::move(addresses)), m_ethernet(std::move(ethernet)) {}

Z7SimIPInterface::~Z7SimIPInterface() = default;

ReferenceCounter<KVL::IPAddressConfig> Z7SimIPInterface::GetFirstIPAddressConfig() {
    return KVL::first_in(m_addresses);
}

ReferenceCounter<KVL::IPAddressConfig>
Z7SimIPInterface::GetNextIPAddressConfig(ReferenceCounter<KVL::IPAddressConfig> previous) {
    return KVL::next_in(m_addresses, previous);
}

int Z7SimIPInterface::GetDescription(std::string& description) {
    description = "IP interface";
    std::string below;
    if (ask(m_ethernet, &KVL::Interface::GetDescription, below) == 0)
        description += " over " + below;
    return 0;
}

int Z7SimIPInterface::GetType() {
    return ask(m_ethernet, &KVL::Interface::GetType);
}

int Z7SimIPInterface::GetMTU() {
    return ask(m_ethernet, &KVL::Interface::GetMTU);
}

int Z7SimIPInterface::GetSpeed() {
    return ask(m_ethernet, &KVL::Interface::GetSpeed);
}

int Z7SimIPInterface::GetPhysAddress(char* buffer, int& length) {
    return ask(m_ethernet, &KVL::Interface::GetPhysAddress, buffer, length);
}

int Z7SimIPInterface::GetAdminStatus() {
    return ask(m_ethernet, &KVL::Interface::GetAdminStatus);
}

int Z7SimIPInterface::SetAdminStatus(int status) {
    return ask(m_ethernet, &KVL::Interface::SetAdminStatus, status);
}

int Z7SimIPInterface::GetOperStatus() {
    return ask(m_ethernet, &KVL::Interface::GetOperStatus);
}

int Z7SimIPInterface::GetLastChange(int& seconds, int& microseconds) {
    return ask(m_ethernet, &KVL::Interface::GetLastChange, seconds, microseconds);
}

int Z7SimIPInterface::GetInOctets() {
    return ask(m_ethernet, &KVL::Interface::GetInOctets);
}

int Z7SimIPInterface::GetInUcastPkts() {
    return ask(m_ethernet, &KVL::Interface::GetInUcastPkts);
}

int Z7SimIPInterface::GetInDiscards() {
    return ask(m_ethernet, &KVL::Interface::GetInDiscards);
}

int Z7SimIPInterface::GetInErrors() {
    return ask(m_ethernet, &KVL::Interface::GetInErrors);
}

int Z7SimIPInterface::GetInUnknownProtos() {
    return ask(m_ethernet, &KVL::Interface::GetInUnknownProtos);
}

int Z7SimIPInterface::GetOutOctets() {
    return ask(m_ethernet, &KVL::Interface::GetOutOctets);
}

int Z7SimIPInterface::GetOutUcastPkts() {
    return ask(m_ethernet, &KVL::Interface::GetOutUcastPkts);
}

int Z7SimIPInterface::GetOutDiscards() {
    return ask(m_ethernet, &KVL::Interface::GetOutDiscards);
}

int Z7SimIPInterface::GetOutErrors() {
    return ask(m_ethernet, &KVL::Interface::GetOutErrors);
}
