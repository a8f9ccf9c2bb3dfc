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

constexpr Column<ResourceRow> kColumns[] = {
    {"kvlResourceDeviceName", 2, Text, textIfKnown<&ResourceRow::name>},
    {"kvlResourceDeviceKind", 3, Integer, kind},
    {"kvlResourceDeviceType", 4, Integer, number<&ResourceRow::type>},
    {"kvlResourceDeviceStatus", 5, Integer, number<&ResourceRow::status>},
    {"kvlResourceDeviceModuleBoard", 6, Integer, number<&ResourceRow::moduleBoard>},
    {"kvlResourceDeviceNumber", 7, Integer, number<&ResourceRow::number>},
    {"kvlResourceDeviceCoderType", 8, Integer, number<&ResourceRow::coderType>},
    {"kvlResourceDeviceChannelState", 9, Integer, number<&ResourceRow::channelState>},
    {"kvlResourceDeviceGain", 10, Integer, number<&ResourceRow::gain>},
    {"kvlResourceDeviceEchoCancellation", 11, Integer, number<&ResourceRow::echoCancellation>},
    {"kvlResourceDeviceLineNumber", 12, Integer, number<&ResourceRow::lineNumber>},
    {"kvlResourceDeviceLineType", 13, Integer, number<&ResourceRow::lineType>},
    {"kvlResourceDeviceLineStatus", 14, Integer, number<&ResourceRow::lineStatus>},
    {"kvlResourceDeviceProtocolType", 15, Integer, number<&ResourceRow::protocolType>},
    {"kvlResourceDeviceBearerCount", 16, Integer, number<&ResourceRow::bearerCount>},
    {"kvlResourceDeviceSignallingStatus", 17, Integer, number<&ResourceRow::signallingStatus>},
    {"kvlResourceDeviceTimeSlotCount", 18, Integer, number<&ResourceRow::timeSlotCount>},
};

} // namespace

Table const& resourceDeviceTable() {
    static RowTable<ResourceRow, &Snapshot::resources> const table("kvlResourceDeviceTable",
                                                                   {1, 1, 5, 4, 1}, kColumns);
    return table;
}

} // namespace kvloamd
