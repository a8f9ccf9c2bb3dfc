// SPDX-License-Identifier: BSD-2-Clause
// The dispatcher of control commands.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

#include "simulator/platform/Platform.h"

namespace kvlsim {

/// Executes a command on the platform. Never throws. A "drain" does not wait here: `waitFor` is set
/// to the number of the event after whose delivery the reply may be sent.
nlohmann::json dispatch(Platform& platform, nlohmann::json const& command,
                        std::optional<std::uint64_t>& waitFor);

/// The same for a command as a line of the control socket, which need not be JSON.
nlohmann::json answerLine(Platform& platform, std::string const& line,
                          std::optional<std::uint64_t>& waitFor);

nlohmann::json errorReply(std::string_view error);
/// A reply as a line of the control socket, its line end included.
std::string asLine(nlohmann::json const& reply);

} // namespace kvlsim
