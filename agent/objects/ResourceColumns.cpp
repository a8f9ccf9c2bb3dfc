// SPDX-License-Identifier: BSD-2-Clause
// kvlResourceDeviceTable.
#include "agent/objects/LineStatusBits.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;

Value kind(ResourceRow const& row) {
    return static_cast<std::int64_t>(row.kind);
}

constexpr NamedNumber kKinds[] = {
    {1, "other"}, {2, "voice"}, {3, "trunk"}, {4, "isdnTrunk"}, {5, "station"},
};

constexpr NamedNumber kOnOff[] = {{1, "on"}, {2, "off"}};

/// Those of dsx1LineType.
constexpr NamedNumber kLineTypes[] = {
    {1, "other"},          {2, "dsx1ESF"},     {3, "dsx1D4"},          {4, "dsx1E1"},
    {5, "dsx1E1CRC"},      {6, "dsx1E1MF"},    {7, "dsx1E1CRCMF"},     {8, "dsx1Unframed"},
    {9, "dsx1E1Unframed"}, {10, "dsx1DS2M12"}, {11, "dsx1E2"},         {12, "dsx1E1Q50"},
    {13, "dsx1E1Q50CRC"},  {14, "dsx1J1ESF"},  {16, "dsx1J1Unframed"},
};

constexpr NamedNumber kSignallingStates[] = {
    {1, "inactive"},
    {2, "l1Active"},
    {3, "l2Active"},
};

constexpr Column<ResourceRow> kColumns[] = {
    {"kvlResourceDeviceName", 2, Text, textIfKnown<&ResourceRow::name>,
     about("The device's name on its board").identifies()},
    {"kvlResourceDeviceKind", 3, Integer, kind,
     about("The kind of device").oneOf(kKinds).as(Kind::Information)},
    {"kvlResourceDeviceType", 4, Integer, number<&ResourceRow::type>,
     about("The number that the board's module has for this type of device")},
    {"kvlResourceDeviceStatus", 5, Integer, number<&ResourceRow::status>,
     about("The device's status").as(Kind::State)},
    {"kvlResourceDeviceModuleBoard", 6, Integer, number<&ResourceRow::moduleBoard>,
     about("The number that the board's module uses for the board")},
    {"kvlResourceDeviceNumber", 7, Integer, number<&ResourceRow::number>,
     about("The number of the device among those of its kind on its board")},
    {"kvlResourceDeviceCoderType", 8, Integer, number<&ResourceRow::coderType>,
     about("The platform's number for the coding of the voice channels")},
    {"kvlResourceDeviceChannelState", 9, Integer, number<&ResourceRow::channelState>,
     about("The platform's number for the state of the voice channels").as(Kind::State)},
    {"kvlResourceDeviceGain", 10, Integer, number<&ResourceRow::gain>,
     about("The gain of the voice channels").in("decibels")},
    {"kvlResourceDeviceEchoCancellation", 11, Integer, number<&ResourceRow::echoCancellation>,
     about("Whether the voice channels cancel echo").oneOf(kOnOff).as(Kind::Information)},
    {"kvlResourceDeviceLineNumber", 12, Integer, number<&ResourceRow::lineNumber>,
     about("The number of the trunk's DS1 line on its board, from 1")},
    {"kvlResourceDeviceLineType", 13, Integer, number<&ResourceRow::lineType>,
     about("The type of the trunk's line, with the values of dsx1LineType")
         .oneOf(kLineTypes)
         .as(Kind::Information)},
    {"kvlResourceDeviceLineStatus", 14, Integer, number<&ResourceRow::lineStatus>,
     about("The alarms of the trunk's line, a sum of bits").sumOf(kLineStatusBits).as(Kind::State)},
    {"kvlResourceDeviceProtocolType", 15, Integer, number<&ResourceRow::protocolType>,
     about("The platform's number for the trunk's protocol")},
    {"kvlResourceDeviceBearerCount", 16, Integer, number<&ResourceRow::bearerCount>,
     about("The number of bearer channels of an ISDN trunk").in("channels")},
    {"kvlResourceDeviceSignallingStatus", 17, Integer, number<&ResourceRow::signallingStatus>,
     about("The state of the signalling channel of an ISDN trunk").oneOf(kSignallingStates)},
    {"kvlResourceDeviceTimeSlotCount", 18, Integer, number<&ResourceRow::timeSlotCount>,
     about("The number of time slots of a station or switching interface").in("slots")},
};

} // namespace

Table const& resourceDeviceTable() {
    static RowTable<ResourceRow, &Snapshot::resources> const table("kvlResourceDeviceTable",
                                                                   {1, 1, 5, 4, 1}, kColumns);
    return table;
}

} // namespace kvloamd
