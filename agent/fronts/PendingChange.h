// SPDX-License-Identifier: BSD-2-Clause
// One variable of a SET, and the error status that a SET fails with.
#pragma once

#include <optional>
#include <utility>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// The error status of a fault, which is the same number in SNMP and in AgentX.
inline int errorStatusOf(SetFault fault) {
    switch (fault) {
    case SetFault::None:
        return 0;
    case SetFault::WrongType:
        return 7;
    case SetFault::WrongLength:
        return 8;
    case SetFault::WrongValue:
        return 10;
    case SetFault::NoCreation:
        return 11;
    case SetFault::NotWritable:
        break;
    }
    return 17;
}

/// A `PendingChange` is one variable of a SET between its test and the end of the SET. Undo the
/// changes of a SET last to first, because a SET may contain an instance twice. Unsynchronised.
class PendingChange {
  public:
    explicit PendingChange(Change change) : m_change(std::move(change)) {}

    /// Makes the change, once.
    void commit(Settings& settings) {
        if (m_committed) return;
        m_former = settings.exchange(m_change.key, m_change.value);
        m_committed = true;
    }
    /// Restores the former value if the change was made.
    void undo(Settings& settings) {
        if (m_committed) settings.exchange(m_change.key, std::move(m_former));
        m_committed = false;
    }

  private:
    Change m_change;
    bool m_committed = false;
    std::optional<SettingValue> m_former;
};

} // namespace kvloamd
