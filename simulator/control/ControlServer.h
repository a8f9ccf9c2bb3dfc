// SPDX-License-Identifier: BSD-2-Clause
// The control socket: JSON lines over a Unix stream socket, served by one thread.
#pragma once

#include <string>

#include "simulator/platform/Platform.h"

namespace kvlsim {

/// The most bytes of a request line, without its line end: enough for a board of ten thousand
/// objects.
inline constexpr std::size_t kMaxControlLine = std::size_t(8) << 20;
/// The most clients that are served at once.
inline constexpr std::size_t kMaxControlClients = 64;

/// Serves `platform` on a socket at `path` until the process ends. When that is not possible, says
/// why on standard error and leaves the platform without control. Called once.
void startControlServer(std::string const& path, Platform& platform);

} // namespace kvlsim
