// SPDX-License-Identifier: BSD-2-Clause
// The flow control of a network device of this host.
#pragma once

#include <optional>
#include <string>

/// What a device does with pause frames.
struct HostPause {
    bool isNegotiated = false; ///< what it does is agreed with the other end
    bool receives = false;     ///< it obeys them
    bool sends = false;
};

/// Asks the kernel; nothing if the device has no flow control, or its driver does not know.
std::optional<HostPause> readHostPause(std::string const& device);

/// The value of dot3PauseAdminMode and dot3PauseOperMode.
constexpr int pauseMode(HostPause const& pause) {
    return 1 + (pause.sends ? 1 : 0) + (pause.receives ? 2 : 0);
}
