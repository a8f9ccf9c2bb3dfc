// SPDX-License-Identifier: BSD-2-Clause
// One board: the answer to every query, read at one time.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace kvloamd {

struct BoardRow {
    std::uint32_t boardIndex = 0;
    int status = 0; ///< BoardStatusEnum, as the next one
    int secondaryStatus = 0;
    std::string name;
    std::string model;
    std::string family;
    std::string firmwareName;
    std::string firmwareVersion;
    std::string serialNumber;
    std::optional<int> logicalId;
    std::string errorMessage;
    std::string changeDate; ///< as `dateOctets`
    std::string functionalDescription;
    std::optional<int> boardId;
    std::string sharedMemoryAddress; ///< as `addressText`
    std::string ioAddress;
    std::optional<int> irq;
    std::optional<int> shelfId;
    std::optional<int> pciSlotNumber;
    std::optional<int> busNumber;

    /// The row's place in its table.
    std::array<std::uint32_t, 1> index() const { return {boardIndex}; }

    bool operator==(BoardRow const&) const = default;
};

} // namespace kvloamd
