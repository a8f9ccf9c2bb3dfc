// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/Visible.h"

#include <limits>
#include <utility>

namespace kvloamd {

namespace {

/// The largest hidden subtree that contains the hidden instance `name`.
Oid hiddenSubtree(Oid const& name, View const& view) {
    for (std::size_t size = 1; size < name.size(); ++size)
        if (OidView const prefix = OidView(name).first(size); view.hidesSubtree(prefix))
            return {prefix.begin(), prefix.end()};
    return name;
}

/// Moves `name` to the first name after everything below it; to an empty one if there is none.
void moveBehind(Oid& name) {
    while (!name.empty() && name.back() == std::numeric_limits<std::uint32_t>::max())
        name.pop_back();
    if (!name.empty()) ++name.back();
}

} // namespace

bool nextVisible(ObjectTree const& tree, Facts const& facts, Oid name, bool orEqual,
                 std::function<bool(OidView)> const& isEnd, View const& view, Instance& found) {
    while (tree.next(facts, name, orEqual, found) && !isEnd(found.name)) {
        if (view.shows(found)) return true;
        name = hiddenSubtree(found.name, view);
        moveBehind(name);
        if (name.empty()) return false;
        orEqual = true;
    }
    return false;
}

} // namespace kvloamd
