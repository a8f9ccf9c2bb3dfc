// SPDX-License-Identifier: BSD-2-Clause
// Boards that throw when they are asked.
#pragma once

#include <cstdint>
#include <functional>

namespace kvloamd {

/// Calls `read`, which reads `what` of a board, such as "interfaces". Returns false if `read`
/// threw: a board that does not answer must not stop the agent from reading the others. The log
/// says when this begins and when it ends. Thread-safe.
bool readGuarded(std::uint32_t boardIndex, char const* what, std::function<void()> const& read);

} // namespace kvloamd
