// SPDX-License-Identifier: BSD-2-Clause
// Reading boards gives way to requests.
#pragma once

namespace kvloamd {

/// Called between two boards by whoever reads many of them: gives the processor to who waits for
/// it, once a millisecond. Without it a few requests in ten thousand waited for five milliseconds
/// while a single processor read boards, although the reading thread is nice.
///
/// Not at every board: on a processor that another program never leaves, readings then do not end.
void giveWay();

} // namespace kvloamd
