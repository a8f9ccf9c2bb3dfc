// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/WriteAccess.h"

#include <cstring>
#include <string_view>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/library/vacm.h>
// clang-format on

namespace kvloamd {

namespace {

/// The library's view of the whole tree, which a writer gets unless its configuration names
/// another.
constexpr std::string_view kWholeTree = "_all_";
constexpr char kOurs[] = "_kvloam_";

/// Includes a subtree in our view, unless it is there.
void include(Oid const& subtree) {
    std::vector<oid> name(subtree.begin(), subtree.end());
    if (vacm_getViewEntry(kOurs, name.data(), name.size(), VACM_MODE_IGNORE_MASK) != nullptr)
        return;
    vacm_viewEntry* const view = vacm_createViewEntry(kOurs, name.data(), name.size());
    if (view == nullptr) return;
    view->viewType = SNMP_VIEW_INCLUDED;
    view->viewStorageType = SNMP_STORAGE_PERMANENT;
    view->viewStatus = SNMP_ROW_ACTIVE;
}

} // namespace

void restrictWriters(std::vector<ServedTree> const& trees) {
    for (ServedTree const& served : trees)
        for (Place const& place : served.places)
            include(joined(served.arc, place.place));
    vacm_scanAccessInit();
    while (vacm_accessEntry* const access = vacm_scanAccessNext())
        if (access->views[VACM_VIEW_WRITE] == kWholeTree)
            std::strcpy(access->views[VACM_VIEW_WRITE], kOurs);
}

} // namespace kvloamd
