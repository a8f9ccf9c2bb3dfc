// SPDX-License-Identifier: BSD-2-Clause
// The sockets on which the HTTP side listens.
#pragma once

#include <sys/types.h>

#include <string>

namespace kvloamd {

/// The group whose members may use the Unix socket, beside the agent's own user. The package
/// creates it.
inline constexpr char kSocketGroup[] = "kvloam";

/// A `ListeningSocket` is a descriptor on which connections arrive. The destructor closes it, and
/// removes the file of a Unix socket that is still this one's.
class ListeningSocket {
  public:
    /// Listens at `path`, with mode 0660, and for the members of `group` where there is one. A
    /// socket that an agent has left behind is replaced; at no time can a client connect to one
    /// with another mode. Throws std::runtime_error.
    static ListeningSocket unixAt(std::string const& path, std::string const& group = kSocketGroup);
    /// Listens at "HOST:PORT"; HOST is an address or a name, a port alone is one of 127.0.0.1.
    /// Throws std::runtime_error.
    static ListeningSocket tcpAt(std::string const& address);

    ~ListeningSocket();
    ListeningSocket(ListeningSocket&& other) noexcept;
    ListeningSocket& operator=(ListeningSocket&&) = delete;
    ListeningSocket(ListeningSocket const&) = delete;
    ListeningSocket& operator=(ListeningSocket const&) = delete;

    int descriptor() const { return m_descriptor; }
    bool isUnix() const { return !m_path.empty(); }
    /// Whether hosts other than this one may reach it.
    bool isRemote() const { return m_isRemote; }
    /// The name or address in the configuration; empty for a Unix socket.
    std::string const& host() const { return m_host; }
    /// For a message: "on http://127.0.0.1:8161/", "on /run/kvloam/kvloamd.socket".
    std::string place() const;

  private:
    ListeningSocket() = default;

    int m_descriptor = -1;
    bool m_isRemote = false;
    std::string m_host;
    std::string m_port;
    std::string m_path;
    dev_t m_device = 0; ///< of the Unix socket's file, as the next one
    ino_t m_inode = 0;
};

/// HOST and PORT of "HOST:PORT", "[HOST]:PORT" or "PORT". The host is empty when `text` is none of
/// these.
struct HostAndPort {
    std::string host;
    std::string port;
};
HostAndPort parseHostAndPort(std::string const& text);

/// What stands against listening at `path` or `address`; empty: nothing. An address that is in use
/// is no fault, because the agent itself may be running.
std::string checkUnixSocket(std::string const& path);
std::string checkTcpAddress(std::string const& address, bool hasToken);

/// The token in `file`: its first line without blanks around it. Throws std::runtime_error when
/// the file cannot be read, when everybody may read it, or when the token is shorter than 16 or
/// longer than 512 characters, or has others than letters, digits and marks.
std::string readToken(std::string const& file);

} // namespace kvloamd
