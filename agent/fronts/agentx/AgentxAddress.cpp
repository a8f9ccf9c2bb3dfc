// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxAddress.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/un.h>

#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace kvloamd {

namespace {

bool setPath(AgentxAddress& address, std::string_view path) {
    sockaddr_un named{};
    named.sun_family = AF_UNIX;
    if (path.empty() || path.size() >= sizeof named.sun_path) return false;
    path.copy(named.sun_path, path.size());
    std::memcpy(&address.socket, &named, sizeof named);
    address.size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + path.size() + 1);
    return true;
}

bool setHost(AgentxAddress& address, std::string_view hostAndPort) {
    auto const colon = hostAndPort.rfind(':');
    std::string host = "127.0.0.1";
    if (colon != std::string_view::npos) {
        host = hostAndPort.substr(0, colon);
        hostAndPort.remove_prefix(colon + 1);
    }
    if (host == "localhost") host = "127.0.0.1";
    std::uint16_t port = 0;
    char const* const end = hostAndPort.data() + hostAndPort.size();
    auto const [stopped, error] = std::from_chars(hostAndPort.data(), end, port);
    sockaddr_in numbered{};
    numbered.sin_family = AF_INET;
    numbered.sin_port = htons(port);
    if (error != std::errc() || stopped != end || port == 0 ||
        inet_pton(AF_INET, host.c_str(), &numbered.sin_addr) != 1)
        return false;
    std::memcpy(&address.socket, &numbered, sizeof numbered);
    address.size = sizeof numbered;
    return true;
}

} // namespace

std::optional<AgentxAddress> parseAgentxAddress(std::string const& text) {
    AgentxAddress address;
    address.text = text;
    std::string_view rest = text;
    bool good = false;
    if (rest.starts_with('/')) {
        good = setPath(address, rest);
    } else if (rest.starts_with("unix:")) {
        good = setPath(address, rest.substr(5));
    } else if (rest.starts_with("tcp:")) {
        good = setHost(address, rest.substr(4));
    }
    return good ? std::optional(std::move(address)) : std::nullopt;
}

} // namespace kvloamd
