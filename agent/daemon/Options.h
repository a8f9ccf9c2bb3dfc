// SPDX-License-Identifier: BSD-2-Clause
// The agent's command line and configuration file.
#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "agent/alarms/AlarmPolicies.h"
#include "agent/alarms/TypeLimits.h"
#include "agent/log/Log.h"
#include "agent/rows/Oid.h"

namespace kvloamd {

struct Options {
    std::vector<std::string> listen{"udp:127.0.0.1:1161"};
    std::string agentx; ///< the address of the AgentX master; empty: stand-alone
    std::vector<std::string> modules;
    std::string moduleDirectory;
    std::string snmpConfig;          ///< empty: Net-SNMP's default
    std::string persistentDirectory; ///< empty: Net-SNMP's default
    Oid enterprise{1, 3, 6, 1, 4, 1, 32473};
    std::uint32_t interfaceBase = 1000;
    std::string httpSocket;    ///< the path of a Unix socket; empty: none
    std::string http;          ///< HOST:PORT; empty: no TCP
    std::string httpTokenFile; ///< empty: no token
    LogLevel logLevel = LogLevel::Info;
    AlarmPolicies alarmPolicies;
    TypeLimits typeLimits;
    bool checkConfig = false;
    bool checkSnmpConfig = false; ///< check only what a reload reads; for the agent itself

    bool operator==(Options const&) const = default;
};

/// A request to exit instead of running. With status 0, `text` is the help or the version;
/// otherwise it is an error message of one line.
struct Exit {
    int status;
    std::string text;
};

inline constexpr int kExitFailure = 1;
inline constexpr int kExitUsage = 2;

/// Reads the command line, and the file that its --config names. The command line takes precedence.
std::variant<Options, Exit> parseOptions(int argc, char const* const* argv);

/// Parses "1.3.6.1.4.1.32473", with or without a leading dot. Nothing when `text` is not an object
/// identifier of at least two numbers.
std::optional<Oid> parseOid(std::string_view text);

} // namespace kvloamd
