// SPDX-License-Identifier: BSD-2-Clause
// The addresses at which the stand-alone agent listens, and the size of its responses.
#pragma once

#include <memory>
#include <string>

#include "agent/fronts/EventLoop.h"
#include "agent/fronts/snmp/TcpConnections.h"

namespace kvloamd {

/// `SnmpSessions` receive requests for the SNMP library's agent, and send its responses. A response
/// is cut or replaced so that it fits what its receiver accepts. UDP is the library's; TCP is our
/// own, because the library blocks on a client that does not read. Thread-bound to the SNMP thread;
/// used while the library is started, and destroyed after it has stopped.
class SnmpSessions {
  public:
    /// Listens at an address such as udp:127.0.0.1:1161. Returns the error as one line; empty when
    /// there is none.
    std::string listen(std::string const& address);
    /// Returns the error that `listen` would; empty when there is none, or the port is in use.
    static std::string check(std::string const& address);
    /// Adds the TCP connections, if there are any, to `loop`.
    void addTo(EventLoop& loop);

  private:
    std::string listenByTcp(std::string const& address);

    std::unique_ptr<TcpConnections> m_tcp; ///< null without a TCP address
};

} // namespace kvloamd
