// SPDX-License-Identifier: BSD-2-Clause
// A line and its index.
#pragma once

#include <cstdint>

#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"

namespace kvloamd {

struct PlacedLine {
    std::uint32_t ifIndex;
    ReferenceCounter<DS1LineDevice> line;
    std::uint32_t boardIndex = 0;
};

} // namespace kvloamd
