// SPDX-License-Identifier: BSD-2-Clause
// Reads the ISDN channels of one board.
#pragma once

#include "agent/readers/BoardInterfaces.h"
#include "agent/readers/InterfaceDraft.h"
#include "board/ISDNFeature.h"

namespace kvloamd {

/// Enters the signalling channels of `feature`, their data links and the bearer channels, each
/// above its line. The lines of the board have been entered before.
void readChannels(ISDNFeature& feature, ToTicks const& toTicks, InterfaceDraft& draft);

} // namespace kvloamd
