// SPDX-License-Identifier: BSD-2-Clause
// Where the master of the host's SNMP agents is reached.
#pragma once

#include <sys/socket.h>

#include <optional>
#include <string>

namespace kvloamd {

/// Where a master is unless somebody says otherwise.
inline constexpr char kMasterAddress[] = "/var/agentx/master";

struct AgentxAddress {
    std::string text; ///< as it was written
    sockaddr_storage socket{};
    socklen_t size = 0;
};

/// Reads /PATH, unix:PATH, tcp:PORT (of the loopback address) or tcp:ADDRESS:PORT, whose ADDRESS is
/// four numbers or "localhost"; as the master's own configuration writes them.
std::optional<AgentxAddress> parseAgentxAddress(std::string const& text);

} // namespace kvloamd
