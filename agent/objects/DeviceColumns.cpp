// SPDX-License-Identifier: BSD-2-Clause
// kvlDeviceTable, kvlSubDeviceTable and kvlProcessorTable.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "agent/rows/PlatformRecords.h"

namespace kvloamd {

namespace {

using enum ValueType;

constexpr NamedNumber kDeviceTypes[] = {
    {501, "digitalTrunk"},   {503, "voice"},       {505, "digitalSpan"}, {507, "conference"},
    {509, "tones"},          {511, "fax"},         {514, "isdnTrunk"},   {516, "isdnTrunk2"},
    {518, "signalling"},     {520, "mediaOverIp"}, {521, "switching"},   {525, "stations"},
    {527, "lineInterfaces"},
};

constexpr NamedNumber kSubDeviceTypes[] = {
    {502, "trunkTimeSlots"},
    {504, "players"},
    {506, "spanTimeSlots"},
    {508, "conferenceParties"},
    {510, "mixers"},
    {512, "faxEngines"},
    {517, "bearerChannels"},
    {519, "signallingLinks"},
    {522, "mediaStreams"},
    {526, "stationSlots"},
    {528, "lineInterfaceSlots"},
};

constexpr Column<DeviceRow> kDeviceColumns[] = {
    {"kvlDeviceName", 2, Text, textIfKnown<&DeviceRow::name>},
    {"kvlDeviceType", 3, Integer, number<&DeviceRow::type>, oneOf(kDeviceTypes)},
    {"kvlDeviceChannelCount", 4, Integer, number<&DeviceRow::channelCount>},
    {"kvlDeviceLineAdminAddress", 5, Octets, textIfKnown<&DeviceRow::lineAdminAddress>},
    {"kvlDeviceProtocolTypes", 6, Text, textIfKnown<&DeviceRow::protocolTypes>},
};

constexpr Column<SubDeviceRow> kSubDeviceColumns[] = {
    {"kvlSubDeviceName", 2, Text, textIfKnown<&SubDeviceRow::name>},
    {"kvlSubDeviceType", 3, Integer, number<&SubDeviceRow::type>, oneOf(kSubDeviceTypes)},
    {"kvlSubDeviceOutVariant", 4, Integer, number<&SubDeviceRow::outVariant>},
    {"kvlSubDeviceTscAddress", 5, Octets, textIfKnown<&SubDeviceRow::tscAddress>},
    {"kvlSubDeviceClusterAddress", 6, Octets, textIfKnown<&SubDeviceRow::clusterAddress>},
    {"kvlSubDeviceCtBusAddress", 7, Octets, textIfKnown<&SubDeviceRow::ctBusAddress>},
    {"kvlSubDeviceIpvscAddress", 8, Octets, textIfKnown<&SubDeviceRow::ipvscAddress>},
    {"kvlSubDeviceFrontEndType", 9, Integer, number<&SubDeviceRow::frontEndType>},
};

constexpr Column<ProcessorRow> kProcessorColumns[] = {
    {"kvlProcessorName", 2, Text, textIfKnown<&ProcessorRow::name>},
    {"kvlProcessorNumber", 3, Integer, number<&ProcessorRow::number>},
    {"kvlProcessorBootKernelVersion", 4, Text, textIfKnown<&ProcessorRow::bootKernelVersion>},
    {"kvlProcessorBootKernelFile", 5, Text, textIfKnown<&ProcessorRow::bootKernelFile>},
    {"kvlProcessorRealTimeKernelVersion", 6, Text,
     textIfKnown<&ProcessorRow::realTimeKernelVersion>},
    {"kvlProcessorRealTimeKernelFile", 7, Text, textIfKnown<&ProcessorRow::realTimeKernelFile>},
};

} // namespace

Table const& deviceTable() {
    static RowTable<DeviceRow, recorded<&PlatformRecords::devices>> const table(
        "kvlDeviceTable", {1, 1, 5, 1, 1}, kDeviceColumns);
    return table;
}

Table const& subDeviceTable() {
    static RowTable<SubDeviceRow, recorded<&PlatformRecords::subDevices>> const table(
        "kvlSubDeviceTable", {1, 1, 5, 2, 1}, kSubDeviceColumns);
    return table;
}

Table const& processorTable() {
    static RowTable<ProcessorRow, recorded<&PlatformRecords::processors>> const table(
        "kvlProcessorTable", {1, 1, 5, 3, 1}, kProcessorColumns);
    return table;
}

} // namespace kvloamd
