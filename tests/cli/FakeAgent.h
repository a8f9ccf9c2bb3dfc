// SPDX-License-Identifier: BSD-2-Clause
// An agent that answers what a test tells it to.
#pragma once

#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

/// What a `FakeAgent` answers to one question.
struct FakeAnswer {
    std::string body;
    int status = 200;
    std::string headers = {}; ///< more of them, each with its line end
    bool isBare = false;      ///< `body` is all that is sent
    bool isNone = false;      ///< nothing is sent until the client closes the connection
};

/// A `FakeAgent` is an HTTP server with one connection at a time, on a thread of its own.
/// Thread-safe.
class FakeAgent {
  public:
    /// At a Unix socket. `answers`: as by `answerApi`, before the first question.
    explicit FakeAgent(std::string const& path,
                       std::map<std::string, std::string> const& answers = {});
    /// At a free port of the loopback address.
    FakeAgent();
    // NOLINTNEXTLINE(bugprone-exception-escape): a test whose agent cannot be stopped may end
    ~FakeAgent();
    FakeAgent(FakeAgent const&) = delete;
    FakeAgent& operator=(FakeAgent const&) = delete;

    /// From now on, the answer to GET of this target. Other targets answer 404.
    void answer(std::string const& target, FakeAnswer answer);
    /// The same for a target below /api/v1/.
    void answerApi(std::string const& path, std::string const& body) {
        answer("/api/v1/" + path, {body});
    }
    /// The heads of all requests so far.
    std::vector<std::string> requests() const;
    /// HOST:PORT of an agent that is not at a socket.
    std::string host() const { return "127.0.0.1:" + std::to_string(m_port); }

  private:
    void start();
    void serve();
    void converse(int connection);

    std::string m_path;
    int m_port = 0;
    int m_listener = -1;
    int m_stop[2] = {-1, -1};
    mutable std::mutex m_mutex; ///< guards the next two
    std::map<std::string, FakeAnswer> m_answers;
    std::vector<std::string> m_requests;
    std::thread m_thread;
};
