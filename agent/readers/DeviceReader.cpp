// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/DeviceReader.h"

#include <algorithm>
#include <limits>

#include "access/DevMapBoardIf.h"
#include "access/DevMapDeviceIf.h"
#include "access/DevMapProcessorIf.h"
#include "access/DevMapSubDeviceIf.h"
#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

/// Handles have four bytes, signed or not; where `long` is wider, others do not fit an index.
bool fitsIndex(std::int64_t auid) {
    return auid >= std::numeric_limits<std::int32_t>::min() &&
           auid <= std::numeric_limits<std::uint32_t>::max();
}

/// A text that the record has as "unknown" when it is missing.
std::string textUnlessUnknown(std::string const& text) {
    return text == "unknown" ? std::string() : printable(text);
}

/// The words of an address, the more significant octet of each first; empty when `record` has none.
template <class Record>
std::string address(Record const& record, bool (Record::*query)(QCompDesc&) const) {
    QCompDesc descriptor{};
    if (!(record.*query)(descriptor)) return {};
    std::string octets;
    for (std::uint16_t const word : descriptor.word) {
        octets.push_back(static_cast<char>(word >> 8));
        octets.push_back(static_cast<char>(word & 0xff));
    }
    return octets;
}

/// "1,3": up to the last channel group that has a protocol.
std::string protocolTypes(DevMapDeviceIf& device) {
    std::string all;
    std::string types;
    for (int group = 0; group < kChannelGroups; ++group) {
        int const type = device.ProtocolType(group);
        all += (group == 0 ? "" : ",") + std::to_string(type);
        if (type != 0) types = all;
    }
    return types;
}

DeviceRow deviceRow(DevMapDeviceIf& device, std::uint32_t boardIndex) {
    DeviceRow row;
    row.boardIndex = boardIndex;
    row.auid = static_cast<std::uint32_t>(device.Auid());
    row.name = printable(device.Name());
    row.type = unlessNegative(device.DeviceType());
    row.channelCount = unlessNegative(device.ChannelCount());
    row.lineAdminAddress = address(device, &DevMapDeviceIf::LineAdminAddress);
    row.protocolTypes = protocolTypes(device);
    return row;
}

SubDeviceRow subDeviceRow(DevMapSubDeviceIf const& subDevice, DeviceRow const& device) {
    SubDeviceRow row;
    row.boardIndex = device.boardIndex;
    row.deviceAuid = device.auid;
    row.auid = static_cast<std::uint32_t>(subDevice.Auid());
    row.name = printable(subDevice.Name());
    row.type = unlessNegative(subDevice.DeviceType());
    // A missing variant reads as 0.
    if (long const variant = subDevice.GetOutVariant(); variant != 0)
        row.outVariant = static_cast<int>(variant);
    row.tscAddress = address(subDevice, &DevMapSubDeviceIf::TSCAddress);
    row.clusterAddress = address(subDevice, &DevMapSubDeviceIf::ClusterAddress);
    row.ctBusAddress = address(subDevice, &DevMapSubDeviceIf::CTBusAddress);
    row.ipvscAddress = address(subDevice, &DevMapSubDeviceIf::IPVSCAddress);
    row.frontEndType = unlessNegative(subDevice.FrontEndType());
    return row;
}

ProcessorRow processorRow(DevMapProcessorIf const& processor, std::uint32_t boardIndex) {
    ProcessorRow row;
    row.boardIndex = boardIndex;
    row.auid = static_cast<std::uint32_t>(processor.Auid());
    row.name = printable(processor.Name());
    row.number = unlessNegative(processor.ProcessorNumber());
    row.bootKernelVersion = textUnlessUnknown(processor.BootKernelVersion());
    row.bootKernelFile = textUnlessUnknown(processor.BootKernelFilename());
    row.realTimeKernelVersion = textUnlessUnknown(processor.RealTimeKernelVersion());
    row.realTimeKernelFile = textUnlessUnknown(processor.RealTimeKernelFilename());
    return row;
}

/// Rows are walked by binary search: sorted, and no index twice.
template <class Row>
void putInOrder(std::vector<Row>& rows) {
    std::ranges::sort(rows, {}, &Row::index);
    auto const sameIndex = [](Row const& a, Row const& b) { return a.index() == b.index(); };
    rows.erase(std::unique(rows.begin(), rows.end(), sameIndex), rows.end());
}

} // namespace

DeviceRows readDevices(long board, std::uint32_t boardIndex) {
    DevMapBoardIf boardRecord(board);
    DeviceRows rows;
    for (long const auid : boardRecord.ListAllDevices()) {
        if (!fitsIndex(auid)) continue;
        DevMapDeviceIf device(auid);
        rows.devices.push_back(deviceRow(device, boardIndex));
        for (long const subAuid : device.ListAllSubDevices())
            if (fitsIndex(subAuid))
                rows.subDevices.push_back(
                    subDeviceRow(DevMapSubDeviceIf(subAuid), rows.devices.back()));
    }
    for (long const auid : boardRecord.ListProcessors())
        if (fitsIndex(auid))
            rows.processors.push_back(processorRow(DevMapProcessorIf(auid), boardIndex));
    putInOrder(rows.devices);
    putInOrder(rows.subDevices);
    putInOrder(rows.processors);
    return rows;
}

} // namespace kvloamd
