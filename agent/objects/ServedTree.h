// SPDX-License-Identifier: BSD-2-Clause
// Which parts of the world's tree of names the agent serves.
#pragma once

#include <vector>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// What the host's own SNMP agent has at a place, where it runs beside this one.
enum class HostHas {
    Nothing, ///< the place is ours
    Rows,    ///< a table in which our rows stand beside the host's
    All      ///< the place is the host's; it is ours only where there is no other agent
};

/// A part of the tree that is served with all that is below it.
struct Place {
    Oid place;        ///< relative
    char const* name; ///< of the object or the MIB module
    HostHas hostHas = HostHas::Nothing;
};

/// Objects, and where in the world's tree they are.
struct ServedTree {
    ObjectTree const& tree;
    Oid arc; ///< above all names
    std::vector<Place> places;
};

} // namespace kvloamd
