// SPDX-License-Identifier: BSD-2-Clause
// Control of the simulated platform from within its own process.
#include "simulator/exports/Control.h"

#include <cstdint>
#include <optional>
#include <stdexcept>

#include "simulator/chassis/ChassisError.h"
#include "simulator/control/Commands.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/exports/Start.h"

namespace kvlsim {

nlohmann::json execute(nlohmann::json const& command) {
    Platform& platform = startedPlatform();
    std::optional<std::uint64_t> waitFor;
    nlohmann::json reply = dispatch(platform, command, waitFor);
    if (!waitFor || platform.events().waitDelivered(*waitFor)) return reply;
    return errorReply(platform.events().onDeliveryThread()
                          ? "drain cannot wait on the delivery thread itself; call it on another"
                          : "events are no longer delivered: the process ends");
}

void loadChassis(std::string const& yamlText) {
    try {
        Platform::instance().replaceChassis(readChassis(yamlText));
    } catch (ChassisError const& error) {
        throw std::runtime_error(describeError("chassis", error));
    }
}

void setLineClock(std::chrono::nanoseconds (*clock)()) {
    Platform::instance().chassis().setLineClock(clock);
}

void setCounterClock(std::chrono::nanoseconds (*clock)()) {
    Platform::instance().processes().setClock(clock);
}

} // namespace kvlsim
