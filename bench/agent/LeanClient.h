// SPDX-License-Identifier: BSD-2-Clause
// Asks an agent with requests that were written beforehand, so that the agent's time is measured.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "agent/objects/Value.h"

/// The names of a response and the octets of their values, as they came.
struct Answered {
    kvloamd::Oid name;
    std::string value; ///< with its type and length
};

/// One socket, connected to a port of loopback.
class LeanClient {
  public:
    explicit LeanClient(int port);
    ~LeanClient();
    LeanClient(LeanClient const&) = delete;
    LeanClient& operator=(LeanClient const&) = delete;

    /// A GETBULK request of version 2c, without non-repeaters.
    static std::string bulkRequest(std::vector<kvloamd::Oid> const& names, int repetitions);
    /// Sends a request and waits for its response; reads no more of it than its size. The response
    /// is good until the next request. Throws std::runtime_error when none comes.
    std::string_view ask(std::string const& request);
    /// Reads a response. Throws std::runtime_error when it tells of an error.
    static std::vector<Answered> read(std::string_view response);
    /// Waits until the agent serves `name` or something below it.
    void waitFor(kvloamd::Oid const& name);

  private:
    std::string_view receive(int milliseconds);

    int m_socket;
    std::array<char, 65536> m_response{};
};

/// A port of loopback that nobody has bound.
int freePort();
