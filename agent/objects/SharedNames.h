// SPDX-License-Identifier: BSD-2-Clause
// Names of enumerations that tables of more than one MIB module have.
#pragma once

#include "agent/objects/Description.h"

namespace kvloamd {

/// The types of variables, which are the numbers of VariableType.
inline constexpr NamedNumber kVariableTypes[] = {
    {1, "counter32"},   {2, "unsigned32"}, {3, "timeTicks"}, {4, "integer32"}, {5, "ipAddress"},
    {6, "octetString"}, {7, "objectId"},   {8, "counter64"}, {9, "opaque"}};

/// The states of a row: RowStatus of SNMPv2-TC.
inline constexpr NamedNumber kRowStates[] = {{1, "active"},        {2, "notInService"},
                                             {3, "notReady"},      {4, "createAndGo"},
                                             {5, "createAndWait"}, {6, "destroy"}};

} // namespace kvloamd
