// SPDX-License-Identifier: BSD-2-Clause
// The board platform, as the start of the agent finds it.
#pragma once

namespace kvloamd {

/// Asks the platform for its root object. Returns whether it answered; a fault has been logged.
bool rootObjectAnswers();

/// Creates the library's singletons, whose first calls must come from one thread. Returns whether
/// the platform answers; a fault has been logged.
bool platformAnswers();

} // namespace kvloamd
