// SPDX-License-Identifier: BSD-2-Clause
// The description of the attribute store in a chassis.
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "simulator/chassis/StoreSchema.h"

namespace kvlsim {

using FieldValues = std::vector<std::pair<RecordField const*, FieldValue>>;

/// A `StoreBoardDraft` is a board's record as it is described. Fields that are left out come from
/// the chassis's board with this serial number.
struct StoreBoardDraft {
    std::string serial;
    std::string family; ///< empty: left out
    FieldValues fields;
    int line = 0; ///< where it was described; 0 when it came without lines
};

/// A `StoreDraft` is the part "store" of a chassis.
struct StoreDraft {
    std::optional<std::vector<std::string>> families;   ///< none: the known ones and the boards'
    std::optional<std::vector<StoreBoardDraft>> boards; ///< none: all boards that have a family
};

} // namespace kvlsim
