// SPDX-License-Identifier: BSD-2-Clause
// The dispatcher of control commands.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include <nlohmann/json.hpp>

#include "simulator/platform/Platform.h"

namespace kvlsim {

/// Executes a command on the platform. Never throws. A "drain" does not wait here: `waitFor` is set
/// to the number of the event after whose delivery the reply may be sent.
nlohmann::json dispatch(Platform& platform, nlohmann::json const& command,
                        std::optional<std::uint64_t>& waitFor);

nlohmann::json errorReply(std::string_view error);

} // namespace kvlsim
