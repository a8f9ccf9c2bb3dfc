// SPDX-License-Identifier: BSD-2-Clause
// The tool's connection to a simulated platform's control socket.
#include "simulator/tool/ControlClient.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <array>
#include <cerrno>
#include <cstring>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

ControlClient::ControlClient(std::string path, std::chrono::seconds timeout)
    : m_path(std::move(path)), m_timeout(timeout) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (m_path.size() >= sizeof address.sun_path)
        throw ToolError("the socket path " + m_path + " has more than " +
                        std::to_string(sizeof address.sun_path - 1) + " bytes; use a shorter one");
    std::memcpy(address.sun_path, m_path.c_str(), m_path.size() + 1);
    m_socket = Descriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (m_socket.get() < 0 ||
        connect(m_socket.get(), reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0)
        throw ToolError("no simulated platform answers at " + m_path + " (" + std::strerror(errno) +
                        "); start one with KVLSIM_SOCKET=" + m_path);
}

nlohmann::json ControlClient::request(nlohmann::json const& command) {
    send(command.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace) + "\n");
    nlohmann::json reply = nlohmann::json::parse(receiveLine(), nullptr, false);
    if (!reply.is_object() || !reply.contains("ok"))
        throw ToolError("what answers at " + m_path + " is no simulated platform");
    if (reply["ok"] == true) return reply;
    throw ToolError(reply.value("error", "the platform refused without saying why"));
}

void ControlClient::waitReady(short events) {
    pollfd polled{m_socket.get(), events, 0};
    auto const timeout =
        static_cast<int>(std::chrono::duration_cast<std::chrono::milliseconds>(m_timeout).count());
    int ready = 0;
    do
        ready = poll(&polled, 1, timeout);
    while (ready < 0 && errno == EINTR);
    if (ready == 0)
        throw ToolError("no answer from " + m_path + " in " + std::to_string(m_timeout.count()) +
                        " s; is its process stopped or busy? (--timeout gives more time)");
}

void ControlClient::send(std::string const& line) {
    std::size_t sent = 0;
    while (sent < line.size()) {
        waitReady(POLLOUT);
        ssize_t const size = ::send(m_socket.get(), line.data() + sent, line.size() - sent,
                                    MSG_NOSIGNAL | MSG_DONTWAIT);
        if (size >= 0)
            sent += static_cast<std::size_t>(size);
        else if (errno == EPIPE || errno == ECONNRESET)
            return; // refused while we were sending: the reply says why
        else if (errno != EINTR && errno != EAGAIN)
            throw ToolError("cannot send to " + m_path + ": " + std::strerror(errno));
    }
}

std::string ControlClient::receiveLine() {
    std::size_t searched = 0;
    while (true) {
        if (auto const end = m_received.find('\n', searched); end != std::string::npos) {
            std::string line = m_received.substr(0, end);
            m_received.erase(0, end + 1);
            return line;
        }
        searched = m_received.size();
        waitReady(POLLIN);
        std::array<char, 65536> block{};
        ssize_t const size = recv(m_socket.get(), block.data(), block.size(), 0);
        if (size < 0 && errno == EINTR) continue;
        if (size <= 0)
            throw ToolError("the platform at " + m_path + " went away before it answered");
        m_received.append(block.data(), static_cast<std::size_t>(size));
    }
}

} // namespace kvlsim
