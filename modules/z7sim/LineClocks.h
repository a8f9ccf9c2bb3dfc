// SPDX-License-Identifier: BSD-2-Clause
// The clocks that date the changes of lines.
#pragma once

/// The two clocks of this host, in whole seconds. They can be replaced, so that tests set them.
struct LineClocks {
    long (*system)();    ///< since the epoch; may be set at any time
    long (*monotonic)(); ///< never set

    /// The ones in use. Replace them only while no line is ticked or asked.
    static LineClocks& inUse();
};
