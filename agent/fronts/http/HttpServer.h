// SPDX-License-Identifier: BSD-2-Clause
// Answers HTTP requests.
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "agent/fronts/Wakeup.h"
#include "agent/fronts/http/HttpAnswers.h"
#include "agent/fronts/http/HttpSockets.h"

namespace kvloamd {

/// What limits clients.
struct HttpLimits {
    unsigned connections = 64; ///< of each socket at a time; more wait
    /// A connection on which a request and its answer take longer, or which waits longer for the
    /// next request, is closed.
    std::chrono::milliseconds patience{30000};
    /// All answers of a socket that clients have not read yet; another one is then refused.
    std::size_t octets = std::size_t{256} << 20U;
};

/// An `HttpServer` answers the requests that arrive at its sockets, on a thread of its own. The
/// thread runs at nice 10, so that SNMP requests are not delayed by it.
class HttpServer {
  public:
    /// Starts the thread. The sockets outlive the server. Throws std::runtime_error.
    HttpServer(std::vector<ListeningSocket> const& sockets, HttpServed served, std::string token,
               HttpLimits limits = {});
    /// Closes all connections, and ends the thread after an answer that it is writing.
    ~HttpServer();
    HttpServer(HttpServer const&) = delete;
    HttpServer& operator=(HttpServer const&) = delete;

    /// As `HttpAnswers::requireToken`. Thread-safe.
    void requireToken(std::string token) { m_answers.requireToken(std::move(token)); }

  private:
    class Listener;

    void run();

    HttpAnswers m_answers;
    Wakeup m_stop;
    std::vector<std::unique_ptr<Listener>> m_listeners;
    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
