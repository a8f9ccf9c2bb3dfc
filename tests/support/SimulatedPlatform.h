// SPDX-License-Identifier: BSD-2-Clause
// Commands for the simulated platform of a test.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "simulator/exports/Control.h"

namespace sim {

using Json = nlohmann::json;

/// Executes `command`, which must succeed.
inline Json command(Json const& command) {
    Json reply = kvlsim::execute(command);
    EXPECT_TRUE(reply.value("ok", false)) << command << " answered " << reply;
    return reply;
}

/// Waits until everything announced so far has been delivered.
inline void drain() {
    command({{"command", "drain"}});
}

/// Announces `id` of `board` to this process, as the platform would, and waits for its delivery.
inline void deliver(std::uint32_t id, int board) {
    command({{"command", "event"}, {"id", id}, {"board", board}});
    drain();
}

/// The same for a message without a board.
inline void deliver(std::uint32_t id) {
    command({{"command", "event"}, {"id", id}});
    drain();
}

inline void set(int object, char const* attribute, Json const& value) {
    command({{"command", "set"}, {"object", object}, {"attribute", attribute}, {"value", value}});
}

inline void unset(int object, char const* attribute) {
    command({{"command", "unset"}, {"object", object}, {"attribute", attribute}});
}

/// A board of a chassis: `attributes` is a list such as `NAME: X, IRQ: 5`; `rest` may add devices.
inline std::string board(int handle, std::string const& serialNumber,
                         std::string const& attributes = "", std::string const& rest = "") {
    return "  - {handle: " + std::to_string(handle) + ", attributes: {SERIAL_NUMBER: \"" +
           serialNumber + "\"" + (attributes.empty() ? "" : ", " + attributes) + "}" +
           (rest.empty() ? "" : ", " + rest) + "}\n";
}

/// Replaces the chassis by one with these boards. Announces nothing.
inline void load(std::initializer_list<std::string> boards) {
    std::string text = "boards:\n";
    for (auto const& one : boards)
        text += one;
    kvlsim::loadChassis(text);
}

/// A chassis of boards 1 to `count`, with the serial numbers S1, S2 ...
inline void loadMany(int count) {
    std::string text = "boards:\n";
    for (int handle = 1; handle <= count; ++handle)
        text += board(handle, "S" + std::to_string(handle));
    kvlsim::loadChassis(text);
}

} // namespace sim
