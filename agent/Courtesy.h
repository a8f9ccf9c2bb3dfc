// SPDX-License-Identifier: BSD-2-Clause
// Reading boards gives way to requests.
#pragma once

namespace kvloamd {

/// Called between two boards by whoever reads many of them: gives the processor to who waits for
/// it, once a millisecond. A thread that works to the end of its slice of time, nice as it may be,
/// is left alone by the system there, and a request would wait for up to five milliseconds.
///
/// Not at every board: on a processor that others never leave, each time can cost a turn of theirs.
void giveWay();

} // namespace kvloamd
