// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpAddress.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

namespace kvloamd {

std::string openAddress(std::string const& address) {
    errno = 0;
    netsnmp_transport* const transport = netsnmp_transport_open_server("snmp", address.c_str());
    if (transport == nullptr) {
        switch (errno) {
        case EADDRINUSE:
            return "cannot listen on " + address +
                   ": the port is in use; stop the program that uses it, or choose another "
                   "port with --port or --listen";
        case EACCES:
            return "cannot listen on " + address +
                   ": permission denied; ports below 1024 need the privilege to use them, or "
                   "choose another "
                   "one with --port or --listen";
        case 0:
            return "cannot listen on " + address +
                   ": no such address; write it as udp:127.0.0.1:1161";
        default:
            return "cannot listen on " + address + ": " + std::strerror(errno) +
                   "; check --listen, as in udp:127.0.0.1:1161";
        }
    }
    // A program that a board module starts may outlive the agent, and would keep the port in use.
    fcntl(transport->sock, F_SETFD, FD_CLOEXEC);
    if (netsnmp_register_agent_nsap(transport) == 0)
        return "cannot listen on " + address + ": the SNMP library refuses the address";
    return {};
}

} // namespace kvloamd
