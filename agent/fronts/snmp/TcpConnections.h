// SPDX-License-Identifier: BSD-2-Clause
// The TCP connections of SNMP clients, with bounded memory, number and idle time.
#pragma once

#include <netinet/in.h>

#include <chrono>
#include <cstddef>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/fronts/EventLoop.h"

namespace kvloamd {

/// What clients may use of the agent by TCP.
struct TcpLimits {
    /// Further clients replace the one that has been idle for longest. Far fewer than a process may
    /// have descriptors.
    std::size_t connections = 64;
    /// The agent reads no further request of a client that has this many octets of responses
    /// unread.
    std::size_t unread = std::size_t{64} * 1024;
    /// A client is disconnected when it neither completes a request nor reads all its responses for
    /// so long.
    std::chrono::milliseconds idle{60000};
};

/// `TcpConnections` accept clients, cut what they send into SNMP messages, and send them responses.
/// They never block, and need no protocol but the length of a message. Thread-bound to the SNMP
/// thread.
class TcpConnections final : public EventLoop::Source {
  public:
    /// The longest message; a client that announces a longer one is disconnected.
    static constexpr std::size_t kLongestMessage = 65535;

    struct Message {
        int connection; ///< never reused
        sockaddr_in peer;
        std::string octets;
    };

    /// Throws std::system_error when no descriptor is left.
    explicit TcpConnections(TcpLimits limits = {});
    ~TcpConnections() override;
    TcpConnections(TcpConnections const&) = delete;
    TcpConnections& operator=(TcpConnections const&) = delete;

    /// Listens at an address such as 127.0.0.1:1161 or 1161. Sets errno and returns false when it
    /// cannot; errno is 0 when the address is malformed or unknown.
    bool listen(std::string const& address);

    /// Readable while `take` returns a message.
    int descriptor() const { return m_wakeup; }
    /// Returns the oldest message; each client's turn comes after those of all others.
    std::optional<Message> take();
    /// Sends a response; does nothing if the client has gone.
    void send(int connection, std::string_view octets);
    std::size_t count() const { return m_connections.size(); }

    std::optional<Clock::time_point> prepare(std::vector<pollfd>& polled) override;
    void handle(std::span<pollfd const> polled) override;

  private:
    struct Connection {
        int socket;
        sockaddr_in peer;
        Clock::time_point active; ///< the last complete request, or the end of its responses
        std::string in;
        std::string out;
        bool offered = false; ///< its message is in `m_offered`
        bool ended = false;   ///< the client sends nothing more
    };
    using Connections = std::map<int, Connection>;

    void accept(int listener);
    void makeRoom();
    /// Each returns false when the connection is to be closed.
    static bool receive(Connection& connection);
    static bool flush(Connection& connection);
    /// Offers the connection's first message to `take`, if there is one and its client reads.
    bool offer(int number, Connection& connection);
    Connections::iterator close(Connections::iterator connection);

    TcpLimits m_limits;
    int m_wakeup;
    std::vector<int> m_listeners;
    Connections m_connections;
    std::deque<int> m_offered;
    std::vector<int> m_polled; ///< the connections in `polled`, in its order
    int m_lastNumber = 0;
    Clock::time_point m_acceptAt{Clock::time_point::min()}; ///< later, while descriptors are short
};

} // namespace kvloamd
