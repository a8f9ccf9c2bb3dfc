// SPDX-License-Identifier: BSD-2-Clause
// How the processor time of a refresh grows with the boards.
#pragma once

#include "Judgement.h"

/// Refreshes 125 to 4,000 boards in turns, after several kinds of changes. Enters the times, their
/// growth, and what a refresh takes that finds little changed relative to one that reads
/// everything.
void reportGrowth(Judgement& judgement);
