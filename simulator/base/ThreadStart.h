// SPDX-License-Identifier: BSD-2-Clause
// Starts a thread of the simulator in the host process.
#pragma once

#include <functional>
#include <thread>

namespace kvlsim {

/// Starts a thread called `name` (at most 15 characters), which blocks all signals: they are for
/// the host's own threads. Throws std::system_error when the system cannot make another thread.
std::thread startThread(char const* name, std::function<void()> body);

} // namespace kvlsim
