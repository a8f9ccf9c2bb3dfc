// SPDX-License-Identifier: BSD-2-Clause
// Reads the records of boards in the attribute store.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "access/QSBBoard.h"
#include "agent/rows/StoreRow.h"

namespace kvloamd {

/// Whether the host has an attribute store, or should have one: VQRXCFGPATH names a directory, or
/// the default directory exists. Before the first access to the store, which sets VQRXCFGPATH.
bool storeIsConfigured();

/// A `StoreReading` keeps the attribute store open while it exists. Thread-bound: the collector.
class StoreReading {
  public:
    /// Whether the store can be read: it is open and has a family of boards.
    bool good();
    /// The board's record; nothing when there is none.
    std::optional<StoreRow> read(std::string const& serialNumber, std::uint32_t boardIndex);

  private:
    QSBAccessor m_accessor;
};

} // namespace kvloamd
