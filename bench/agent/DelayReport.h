// SPDX-License-Identifier: BSD-2-Clause
// How long requests take while boards are read.
#pragma once

#include "Judgement.h"

/// Asks an agent that reads `boards` boards all the time, in turns with one that reads none. Prints
/// the distribution of the times, and enters how much longer those of the first agent are.
void reportDelays(int boards, Judgement& judgement);
