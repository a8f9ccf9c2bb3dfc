// SPDX-License-Identifier: BSD-2-Clause
// The control socket's thread: one poll loop over all clients, which never waits for one of them.
#include "simulator/control/ControlServer.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <list>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "simulator/base/Descriptor.h"
#include "simulator/base/ThreadStart.h"
#include "simulator/control/Commands.h"
#include "simulator/control/ControlSocket.h"

namespace kvlsim {

namespace {

/// A `Connection` is a client's connection. While a reply is unsent or a drain is pending, no
/// further request is read, so that a client that never reads costs one reply at most.
struct Connection {
    explicit Connection(Descriptor connected) : socket(std::move(connected)) {}

    Descriptor socket;
    std::string input;
    std::string output;
    std::optional<std::uint64_t> waitFor; ///< event after which `pending` is sent
    nlohmann::json pending;
    bool ended = false;   ///< the client sends nothing more
    bool closing = false; ///< to be closed once the output is sent
    bool deaf = false;    ///< the client has gone: requests are executed, replies are dropped

    bool busy() const { return !output.empty() || waitFor.has_value(); }
};

/// A `Server` is the control socket with its clients. It runs on the control thread.
class Server {
  public:
    Server(std::string const& path, Platform& platform) : m_platform(platform), m_listener(path) {
        m_platform.events().onProgress([this] {
            if (m_draining.load() > 0) m_wakeUp.signal();
        });
        try {
            m_thread = startThread("kvlsim-control", [this] { run(); });
        } catch (...) {
            m_platform.events().onProgress({});
            throw;
        }
    }

    ~Server() {
        m_platform.events().onProgress({});
        m_stop.store(true);
        m_wakeUp.signal();
        if (m_thread.joinable()) m_thread.join();
    }

    Server(Server const&) = delete;
    Server& operator=(Server const&) = delete;

  private:
    void run() {
        while (!m_stop.load()) {
            std::vector<pollfd> polled = {{m_wakeUp.get(), POLLIN, 0},
                                          {m_acceptPaused ? -1 : m_listener.get(), POLLIN, 0}};
            for (auto const& client : m_clients)
                polled.push_back(interestOf(client));
            if (!wait(polled)) continue;
            m_acceptPaused = false;
            if ((polled[0].revents & POLLIN) != 0) m_wakeUp.clear();
            auto revents = polled.begin() + 2;
            for (auto& client : m_clients)
                serve(client, (revents++)->revents);
            // Ended clients make room for waiting ones.
            dropEnded();
            if ((polled[1].revents & POLLIN) != 0) acceptClients();
            dropEnded(); // those that were refused
        }
    }

    /// Waits until a descriptor is ready. False after a failure: their states are then unknown.
    bool wait(std::vector<pollfd>& polled) {
        auto const timeout = m_acceptPaused ? static_cast<int>(kPause.count()) : -1;
        if (poll(polled.data(), polled.size(), timeout) >= 0) {
            m_pollFails = false;
            return true;
        }
        if (errno == EINTR) return false;
        // The system is short of memory, or the host has lowered its limits.
        if (!m_pollFails)
            std::fprintf(stderr,
                         "kvlsim: control socket %s: poll fails (%s) and is tried again until it "
                         "works\n",
                         m_listener.path().c_str(), std::strerror(errno));
        m_pollFails = true;
        std::this_thread::sleep_for(kPause);
        return false;
    }

    void dropEnded() {
        m_clients.remove_if([](Connection const& client) {
            return !client.busy() && (client.closing || client.ended);
        });
    }

    static pollfd interestOf(Connection const& client) {
        int events = 0;
        if (!client.output.empty()) events |= POLLOUT;
        if (!client.busy() && !client.ended) events |= POLLIN;
        return {client.socket.get(), static_cast<short>(events), 0};
    }

    void acceptClients() {
        while (true) {
            Descriptor socket = m_listener.accept();
            if (socket.get() < 0) {
                if (errno == EINTR || errno == ECONNABORTED) continue;
                // Out of descriptors: look again in a moment instead of spinning.
                m_acceptPaused = errno != EAGAIN;
                return;
            }
            bool const full = m_clients.size() >= kMaxControlClients;
            Connection& client = m_clients.emplace_back(std::move(socket));
            if (!full) continue;
            client.closing = client.ended = true;
            answer(client, errorReply("too many clients at once; close one and try again"));
        }
    }

    void serve(Connection& client, short revents) {
        if ((revents & (POLLHUP | POLLERR)) != 0) becomeDeaf(client);
        if (client.waitFor && m_platform.events().delivered() >= *client.waitFor) {
            endWait(client);
            answer(client, client.pending);
        }
        if ((revents & POLLOUT) != 0) flush(client);
        if ((revents & (POLLIN | POLLHUP | POLLERR)) != 0 && !client.busy()) receive(client);
        executeLines(client);
    }

    void becomeDeaf(Connection& client) {
        client.deaf = true;
        client.output.clear();
        if (client.waitFor) endWait(client);
    }

    void endWait(Connection& client) {
        client.waitFor.reset();
        m_draining.fetch_sub(1);
    }

    void receive(Connection& client) {
        while (!client.ended && client.input.size() <= kMaxControlLine) {
            ssize_t const size = recv(client.socket.get(), m_block.data(), m_block.size(), 0);
            if (size > 0) {
                client.input.append(m_block.data(), static_cast<std::size_t>(size));
                continue;
            }
            if (size < 0 && errno == EINTR) continue;
            if (size < 0 && errno == EAGAIN) return;
            client.ended = true;
        }
    }

    void executeLines(Connection& client) {
        std::size_t begin = 0;
        while (!client.busy() && !client.closing) {
            std::size_t end = client.input.find('\n', begin);
            std::size_t const length =
                (end == std::string::npos ? client.input.size() : end) - begin;
            if (length > kMaxControlLine) {
                client.closing = true;
                answer(client,
                       errorReply("the line has more than " + std::to_string(kMaxControlLine) +
                                  " bytes; shorten it (this connection is closed)"));
                break;
            }
            if (end == std::string::npos) {
                if (!client.ended || length == 0) break;
                end = client.input.size() - 1; // the last line lacks its line end
            }
            std::string const line = client.input.substr(begin, length);
            begin = end + 1;
            if (line.find_first_not_of(" \t\r") != std::string::npos) executeLine(client, line);
        }
        client.input.erase(0, begin);
    }

    void executeLine(Connection& client, std::string const& line) {
        std::optional<std::uint64_t> waitFor;
        nlohmann::json reply = answerLine(m_platform, line, waitFor);
        if (!waitFor || client.deaf) {
            answer(client, reply);
            return;
        }
        // Counted before the check: a later delivery sees the count and wakes the loop.
        m_draining.fetch_add(1);
        client.waitFor = waitFor;
        client.pending = std::move(reply);
        if (m_platform.events().delivered() >= *waitFor) {
            endWait(client);
            answer(client, client.pending);
        }
    }

    void answer(Connection& client, nlohmann::json const& reply) {
        if (client.deaf) return;
        client.output += asLine(reply);
        flush(client);
    }

    void flush(Connection& client) {
        std::size_t sent = 0;
        while (sent < client.output.size()) {
            ssize_t const size = send(client.socket.get(), client.output.data() + sent,
                                      client.output.size() - sent, MSG_NOSIGNAL);
            if (size < 0 && errno == EINTR) continue;
            if (size < 0 && errno == EAGAIN) break;
            if (size < 0) {
                becomeDeaf(client);
                return;
            }
            sent += static_cast<std::size_t>(size);
        }
        client.output.erase(0, sent);
    }

    static constexpr std::chrono::milliseconds kPause{200}; ///< after a temporary failure

    Platform& m_platform;
    ListeningSocket m_listener;
    WakeUp m_wakeUp;
    std::list<Connection> m_clients;
    std::array<char, 65536> m_block{}; ///< what `receive` reads into
    bool m_acceptPaused = false;
    bool m_pollFails = false;
    std::atomic<int> m_draining = 0;
    std::atomic<bool> m_stop = false;
    std::thread m_thread;
};

Server* s_server = nullptr;

} // namespace

void startControlServer(std::string const& path, Platform& platform) {
    try {
        s_server = new Server(path, platform);
    } catch (std::exception const& error) {
        std::fprintf(stderr, "kvlsim: %s\n", error.what());
        return;
    }
    static pid_t const process = getpid();
    std::atexit([] {
        if (getpid() == process) delete std::exchange(s_server, nullptr);
    });
}

} // namespace kvlsim
