// SPDX-License-Identifier: BSD-2-Clause
// The tool's connection to a simulated platform's control socket.
#pragma once

#include <chrono>
#include <functional>
#include <stdexcept>
#include <string>

#include <nlohmann/json.hpp>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

/// A `ToolError` says in one line why the tool gives up and what to do.
class ToolError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// A `ControlClient` is a connection to a platform's control socket. Unsynchronised.
class ControlClient {
  public:
    /// Throws ToolError when no platform listens at `path`.
    ControlClient(std::string path, std::chrono::seconds timeout);

    /// Sends a command and returns its reply. Throws ToolError when the platform refuses it, with
    /// the platform's own words, or when no reply comes in time.
    nlohmann::json request(nlohmann::json const& command);

  private:
    void send(std::string const& line);
    std::string receiveLine();
    void waitReady(short events);

    std::string m_path;
    std::chrono::seconds m_timeout;
    Descriptor m_socket;
    std::string m_received;
};

/// Connects to the platform that the command line names. Throws ToolError.
using Connect = std::function<ControlClient()>;

} // namespace kvlsim
