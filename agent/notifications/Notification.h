// SPDX-License-Identifier: BSD-2-Clause
// Notifications, independent of the protocol that carries them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "agent/objects/Value.h"
#include "agent/rows/NotificationLogRows.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// snmpTrapOID.0, the object that names the notification in which it is sent.
inline Oid const kSnmpTrapOid{1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0};

/// sysUpTime.0.
inline Oid const kSysUpTime{1, 3, 6, 1, 2, 1, 1, 3, 0};

/// An object in a notification. It owns its value, so it does not depend on a snapshot.
struct NotifiedObject {
    Oid name; ///< absolute
    ValueType type = ValueType::Integer;
    /// An unsigned 64-bit number is stored with the same bits.
    std::variant<std::int64_t, std::string, Oid> value;

    /// A view of `value`, valid as long as this object.
    Value view() const;
};

/// What a notification is about: one of these, the others are 0. All 0: what is in its objects.
struct Subject {
    std::uint32_t ifIndex = 0;
    std::uint32_t entity = 0; ///< an entPhysicalIndex
    std::uint32_t boardIndex = 0;
};

struct Notification {
    Oid name; ///< absolute
    std::vector<NotifiedObject> objects;
    Clock::time_point when; ///< the time of the event
    Subject subject = {};
    /// sysUpTime when the event began, if that is earlier than now; the notification carries it.
    std::optional<std::uint32_t> sysUpTime = std::nullopt;
};

/// The notification that the agent has started.
Notification startNotification();

/// The name of kvlEventNumber's instance. `enterprise`: the arc above KVL-OAM-MIB.
Oid eventNumberName(Oid const& enterprise);

/// What the log of notifications keeps of one.
LoggedNotification logged(Notification const& notification);

/// The name of a notification in its MIB module, or its numbers if it is not one of the agent's.
std::string notificationName(Oid const& enterprise, Oid const& name);

/// What became of a notification that was handed over.
enum class Delivery {
    Sent,    ///< to every receiver
    Dropped, ///< at least one receiver does not get it
    Awaited, ///< it was sent to every receiver, of whom some have yet to acknowledge it
    // What becomes of one that is awaited.
    Acknowledged,  ///< by all who should
    Unacknowledged ///< at least one has not, however often it was asked
};

/// Makes a kvlBoardStatusChange. `enterprise`: the arc above KVL-OAM-MIB.
Notification boardStatusNotification(Oid const& enterprise, int boardIndex,
                                     std::string serialNumber, int status);

/// A fault that was raised or cleared.
struct FaultChange {
    bool raised = true;
    int boardIndex = 0; ///< 0: the board is not known
    std::string serialNumber;
    std::uint16_t value = 0;
    int platformBoard = 0; ///< the platform board number
};

/// Makes a kvlFaultRaised or kvlFaultCleared.
Notification faultNotification(Oid const& enterprise, FaultChange const& change);

} // namespace kvloamd
