// SPDX-License-Identifier: BSD-2-Clause
// Boards from files or options, and attribute values from words, as the tool sends them.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <nlohmann/json.hpp>

#include "simulator/description/Findings.h"
#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// The errors that were found in a file, as lines that follow "kvlsim: ".
ToolError errorsOf(Findings const& findings, std::string const& path);

/// The boards of a file, which holds one board or a chassis, in YAML or JSON. Throws ToolError with
/// all errors of the file.
std::vector<nlohmann::json> readBoardFile(std::string const& path);

/// `BoardOptions` are the options of `kvlsim insert`; an empty or zero one gets a default value.
struct BoardOptions {
    std::int64_t handle = 0;
    std::string serial;
    std::string name;
    std::string family;
    std::string platform;
    std::string description;
    std::int32_t devices = 0;
    std::vector<std::string> attributes; ///< NAME=VALUE
};

/// A board from options; `reply` is the reply to "show", which shows the handles in use. Throws
/// ToolError.
nlohmann::json makeBoard(BoardOptions const& options, nlohmann::json const& reply);

/// A value as it is written in a command: a number where it reads as one and the attribute is not
/// known to be a text. `form` is empty or one of text, number, short, byte, empty, descriptor.
nlohmann::json attributeValue(std::string_view name, std::string const& words,
                              std::string const& form);

/// An object of attributes from "NAME=VALUE" words. Throws ToolError.
nlohmann::json attributesFrom(std::vector<std::string> const& words);

} // namespace kvlsim
