// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxAddress.h"

#include <netinet/in.h>
#include <sys/un.h>

#include <cstring>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

std::string pathOf(std::string const& text) {
    auto const address = parseAgentxAddress(text);
    if (!address || address->socket.ss_family != AF_UNIX) return "no path";
    sockaddr_un named{};
    std::memcpy(&named, &address->socket, sizeof named);
    return named.sun_path;
}

/// "2130706433:705": the address's number and port.
std::string hostOf(std::string const& text) {
    auto const address = parseAgentxAddress(text);
    if (!address || address->socket.ss_family != AF_INET) return "no host";
    sockaddr_in numbered{};
    std::memcpy(&numbered, &address->socket, sizeof numbered);
    return std::to_string(ntohl(numbered.sin_addr.s_addr)) + ":" +
           std::to_string(ntohs(numbered.sin_port));
}

TEST(AgentxAddressTest, PathIsASocketOfTheHost) {
    EXPECT_EQ(pathOf("/var/agentx/master"), "/var/agentx/master");
    EXPECT_EQ(pathOf("unix:/run/master"), "/run/master");
}

TEST(AgentxAddressTest, PortIsOfLoopbackUnlessAnAddressIsGiven) {
    EXPECT_EQ(hostOf("tcp:705"), "2130706433:705");
    EXPECT_EQ(hostOf("tcp:localhost:705"), "2130706433:705");
    EXPECT_EQ(hostOf("tcp:127.0.0.2:1705"), "2130706434:1705");
}

TEST(AgentxAddressTest, AnythingElseIsRefused) {
    for (char const* const text : {"", "unix:", "tcp:", "tcp:0", "tcp:65536", "tcp:70x",
                                   "tcp:host:705", "tcp:127.0.0.1:", "udp:127.0.0.1:705", "master"})
        EXPECT_FALSE(parseAgentxAddress(text)) << text;
}

TEST(AgentxAddressTest, PathThatNoSocketCanHaveIsRefused) {
    EXPECT_TRUE(parseAgentxAddress("/" + std::string(106, 'x')));
    EXPECT_FALSE(parseAgentxAddress("/" + std::string(107, 'x')));
}

} // namespace
} // namespace kvloamd
