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
    {"kvlDeviceName", 2, Text, textIfKnown<&DeviceRow::name>,
     about("The device's name").identifies()},
    {"kvlDeviceType", 3, Integer, number<&DeviceRow::type>,
     about("The type of the device").oneOf(kDeviceTypes).as(Kind::Information)},
    {"kvlDeviceChannelCount", 4, Integer, number<&DeviceRow::channelCount>,
     about("The number of channels of the device").in("channels")},
    {"kvlDeviceLineAdminAddress", 5, Octets, textIfKnown<&DeviceRow::lineAdminAddress>,
     about("The address that the platform uses to administer the device's line")},
    {"kvlDeviceProtocolTypes", 6, Text, textIfKnown<&DeviceRow::protocolTypes>,
     about("The protocol types of the device's first eight channel groups, separated by commas")},
};

constexpr Column<SubDeviceRow> kSubDeviceColumns[] = {
    {"kvlSubDeviceName", 2, Text, textIfKnown<&SubDeviceRow::name>,
     about("The sub-device's name").identifies()},
    {"kvlSubDeviceType", 3, Integer, number<&SubDeviceRow::type>,
     about("The type of the sub-device").oneOf(kSubDeviceTypes).as(Kind::Information)},
    {"kvlSubDeviceOutVariant", 4, Integer, number<&SubDeviceRow::outVariant>,
     about("The variant of the sub-device's output")},
    {"kvlSubDeviceTscAddress", 5, Octets, textIfKnown<&SubDeviceRow::tscAddress>,
     about("The sub-device's address on the time slot controller")},
    {"kvlSubDeviceClusterAddress", 6, Octets, textIfKnown<&SubDeviceRow::clusterAddress>,
     about("The sub-device's address in its cluster")},
    {"kvlSubDeviceCtBusAddress", 7, Octets, textIfKnown<&SubDeviceRow::ctBusAddress>,
     about("The sub-device's address on the CT bus")},
    {"kvlSubDeviceIpvscAddress", 8, Octets, textIfKnown<&SubDeviceRow::ipvscAddress>,
     about("The sub-device's IPVSC address")},
    {"kvlSubDeviceFrontEndType", 9, Integer, number<&SubDeviceRow::frontEndType>,
     about("The platform's number for the type of the front end")},
};

constexpr Column<ProcessorRow> kProcessorColumns[] = {
    {"kvlProcessorName", 2, Text, textIfKnown<&ProcessorRow::name>,
     about("The processor's name").identifies()},
    {"kvlProcessorNumber", 3, Integer, number<&ProcessorRow::number>,
     about("The processor's number on its board")},
    {"kvlProcessorBootKernelVersion", 4, Text, textIfKnown<&ProcessorRow::bootKernelVersion>,
     about("The version of the processor's boot kernel")},
    {"kvlProcessorBootKernelFile", 5, Text, textIfKnown<&ProcessorRow::bootKernelFile>,
     about("The name of the file that contains the boot kernel")},
    {"kvlProcessorRealTimeKernelVersion", 6, Text,
     textIfKnown<&ProcessorRow::realTimeKernelVersion>,
     about("The version of the processor's real-time kernel")},
    {"kvlProcessorRealTimeKernelFile", 7, Text, textIfKnown<&ProcessorRow::realTimeKernelFile>,
     about("The name of the file that contains the real-time kernel")},
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
