// SPDX-License-Identifier: BSD-2-Clause
// What a new attribute store holds: as the chassis describes it, or made from its boards.
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "simulator/Description.h"
#include "simulator/StoreSchema.h"

namespace kvlsim {

class Chassis;
struct ChassisObject;

using FieldValues = std::vector<std::pair<RecordField const*, FieldValue>>;

/// A board's record as it is described; what is left out comes from the chassis's board with this
/// serial number.
struct StoreBoardDraft {
    std::string serial;
    std::string family; ///< empty: left out
    FieldValues fields;
    int line = 0; ///< where it was described; 0 when it came without lines
};

/// The part "store" of a chassis.
struct StoreDraft {
    std::optional<std::vector<std::string>> families;   ///< none: the known ones and the boards'
    std::optional<std::vector<StoreBoardDraft>> boards; ///< none: all boards that have a family
};

struct StoreBoard {
    std::string family;
    BoardRecord record;
};

struct StoreContents {
    std::vector<std::string> families;
    std::vector<StoreBoard> boards;
};

/// Both throw ChassisError. `fields` is a map "name: value"; SerialNumber is not among them.
StoreDraft readStore(Description const& store);
FieldValues readFields(Description const& fields);
/// What cannot be a family's name or a serial number.
void refuseUnfitFamily(std::string_view name, int line);
void refuseUnfitSerial(std::string_view serial, int line);

/// Refuses described boards that belong to no family of the store; throws ChassisError.
void refuseHomelessBoards(StoreDraft const& store, Chassis const& chassis);

/// A record, its family included (empty: unknown). `board` may be null.
StoreBoard makeRecord(StoreBoardDraft const& draft, ChassisObject const* board);
/// What the store of this chassis holds.
StoreContents contentsFor(Chassis const& chassis);

} // namespace kvlsim
