// SPDX-License-Identifier: BSD-2-Clause
// The address of the SNMP master.
#pragma once

#include <sys/socket.h>

#include <optional>
#include <string>

namespace kvloamd {

/// The address at which a master listens by default.
inline constexpr char kMasterAddress[] = "/var/agentx/master";

struct AgentxAddress {
    std::string text; ///< as the user wrote it
    sockaddr_storage socket{};
    socklen_t size = 0;
};

/// Parses /PATH, unix:PATH, tcp:PORT (of the loopback address) or tcp:ADDRESS:PORT, the forms of
/// the master's configuration. ADDRESS is four numbers or "localhost".
std::optional<AgentxAddress> parseAgentxAddress(std::string const& text);

} // namespace kvloamd
