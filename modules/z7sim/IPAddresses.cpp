// SPDX-License-Identifier: BSD-2-Clause
#include "IPAddresses.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <netinet/in.h>

#include <memory>
#include <string_view>

#include "ObjectAttributes.h"

namespace {

int inHostOrder(in_addr const& address) {
    return static_cast<int>(ntohl(address.s_addr));
}

/// The IPv4 address that `address` points to; 0.0.0.0 for none.
int addressIn(sockaddr const* address) {
    if (address == nullptr || address->sa_family != AF_INET) return 0;
    return inHostOrder(reinterpret_cast<sockaddr_in const*>(address)->sin_addr);
}

int readAddress(long board, std::string const& attribute) {
    return parseIPAddress(textAttribute(board, attribute.c_str())).value_or(0);
}

} // namespace

std::optional<int> parseIPAddress(std::string const& text) {
    in_addr address{};
    if (inet_pton(AF_INET, text.c_str(), &address) != 1) return std::nullopt;
    return inHostOrder(address);
}

std::optional<Z7SimIPInterface::Addresses> readBoardAddresses(long board) {
    Z7SimIPInterface::Addresses addresses;
    for (int n = 0;; ++n) {
        std::string const number = std::to_string(n);
        std::string const text = textAttribute(board, ("IP_ADDRESS_" + number).c_str());
        if (text.empty()) return n == 0 ? std::nullopt : std::optional(addresses);
        auto const address = parseIPAddress(text);
        if (!address) continue;
        addresses.emplace_back(
            new KVL::IPAddressConfig(*address, readAddress(board, "IP_MASK_" + number),
                                     readAddress(board, "IP_BROADCAST_" + number)));
    }
}

Z7SimIPInterface::Addresses readHostAddresses(std::string const& device) {
    ifaddrs* list = nullptr;
    if (getifaddrs(&list) != 0) return {};
    std::unique_ptr<ifaddrs, decltype(&freeifaddrs)> const owner(list, freeifaddrs);
    Z7SimIPInterface::Addresses addresses;
    for (ifaddrs const* entry = list; entry != nullptr; entry = entry->ifa_next) {
        // A further address may be labelled "eth0:1".
        std::string_view const label = entry->ifa_name;
        if (label.substr(0, label.find(':')) != device) continue;
        if (entry->ifa_addr == nullptr || entry->ifa_addr->sa_family != AF_INET) continue;
        bool const hasBroadcast = (entry->ifa_flags & IFF_BROADCAST) != 0;
        addresses.emplace_back(
            new KVL::IPAddressConfig(addressIn(entry->ifa_addr), addressIn(entry->ifa_netmask),
                                     hasBroadcast ? addressIn(entry->ifa_broadaddr) : 0));
    }
    return addresses;
}
