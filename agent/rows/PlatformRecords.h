// SPDX-License-Identifier: BSD-2-Clause
// What the board platform keeps about the boards.
#pragma once

#include <vector>

#include "agent/rows/DeviceRows.h"
#include "agent/rows/StoreRow.h"

namespace kvloamd {

/// Changes rarely and may be large: snapshots share one while nothing is read anew.
struct PlatformRecords {
    std::vector<DeviceRow> devices; ///< all ascending by index
    std::vector<SubDeviceRow> subDevices;
    std::vector<ProcessorRow> processors;
    std::vector<StoreRow> store;
};

} // namespace kvloamd
