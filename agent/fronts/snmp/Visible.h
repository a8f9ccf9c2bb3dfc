// SPDX-License-Identifier: BSD-2-Clause
// Finds the next instance that a client may see.
#pragma once

#include <functional>

#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// What a client may see of a tree. Names are relative to the tree's arc.
struct View {
    std::function<bool(Instance const&)> shows; ///< whether it may see the instance
    std::function<bool(OidView)> hidesSubtree;  ///< whether it may see nothing below the name
};

/// Finds the first visible instance after `name`, or at `name` if `orEqual`. Skips whole hidden
/// subtrees, so that the cost does not grow with the number of hidden instances. Returns false when
/// there is none before the name for which `isEnd` holds.
bool nextVisible(ObjectTree const& tree, Facts const& facts, Oid name, bool orEqual,
                 std::function<bool(OidView)> const& isEnd, View const& view, Instance& found);

} // namespace kvloamd
