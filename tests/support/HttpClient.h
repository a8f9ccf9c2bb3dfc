// SPDX-License-Identifier: BSD-2-Clause
// An HTTP client for tests, which can also misbehave.
#pragma once

#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <map>
#include <stdexcept>
#include <string>
#include <string_view>

namespace support {

struct HttpReply {
    int status = 0; ///< 0: the connection ended before there was a whole reply
    std::map<std::string, std::string> fields; ///< names in small letters
    std::string body;
};

/// An `HttpClient` is one connection to an HTTP server. Every wait ends after a minute.
class HttpClient {
  public:
    /// To a Unix socket.
    explicit HttpClient(std::string const& path) : m_socket(socket(AF_UNIX, kType, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        connectTo(reinterpret_cast<sockaddr const*>(&address), sizeof address);
    }
    /// To a port of 127.0.0.1.
    explicit HttpClient(int port) : m_socket(socket(AF_INET, kType, 0)) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        address.sin_port = htons(static_cast<std::uint16_t>(port));
        connectTo(reinterpret_cast<sockaddr const*>(&address), sizeof address);
    }
    ~HttpClient() { close(m_socket); }
    HttpClient(HttpClient const&) = delete;
    HttpClient& operator=(HttpClient const&) = delete;

    /// Sends octets. Whether the server took them.
    bool send(std::string_view octets) {
        while (!octets.empty()) {
            ssize_t const sent = ::send(m_socket, octets.data(), octets.size(), MSG_NOSIGNAL);
            if (sent <= 0) return false;
            octets.remove_prefix(static_cast<std::size_t>(sent));
        }
        return true;
    }
    HttpReply ask(std::string const& target, std::string const& fields = {},
                  std::string const& method = "GET") {
        send(method + ' ' + target + " HTTP/1.1\r\nHost: localhost\r\n" + fields + "\r\n");
        return read(method != "HEAD");
    }
    /// Reads the next reply. `hasBody`: as its Content-Length says.
    HttpReply read(bool hasBody = true) {
        while (m_read.find(kEnd) == std::string::npos)
            if (!readMore()) return {};
        HttpReply reply;
        std::size_t const end = m_read.find(kEnd);
        std::string const head = m_read.substr(0, end + 2);
        m_read.erase(0, end + kEnd.size());
        reply.status = std::stoi(head.substr(head.find(' ')));
        for (std::size_t begin = head.find("\r\n") + 2; begin < head.size();) {
            std::size_t const next = head.find("\r\n", begin);
            std::size_t const colon = head.find(':', begin);
            std::string name = head.substr(begin, colon - begin);
            for (char& letter : name)
                if (letter >= 'A' && letter <= 'Z') letter = static_cast<char>(letter - 'A' + 'a');
            reply.fields[name] = head.substr(colon + 2, next - colon - 2);
            begin = next + 2;
        }
        if (!hasBody || reply.status == 304) return reply;
        auto const length = std::stoul("0" + reply.fields["content-length"]);
        while (m_read.size() < length)
            if (!readMore()) return {};
        reply.body = m_read.substr(0, length);
        m_read.erase(0, length);
        return reply;
    }
    /// Waits until the server ends the connection. False when it does not.
    bool isEnded() {
        while (readMore()) {
        }
        return m_isEnded;
    }
    /// Whether the server sends something, or ends the connection, within this time.
    bool hears(std::chrono::milliseconds time) const {
        pollfd polled{m_socket, POLLIN, 0};
        return poll(&polled, 1, static_cast<int>(time.count())) == 1;
    }

  private:
    static constexpr int kType = SOCK_STREAM | SOCK_CLOEXEC;
    static constexpr std::string_view kEnd = "\r\n\r\n";

    void connectTo(sockaddr const* address, socklen_t size) const {
        if (connect(m_socket, address, size) == 0) return;
        close(m_socket);
        throw std::runtime_error("no HTTP server there");
    }
    /// False at the end of the connection, or after a minute.
    bool readMore() {
        if (!hears(std::chrono::minutes(1))) return false;
        char buffer[65536];
        ssize_t const got = recv(m_socket, buffer, sizeof buffer, 0);
        m_isEnded = got <= 0;
        if (!m_isEnded) m_read.append(buffer, static_cast<std::size_t>(got));
        return !m_isEnded;
    }

    int m_socket;
    std::string m_read; ///< not yet part of a reply
    bool m_isEnded = false;
};

} // namespace support
