// SPDX-License-Identifier: BSD-2-Clause
// kvlStoreTable: the boards' records in the attribute store.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "agent/rows/PlatformRecords.h"

namespace kvloamd {

namespace {

using enum ValueType;

constexpr Column<StoreRow> kColumns[] = {
    {"kvlStoreSerialNumber", 1, Text, textIfKnown<&StoreRow::serialNumber>},
    {"kvlStoreModel", 2, Text, textIfKnown<&StoreRow::model>},
    {"kvlStoreVersion", 3, Text, textIfKnown<&StoreRow::version>},
    {"kvlStoreFirmwareName", 4, Text, textIfKnown<&StoreRow::firmwareName>},
    {"kvlStoreFirmwareVersion", 5, Text, textIfKnown<&StoreRow::firmwareVersion>},
    {"kvlStoreFunctionalDescription", 6, Text, textIfKnown<&StoreRow::functionalDescription>},
    {"kvlStoreType", 7, Integer, number<&StoreRow::type>},
    {"kvlStoreSharedMemoryAddress", 8, Text, textIfKnown<&StoreRow::sharedMemoryAddress>},
    {"kvlStoreIoAddress", 9, Text, textIfKnown<&StoreRow::ioAddress>},
    {"kvlStoreIrq", 10, Integer, number<&StoreRow::irq>},
    {"kvlStoreHardwareId", 11, Integer, number<&StoreRow::boardId>},
    {"kvlStorePciSlotNumber", 12, Integer, number<&StoreRow::pciSlotNumber>},
    {"kvlStoreDeviceChangeDate", 13, Text, textIfKnown<&StoreRow::deviceChangeDate>},
};

} // namespace

Table const& storeTable() {
    static RowTable<StoreRow, recorded<&PlatformRecords::store>> const table(
        "kvlStoreTable", {1, 1, 6, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
