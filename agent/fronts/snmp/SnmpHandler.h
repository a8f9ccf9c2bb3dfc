// SPDX-License-Identifier: BSD-2-Clause
// Answers SNMP requests for the objects of a tree.
#pragma once

#include <functional>
#include <memory>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// An `SnmpHandler` answers the SNMP library's calls for all objects of a tree, from a snapshot.
/// Thread-bound to the SNMP thread.
class SnmpHandler {
  public:
    using TakeSnapshot = std::function<std::shared_ptr<Snapshot const>()>;

    /// `tree`, `counters` and `settings` outlive the handler. `arc` precedes all names
    /// of the tree.
    SnmpHandler(ObjectTree const& tree, Counters const& counters, Oid arc,
                TakeSnapshot takeSnapshot, Settings& settings);
    SnmpHandler(SnmpHandler const&) = delete;
    SnmpHandler& operator=(SnmpHandler const&) = delete;

    /// Registers all names below `place`, relative, until the library stops. Returns false when the
    /// library refuses.
    bool serve(Oid const& place);

    /// One call of the library; for the implementation only.
    struct Call;

  private:
    ObjectTree const& m_tree;
    Counters const& m_counters;
    Oid m_arc;
    TakeSnapshot m_takeSnapshot;
    Settings& m_settings;
};

} // namespace kvloamd
