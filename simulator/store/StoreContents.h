// SPDX-License-Identifier: BSD-2-Clause
// What a new attribute store holds: as the chassis describes it, or made from its boards.
#pragma once

#include <string>
#include <vector>

#include "simulator/chassis/Chassis.h"
#include "simulator/chassis/StoreDraft.h"
#include "simulator/chassis/StoreSchema.h"

namespace kvlsim {

/// A `StoreBoard` is a record with the name of its family.
struct StoreBoard {
    std::string family;
    BoardRecord record;
};

/// `StoreContents` are the families and records of a new store.
struct StoreContents {
    std::vector<std::string> families;
    std::vector<StoreBoard> boards;
};

/// A record, its family included (empty: unknown). `board` may be null.
StoreBoard makeRecord(StoreBoardDraft const& draft, ChassisObject const* board);
/// The contents of a new store for this chassis.
StoreContents contentsFor(Chassis const& chassis);

} // namespace kvlsim
