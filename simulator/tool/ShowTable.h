// SPDX-License-Identifier: BSD-2-Clause
// Prints the reply to "show" for people.
#pragma once

#include <ostream>

#include <nlohmann/json.hpp>

namespace kvlsim {

/// One line per board.
void printBoards(nlohmann::json const& reply, std::ostream& out);
/// Everything about the boards of the reply: attributes, devices, processors.
void printDetails(nlohmann::json const& reply, std::ostream& out);

} // namespace kvlsim
