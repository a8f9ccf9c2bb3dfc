// SPDX-License-Identifier: BSD-2-Clause
// The objects by which people recognise what a notification is about.
#pragma once

#include <span>

#include "agent/notifications/Notification.h"
#include "agent/objects/ServedTree.h"

namespace kvloamd {

/// Appends the objects that name the subject of `notification`, after its own objects:
///
/// - an interface: ifName, ifAlias, and its board's kvlBoardSerialNumber;
/// - a physical entity: entPhysicalName, entPhysicalAlias, and the same;
/// - a board: kvlBoardName.
///
/// Their values are those that a GET answers from the same `facts`. An object that has no instance,
/// such as one of a board that has been removed, is left out. `trees`: KVL-OAM-MIB's and that of
/// the standard modules.
void nameSubject(Notification& notification, std::span<ServedTree const> trees, Facts const& facts);

} // namespace kvloamd
