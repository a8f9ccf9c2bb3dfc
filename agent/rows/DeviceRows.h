// SPDX-License-Identifier: BSD-2-Clause
// A board's devices, sub-devices and processors as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace kvloamd {

/// A device is an object of the device mapper, identified by its handle, which stays the same while
/// the platform runs. Texts are empty and numbers none when they are unknown; addresses are as
/// `descriptorOctets`.
struct DeviceRow {
    std::uint32_t boardIndex = 0;
    std::uint32_t auid = 0;
    std::string name;
    std::optional<int> type;
    std::optional<int> channelCount;
    std::string lineAdminAddress;
    std::string protocolTypes; ///< of the first channel groups: "1,3"

    std::array<std::uint32_t, 2> index() const { return {boardIndex, auid}; }
};

struct SubDeviceRow {
    std::uint32_t boardIndex = 0;
    std::uint32_t deviceAuid = 0;
    std::uint32_t auid = 0;
    std::string name;
    std::optional<int> type;
    std::optional<int> outVariant;
    std::string tscAddress;
    std::string clusterAddress;
    std::string ctBusAddress;
    std::string ipvscAddress;
    std::optional<int> frontEndType;

    std::array<std::uint32_t, 3> index() const { return {boardIndex, deviceAuid, auid}; }
};

struct ProcessorRow {
    std::uint32_t boardIndex = 0;
    std::uint32_t auid = 0;
    std::string name;
    std::optional<int> number;
    std::string bootKernelVersion;
    std::string bootKernelFile;
    std::string realTimeKernelVersion;
    std::string realTimeKernelFile;

    std::array<std::uint32_t, 2> index() const { return {boardIndex, auid}; }
    bool operator==(ProcessorRow const&) const = default;
};

struct DeviceRows {
    std::vector<DeviceRow> devices; ///< all three ascending by index
    std::vector<SubDeviceRow> subDevices;
    std::vector<ProcessorRow> processors;
};

} // namespace kvloamd
