// SPDX-License-Identifier: BSD-2-Clause
// How a refresh grows with the boards.
#pragma once

/// Prints what a refresh takes for more and more boards. Returns whether twice as many boards take
/// at most 2.2 times as long.
bool reportGrowth();
