// SPDX-License-Identifier: BSD-2-Clause
// The interval table as Net-SNMP's own helpers serve it.
#pragma once

#include "agent/rows/InterfaceRows.h"

/// Registers the closed intervals of `lines`, which outlive the SNMP library, with the helper that
/// keeps a table's rows in a list of its own. Throws std::runtime_error.
void serveByTableData(kvloamd::InterfaceRows const& lines);

/// The same with the helper that passes over all rows for every request.
void serveByIterator(kvloamd::InterfaceRows const& lines);
