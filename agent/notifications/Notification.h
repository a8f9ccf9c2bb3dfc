// SPDX-License-Identifier: BSD-2-Clause
// A notification: which one it is, and what it carries.
#pragma once

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

#include "agent/objects/Value.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// An object that a notification carries, with a value of its own: no snapshot is behind it.
struct NotifiedObject {
    Oid name; ///< absolute
    ValueType type = ValueType::Integer;
    /// An unsigned number of 64 bits as the same bits.
    std::variant<std::int64_t, std::string, Oid> value;

    /// Good while the object is.
    Value view() const;
};

struct Notification {
    Oid name; ///< absolute
    std::vector<NotifiedObject> objects;
    Clock::time_point when; ///< of what it tells of
};

/// kvlBoardStatusChange. `enterprise` is the arc above all names of KVL-OAM-MIB.
Notification boardStatusChange(Oid const& enterprise, int boardIndex, std::string serialNumber,
                               int status);

/// A fault has been raised or cleared.
struct FaultNews {
    bool raised = true;
    int boardIndex = 0; ///< 0: of a board that the agent does not know
    std::string serialNumber;
    std::uint16_t value = 0;
    int platformBoard = 0; ///< the number by which the platform speaks of the board
};

/// kvlFaultRaised or kvlFaultCleared.
Notification faultChange(Oid const& enterprise, FaultNews const& news);

} // namespace kvloamd
