// SPDX-License-Identifier: BSD-2-Clause
// The kinds of addresses that the SNMP library knows.
#pragma once

#include <algorithm>
#include <iterator>
#include <string>
#include <string_view>

namespace kvloamd {

/// What precedes the first colon of an address, in lower case: "udp" of udp:127.0.0.1:161.
inline std::string transportKind(std::string_view address) {
    std::size_t const colon = address.find(':');
    std::string kind(colon == std::string_view::npos ? std::string_view()
                                                     : address.substr(0, colon));
    std::ranges::transform(kind, kind.begin(), [](char each) {
        return each >= 'A' && each <= 'Z' ? static_cast<char>(each - 'A' + 'a') : each;
    });
    return kind;
}

/// Whether the library uses the address by a transport that can block the agent.
inline bool isOfBlockingKind(std::string_view address) {
    constexpr std::string_view kinds[] = {
        "tcp",  "tcp6", "tcpv6", "tcpipv6", "unix",    "tlstcp", "dtlsudp",  "tls",
        "dtls", "ssh",  "std",   "stdout",  "aal5pvc", "ipx",    "callback", "alias"};
    return std::ranges::find(kinds, transportKind(address)) != std::end(kinds);
}

} // namespace kvloamd
