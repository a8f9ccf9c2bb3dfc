// SPDX-License-Identifier: BSD-2-Clause
// The HTTP side of the agent, as the options describe it.
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/daemon/Options.h"
#include "agent/fronts/http/HttpServer.h"

namespace kvloamd {

/// An `HttpSide` opens the sockets of the HTTP side before the agent starts to serve, so that a
/// wrong address ends the start. Without an HTTP socket or address in the options, it does nothing.
/// Thread-bound to the SNMP thread.
class HttpSide {
  public:
    /// Opens the sockets and reads the token. Throws std::runtime_error.
    explicit HttpSide(Options const& options);

    /// Answers requests from now on, until `stop`. Throws std::runtime_error.
    void serve(HttpServed served);
    void stop() { m_server.reset(); }

    /// Reads the file with the token again. If it is bad, the former token stays, and the log says
    /// why.
    void readTokenAgain();

  private:
    std::string m_tokenFile;
    std::string m_token;
    std::vector<ListeningSocket> m_sockets;
    std::optional<HttpServer> m_server;
};

/// A scope during which requests are answered. What they are answered from outlives the scope.
class HttpScope {
  public:
    HttpScope(HttpSide& side, HttpServed served) : m_side(side) { m_side.serve(std::move(served)); }
    ~HttpScope() { m_side.stop(); }
    HttpScope(HttpScope const&) = delete;
    HttpScope& operator=(HttpScope const&) = delete;

  private:
    HttpSide& m_side;
};

/// What stands against the HTTP side that the options describe, one line for each fault.
std::vector<std::string> checkHttpSide(Options const& options);

} // namespace kvloamd
