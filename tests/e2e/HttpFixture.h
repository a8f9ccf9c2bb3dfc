// SPDX-License-Identifier: BSD-2-Clause
// An agent that answers HTTP, and its clients.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "tests/e2e/AgentFixture.h"
#include "tests/support/HttpClient.h"

namespace kvloamd::e2e {

class HttpFixture : public AgentFixture {
  protected:
    using Json = nlohmann::json;

    std::string socketPath() const { return path("http.socket"); }
    /// Starts the agent with a Unix socket.
    void startHttpAgent(std::vector<std::string> arguments = {}) {
        arguments.insert(arguments.end(), {"--http-socket", socketPath()});
        startAgent(arguments);
    }
    /// The document at `target`, below /api/v1/; expects that there is one.
    Json document(std::string const& target) const {
        auto const reply = support::HttpClient(socketPath()).ask("/api/v1/" + target);
        EXPECT_EQ(reply.status, 200) << target << ": " << reply.body;
        return reply.status == 200 ? Json::parse(reply.body) : Json();
    }
    /// Whether a value that was read between two others can be right.
    static bool isBetween(Json const& before, Json const& value, Json const& after) {
        if (value == before || value == after) return true;
        return before.is_number() && value.is_number() && after.is_number() &&
               std::min(before, after) <= value && value <= std::max(before, after);
    }
};

} // namespace kvloamd::e2e
