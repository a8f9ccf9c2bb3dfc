// SPDX-License-Identifier: BSD-2-Clause
// The context of a control command, and the commands that are in files of their own.
#pragma once

#include <cstdint>
#include <optional>

#include <nlohmann/json.hpp>

#include "simulator/control/Arguments.h"
#include "simulator/platform/Platform.h"

namespace kvlsim {

/// A `CommandContext` is the platform and the arguments that a control command works on.
struct CommandContext {
    Platform& platform;
    Arguments const& arguments;
    std::optional<std::uint64_t>& waitFor;

    std::uint64_t announce(EventId id, std::int32_t board, std::uint16_t fault = 0) const {
        return platform.events().announce({static_cast<std::uint32_t>(id), board, fault});
    }
};

/// `NoChassis` is thrown when a command needs a chassis and there is none.
struct NoChassis {};

template <typename AnyChassis>
AnyChassis& present(AnyChassis* chassis) {
    if (chassis == nullptr) throw NoChassis();
    return *chassis;
}

nlohmann::json listStore(CommandContext const& context);
nlohmann::json addToStore(CommandContext const& context);
nlohmann::json setInStore(CommandContext const& context);
nlohmann::json removeFromStore(CommandContext const& context);

nlohmann::json listLines(CommandContext const& context);
nlohmann::json addLineErrors(CommandContext const& context);
nlohmann::json setLineRates(CommandContext const& context);
nlohmann::json setLineAlarm(CommandContext const& context);
nlohmann::json mendLine(CommandContext const& context);

nlohmann::json listCalls(CommandContext const& context);
nlohmann::json setUpCall(CommandContext const& context);
nlohmann::json releaseCall(CommandContext const& context);
nlohmann::json chargeCall(CommandContext const& context);
nlohmann::json setSignalling(CommandContext const& context);

nlohmann::json listProcesses(CommandContext const& context);
nlohmann::json addProcess(CommandContext const& context);
nlohmann::json endProcess(CommandContext const& context);

} // namespace kvlsim
