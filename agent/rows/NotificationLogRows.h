// SPDX-License-Identifier: BSD-2-Clause
// The notifications that were sent last, as NOTIFICATION-LOG-MIB shows them.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <variant>
#include <vector>

#include "agent/rows/Oid.h"
#include "agent/rows/VariableType.h"

namespace kvloamd {

/// A variable of a notification.
struct LoggedVariable {
    Oid name; ///< absolute
    VariableType type = VariableType::Integer32;
    /// An unsigned 64-bit number is stored with the same bits.
    std::variant<std::int64_t, std::string, Oid> value;

    bool operator==(LoggedVariable const&) const = default;
};

/// A notification, without the two variables that every notification begins with.
struct LoggedNotification {
    Oid name; ///< absolute
    std::vector<LoggedVariable> variables;

    bool operator==(LoggedNotification const&) const = default;
};

/// A notification in the log, which has no name.
struct NotificationRow {
    std::uint32_t number = 0; ///< its sequence number among all events
    std::uint32_t time = 0;   ///< hundredths of a second since the agent's start; 0: before it
    std::string date;         ///< as `dateOctets`
    Oid name;                 ///< absolute

    std::array<std::uint32_t, 2> index() const { return {0, number}; }
};

/// A variable of a notification in the log.
struct NotificationVariableRow {
    std::uint32_t notification = 0; ///< its number
    std::uint32_t variable = 0;     ///< from 1
    LoggedVariable logged;

    std::array<std::uint32_t, 3> index() const { return {0, notification, variable}; }
};

/// The one log.
struct NotificationLogRow {
    std::uint32_t logged = 0; ///< notifications since the agent's start
    std::uint32_t bumped = 0; ///< removed to make room, since the agent's start

    std::array<std::uint32_t, 1> index() const { return {0}; }
};

/// All ascending by index.
struct NotificationLogRows {
    std::vector<NotificationRow> notifications;
    std::vector<NotificationVariableRow> variables;
    std::vector<NotificationLogRow> logs{1};
    std::uint32_t limit = 0; ///< how many notifications are kept
    std::uint32_t age = 0;   ///< minutes after which they are removed
};

} // namespace kvloamd
