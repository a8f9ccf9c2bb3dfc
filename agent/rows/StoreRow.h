// SPDX-License-Identifier: BSD-2-Clause
// One board's record in the attribute store as the agent serves it.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace kvloamd {

/// A `StoreRow` is a row of kvlStoreTable. A text that cannot be read is empty; such a number is
/// absent.
struct StoreRow {
    std::uint32_t boardIndex = 0;
    std::string serialNumber;
    std::string model;
    std::string version;
    std::string firmwareName;
    std::string firmwareVersion;
    std::string functionalDescription;
    std::optional<int> type;
    std::string sharedMemoryAddress; ///< as `addressText`
    std::string ioAddress;
    std::optional<int> irq;
    std::optional<int> boardId;
    std::optional<int> pciSlotNumber;
    std::string deviceChangeDate; ///< as the record has it

    std::array<std::uint32_t, 1> index() const { return {boardIndex}; }
};

} // namespace kvloamd
