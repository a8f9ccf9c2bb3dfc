// SPDX-License-Identifier: BSD-2-Clause
// Starts a thread of the simulator inside somebody else's process.
#pragma once

#include <functional>
#include <thread>

namespace kvlsim {

/// The thread bears `name` (15 characters at most) and takes no signals: those are the host's.
/// Throws std::system_error when the system has no thread left.
std::thread startThread(char const* name, std::function<void()> body);

} // namespace kvlsim
