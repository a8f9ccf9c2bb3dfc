// SPDX-License-Identifier: BSD-2-Clause
// The agent's command line and configuration file.
#pragma once

#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "agent/log/Log.h"
#include "agent/rows/Oid.h"

namespace kvloamd {

struct Options {
    std::vector<std::string> listen{"udp:127.0.0.1:1161"};
    std::string agentx; ///< the SNMP master's address; empty: the agent stands alone
    std::vector<std::string> modules;
    std::string moduleDirectory;
    std::string snmpConfig;          ///< empty: where Net-SNMP looks by itself
    std::string persistentDirectory; ///< empty: Net-SNMP's own
    Oid enterprise{1, 3, 6, 1, 4, 1, 32473};
    std::uint32_t interfaceBase = 1000;
    LogLevel logLevel = LogLevel::Info;
    bool checkConfig = false;

    bool operator==(Options const&) const = default;
};

/// Why there are no options: the text to print and the status to exit with. The text is help or
/// the version when the status is 0, else one line of what is wrong.
struct Exit {
    int status;
    std::string text;
};

inline constexpr int kExitFailure = 1;
inline constexpr int kExitUsage = 2;

/// Reads the command line, and the file that it names with --config. The command line wins.
std::variant<Options, Exit> parseOptions(int argc, char const* const* argv);

/// "1.3.6.1.4.1.32473", with or without a leading dot; nothing when `text` is no such name of at
/// least two numbers.
std::optional<Oid> parseOid(std::string_view text);

} // namespace kvloamd
