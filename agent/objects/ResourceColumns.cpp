// SPDX-License-Identifier: BSD-2-Clause
// kvlResourceDeviceTable.
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
    {"kvlResourceDeviceName", 2, Text, textIfKnown<&ResourceRow::name>},
    {"kvlResourceDeviceKind", 3, Integer, kind, oneOf(kKinds)},
    {"kvlResourceDeviceType", 4, Integer, number<&ResourceRow::type>},
    {"kvlResourceDeviceStatus", 5, Integer, number<&ResourceRow::status>},
    {"kvlResourceDeviceModuleBoard", 6, Integer, number<&ResourceRow::moduleBoard>},
    {"kvlResourceDeviceNumber", 7, Integer, number<&ResourceRow::number>},
    {"kvlResourceDeviceCoderType", 8, Integer, number<&ResourceRow::coderType>},
    {"kvlResourceDeviceChannelState", 9, Integer, number<&ResourceRow::channelState>},
    {"kvlResourceDeviceGain", 10, Integer, number<&ResourceRow::gain>},
    {"kvlResourceDeviceEchoCancellation", 11, Integer, number<&ResourceRow::echoCancellation>,
     oneOf(kOnOff)},
    {"kvlResourceDeviceLineNumber", 12, Integer, number<&ResourceRow::lineNumber>},
    {"kvlResourceDeviceLineType", 13, Integer, number<&ResourceRow::lineType>, oneOf(kLineTypes)},
    {"kvlResourceDeviceLineStatus", 14, Integer, number<&ResourceRow::lineStatus>},
    {"kvlResourceDeviceProtocolType", 15, Integer, number<&ResourceRow::protocolType>},
    {"kvlResourceDeviceBearerCount", 16, Integer, number<&ResourceRow::bearerCount>},
    {"kvlResourceDeviceSignallingStatus", 17, Integer, number<&ResourceRow::signallingStatus>,
     oneOf(kSignallingStates)},
    {"kvlResourceDeviceTimeSlotCount", 18, Integer, number<&ResourceRow::timeSlotCount>},
};

} // namespace

Table const& resourceDeviceTable() {
    static RowTable<ResourceRow, &Snapshot::resources> const table("kvlResourceDeviceTable",
                                                                   {1, 1, 5, 4, 1}, kColumns);
    return table;
}

} // namespace kvloamd
