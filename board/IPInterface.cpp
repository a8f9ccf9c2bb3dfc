// SPDX-License-Identifier: BSD-2-Clause
#include "board/IPInterface.h"

#include <cstdlib>
#include <cstring>
#include <string>

namespace KVL {

IPAddress::IPAddress(int address) {
    *this = address;
}

IPAddress::IPAddress(char* text) {
    parse(text);
}

IPAddress& IPAddress::operator=(int address) {
    auto const bits = static_cast<std::uint32_t>(address);
    m_octets = {bits >> 24, (bits >> 16) & 0xFF, (bits >> 8) & 0xFF, bits & 0xFF};
    return *this;
}

IPAddress& IPAddress::operator=(char* text) {
    return *this = IPAddress(text);
}

void IPAddress::parse(char const* text) {
    std::string copy(text == nullptr ? "" : text);
    char* rest = nullptr;
    char const* token = strtok_r(copy.data(), ".", &rest);
    for (auto& octet : m_octets) {
        if (token == nullptr) break;
        octet = static_cast<std::uint32_t>(std::strtol(token, nullptr, 10));
        token = strtok_r(nullptr, ".", &rest);
    }
}

IPAddressConfig::IPAddressConfig() : IPAddressConfig(0, 0, 0) {}

IPAddressConfig::IPAddressConfig(int address, int mask, int broadcast)
    : m_address(address), m_mask(mask), m_broadcast(broadcast) {}

IPAddressConfig::IPAddressConfig(char* text) : m_address(text), m_mask(0), m_broadcast(0) {}

IPAddressConfig::~IPAddressConfig() = default;

IPInterface::IPInterface() {
    answer_to(iid());
}

IPInterface::~IPInterface() = default;

ReferenceCounter<IPAddressConfig> IPInterface::GetFirstIPAddressConfig() {
    char address[] = "127.1.1.1";
    return {new IPAddressConfig(address)};
}

ReferenceCounter<IPAddressConfig>
IPInterface::GetNextIPAddressConfig(ReferenceCounter<IPAddressConfig> /*previous*/) {
    return {};
}

} // namespace KVL
