// SPDX-License-Identifier: BSD-2-Clause
// The connection to the agent.
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "cli/Answer.h"

namespace kvloam {

/// Where the agent is.
struct AgentAddress {
    std::string socket;    ///< the path of its Unix socket; used when there is no host
    std::string host;      ///< HOST:PORT, or a URL of http or https
    std::string tokenFile; ///< its first line is sent as the token; empty: none
    std::chrono::milliseconds timeout{10000}; ///< for one answer
};

/// A `Client` asks one agent by HTTP. Unsynchronised.
class Client {
  public:
    /// More octets than any answer has.
    static constexpr std::size_t kMostOctets = std::size_t{256} << 20U;

    /// Reads the token. Connects with the first question. Throws CliError.
    explicit Client(AgentAddress address, std::size_t mostOctets = kMostOctets);
    ~Client();
    Client(Client const&) = delete;
    Client& operator=(Client const&) = delete;

    /// The answer to `GET /api/v1/<path>`. `path` consists of names, which are escaped here;
    /// `query` is appended as it stands. Throws CliError: with `kNoAgent` when no agent answers,
    /// with `kFailure` when it refuses or its answer is no JSON object.
    Json get(std::vector<std::string> const& path, std::string const& query = {});
    /// The same; nothing when the agent answers that there is no such thing.
    std::optional<Json> find(std::vector<std::string> const& path, std::string const& query = {});

    /// From now on, an answer is kept, and not sent again by the agent while it is the same.
    void keepAnswers() { m_keeps = true; }

  private:
    struct Response;
    struct Kept {
        std::string etag;
        Json answer;
        std::chrono::steady_clock::time_point received;

        /// The answer with the age that its snapshot has now.
        Json present() const;
    };

    Response perform(std::string const& url, std::string const& etag);
    [[noreturn]] void refuse(int code, char const* reason, long systemError) const;

    struct Handle;
    std::unique_ptr<Handle> m_handle;
    AgentAddress m_address;
    std::size_t m_mostOctets;
    std::string m_base; ///< of all URLs
    std::string m_token;
    bool m_keeps = false;
    std::map<std::string, Kept> m_kept; ///< by URL
};

} // namespace kvloam
