// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/TcpConnections.h"

#include <fcntl.h>
#include <netdb.h>
#include <sys/eventfd.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <system_error>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr int kAcceptedPerTurn = 16;
constexpr std::size_t kChunk = std::size_t{16} * 1024;
constexpr std::chrono::seconds kAcceptPause{1};
constexpr char kSequence = 0x30;

/// The length of the message at the beginning of `octets`: 0 while that is not known, nothing when
/// there is no SNMP message, or one that is too long.
std::optional<std::size_t> messageLength(std::string_view octets) {
    if (octets.empty()) return 0;
    if (octets[0] != kSequence) return std::nullopt;
    if (octets.size() < 2) return 0;
    auto const first = static_cast<unsigned char>(octets[1]);
    if (first < 0x80) return std::size_t{2} + first;
    std::size_t const count = first & 0x7fU;
    if (count == 0 || count > 4) return std::nullopt;
    if (octets.size() < 2 + count) return 0;
    std::size_t length = 0;
    for (std::size_t i = 0; i < count; ++i)
        length = length << 8U | static_cast<unsigned char>(octets[2 + i]);
    length += 2 + count;
    if (length > TcpConnections::kLongestMessage) return std::nullopt;
    return length;
}

bool isComplete(std::string const& octets) {
    auto const length = messageLength(octets);
    return length && *length > 0 && octets.size() >= *length;
}

using AddressInfo = std::unique_ptr<addrinfo, decltype(&freeaddrinfo)>;

} // namespace

TcpConnections::TcpConnections(TcpLimits limits)
    : m_limits(limits), m_wakeup(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
    if (m_wakeup < 0) throw std::system_error(errno, std::generic_category(), "eventfd");
    rlimit descriptors{};
    if (getrlimit(RLIMIT_NOFILE, &descriptors) == 0)
        m_limits.connections =
            std::clamp<std::size_t>(descriptors.rlim_cur / 4, 1, m_limits.connections);
}

TcpConnections::~TcpConnections() {
    for (auto const& [number, connection] : m_connections)
        ::close(connection.socket);
    for (int const listener : m_listeners)
        ::close(listener);
    ::close(m_wakeup);
}

bool TcpConnections::listen(std::string const& address) {
    auto const colon = address.rfind(':');
    bool const portOnly =
        colon == std::string::npos && address.find_first_not_of("0123456789") == std::string::npos;
    std::string const host = portOnly ? std::string() : address.substr(0, colon);
    std::string const port = portOnly                     ? address
                             : colon == std::string::npos ? std::string("161")
                                                          : address.substr(colon + 1);
    addrinfo wanted{};
    wanted.ai_family = AF_INET;
    wanted.ai_socktype = SOCK_STREAM;
    wanted.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    errno = 0;
    if (getaddrinfo(host.empty() ? nullptr : host.c_str(), port.c_str(), &wanted, &found) != 0) {
        errno = 0;
        return false;
    }
    AddressInfo const info(found, &freeaddrinfo);
    int const listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (listener < 0) return false;
    int const on = 1;
    setsockopt(listener, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
    if (bind(listener, info->ai_addr, info->ai_addrlen) != 0 ||
        ::listen(listener, SOMAXCONN) != 0) {
        int const fault = errno;
        ::close(listener);
        errno = fault;
        return false;
    }
    m_listeners.push_back(listener);
    return true;
}

std::optional<TcpConnections::Message> TcpConnections::take() {
    while (!m_offered.empty()) {
        int const number = m_offered.front();
        m_offered.pop_front();
        auto const found = m_connections.find(number);
        if (found == m_connections.end()) continue;
        Connection& connection = found->second;
        connection.offered = false;
        connection.active = Clock::now();
        std::size_t const length = messageLength(connection.in).value_or(0);
        Message message{number, connection.peer, connection.in.substr(0, length)};
        connection.in.erase(0, length);
        return message;
    }
    eventfd_t ignored = 0;
    eventfd_read(m_wakeup, &ignored);
    return std::nullopt;
}

void TcpConnections::send(int connection, std::string_view octets) {
    auto const found = m_connections.find(connection);
    if (found == m_connections.end()) return;
    found->second.out += octets;
    if (!flush(found->second)) close(found);
}

std::optional<Clock::time_point> TcpConnections::prepare(std::vector<pollfd>& polled) {
    auto const now = Clock::now();
    std::optional<Clock::time_point> deadline;
    for (int const listener : m_listeners)
        polled.push_back({now < m_acceptAt ? -1 : listener, POLLIN, 0});
    if (now < m_acceptAt) deadline = m_acceptAt;
    m_polled.clear();
    for (auto at = m_connections.begin(); at != m_connections.end();) {
        auto& [number, connection] = *at;
        bool const goesOn = offer(number, connection) &&
                            (!connection.ended || connection.offered || !connection.out.empty());
        if (!goesOn || now >= connection.active + m_limits.idle) {
            at = close(at);
            continue;
        }
        int events = connection.out.empty() ? 0 : POLLOUT;
        if (!connection.ended && !connection.offered && !isComplete(connection.in) &&
            connection.out.size() <= m_limits.unread)
            events |= POLLIN;
        polled.push_back({connection.socket, static_cast<short>(events), 0});
        m_polled.push_back(number);
        auto const ages = connection.active + m_limits.idle;
        deadline = deadline ? std::min(*deadline, ages) : ages;
        ++at;
    }
    return deadline;
}

void TcpConnections::handle(std::span<pollfd const> polled) {
    for (std::size_t i = 0; i < m_polled.size(); ++i) {
        pollfd const& each = polled[m_listeners.size() + i];
        auto const found = m_connections.find(m_polled[i]);
        if (each.revents == 0 || found == m_connections.end()) continue;
        Connection& connection = found->second;
        bool good = (each.revents & (POLLERR | POLLNVAL)) == 0;
        if (good && (each.revents & POLLOUT) != 0) good = flush(connection);
        // A hang-up without POLLIN: both directions are closed, so nobody can read a response.
        if (good && (each.revents & POLLIN) != 0)
            good = receive(connection);
        else if ((each.revents & POLLHUP) != 0)
            good = false;
        if (!good) close(found);
    }
    for (std::size_t i = 0; i < m_listeners.size(); ++i)
        if (polled[i].revents != 0) accept(m_listeners[i]);
}

void TcpConnections::accept(int listener) {
    for (int i = 0; i < kAcceptedPerTurn; ++i) {
        sockaddr_in peer{};
        socklen_t size = sizeof peer;
        int const socket = accept4(listener, reinterpret_cast<sockaddr*>(&peer), &size,
                                   SOCK_CLOEXEC | SOCK_NONBLOCK);
        if (socket < 0) {
            // Without a free descriptor the listener stays readable; do not spin on it.
            if (errno != EAGAIN && errno != EINTR && errno != ECONNABORTED)
                m_acceptAt = Clock::now() + kAcceptPause;
            return;
        }
        makeRoom();
        m_connections.emplace(++m_lastNumber, Connection{socket, peer, Clock::now(), {}, {}});
    }
}

void TcpConnections::makeRoom() {
    while (m_connections.size() >= m_limits.connections) {
        log(LogLevel::Debug, "too many TCP connections; closing the one that is idle for longest");
        close(std::ranges::min_element(m_connections, {},
                                       [](auto const& entry) { return entry.second.active; }));
    }
}

bool TcpConnections::receive(Connection& connection) {
    char buffer[kChunk];
    ssize_t const got = recv(connection.socket, buffer, sizeof buffer, MSG_DONTWAIT);
    if (got < 0) return errno == EAGAIN || errno == EINTR;
    if (got == 0) connection.ended = true;
    connection.in.append(buffer, static_cast<std::size_t>(got));
    return true;
}

bool TcpConnections::flush(Connection& connection) {
    std::size_t sent = 0;
    while (sent < connection.out.size()) {
        ssize_t const count = ::send(connection.socket, connection.out.data() + sent,
                                     connection.out.size() - sent, MSG_DONTWAIT | MSG_NOSIGNAL);
        if (count < 0 && errno == EINTR) continue;
        if (count < 0 && errno == EAGAIN) break;
        if (count < 0) return false;
        sent += static_cast<std::size_t>(count);
    }
    connection.out.erase(0, sent);
    if (connection.out.empty()) connection.active = Clock::now();
    return true;
}

bool TcpConnections::offer(int number, Connection& connection) {
    if (connection.offered || connection.out.size() > m_limits.unread) return true;
    if (!messageLength(connection.in)) return false;
    if (!isComplete(connection.in)) return true;
    connection.offered = true;
    m_offered.push_back(number);
    eventfd_write(m_wakeup, 1);
    return true;
}

TcpConnections::Connections::iterator TcpConnections::close(Connections::iterator connection) {
    ::close(connection->second.socket);
    return m_connections.erase(connection);
}

} // namespace kvloamd
