// SPDX-License-Identifier: BSD-2-Clause
// Answers SNMP requests from an object tree and a snapshot.
#pragma once

#include <functional>
#include <memory>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// One handler for all objects of a tree. Used on the thread that does all SNMP only.
class SnmpHandler {
  public:
    using TakeSnapshot = std::function<std::shared_ptr<Snapshot const>()>;

    /// `tree`, `counters` and `settings` outlive the handler. `arc` is above all names
    /// of the tree.
    SnmpHandler(ObjectTree const& tree, Counters const& counters, Oid arc,
                TakeSnapshot takeSnapshot, Settings& settings);
    SnmpHandler(SnmpHandler const&) = delete;
    SnmpHandler& operator=(SnmpHandler const&) = delete;

    /// Takes over all names under `place`, relative, until the library stops. Returns false when
    /// the library refuses.
    bool serve(Oid const& place);

    /// What the library calls; for the implementation only.
    struct Call;

  private:
    ObjectTree const& m_tree;
    Counters const& m_counters;
    Oid m_arc;
    TakeSnapshot m_takeSnapshot;
    Settings& m_settings;
};

} // namespace kvloamd
