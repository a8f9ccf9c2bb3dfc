// SPDX-License-Identifier: BSD-2-Clause
// How the processor time of a refresh grows with the boards.
#pragma once

#include "Judgement.h"

/// Refreshes 125 to 1,000 boards in turns. Enters the times and their growth.
void reportGrowth(Judgement& judgement);
