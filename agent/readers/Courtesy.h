// SPDX-License-Identifier: BSD-2-Clause
// Lets requests run while boards are read.
#pragma once

namespace kvloamd {

/// Yields the CPU between boards, at most once per millisecond, so that requests are not delayed.
/// Yielding after every board would starve the reader on a saturated CPU.
void yieldBetweenBoards();

} // namespace kvloamd
