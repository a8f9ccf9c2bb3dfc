// SPDX-License-Identifier: BSD-2-Clause
// kvlStoreTable: the boards' records in the attribute store.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "agent/rows/PlatformRecords.h"

namespace kvloamd {

namespace {

using enum ValueType;

constexpr Column<StoreRow> kColumns[] = {
    {"kvlStoreSerialNumber", 1, Text, textIfKnown<&StoreRow::serialNumber>,
     about("The serial number in the record").identifies()},
    {"kvlStoreModel", 2, Text, textIfKnown<&StoreRow::model>, about("The board's model")},
    {"kvlStoreVersion", 3, Text, textIfKnown<&StoreRow::version>,
     about("The version text of the record")},
    {"kvlStoreFirmwareName", 4, Text, textIfKnown<&StoreRow::firmwareName>,
     about("The name of the board's firmware")},
    {"kvlStoreFirmwareVersion", 5, Text, textIfKnown<&StoreRow::firmwareVersion>,
     about("The version of the board's firmware")},
    {"kvlStoreFunctionalDescription", 6, Text, textIfKnown<&StoreRow::functionalDescription>,
     about("The purpose of the board, in words")},
    {"kvlStoreType", 7, Integer, number<&StoreRow::type>,
     about("The platform's number for the type of the recorded object")},
    {"kvlStoreSharedMemoryAddress", 8, Text, textIfKnown<&StoreRow::sharedMemoryAddress>,
     about("The base address of the board's shared memory")},
    {"kvlStoreIoAddress", 9, Text, textIfKnown<&StoreRow::ioAddress>,
     about("The base address of the board's input and output ports")},
    {"kvlStoreIrq", 10, Integer, number<&StoreRow::irq>, about("The board's interrupt number")},
    {"kvlStoreHardwareId", 11, Integer, number<&StoreRow::boardId>,
     about("The board identifier in the record")},
    {"kvlStorePciSlotNumber", 12, Integer, number<&StoreRow::pciSlotNumber>,
     about("The board's slot on its PCI bus")},
    {"kvlStoreDeviceChangeDate", 13, Text, textIfKnown<&StoreRow::deviceChangeDate>,
     about("When the board's state last changed, as the record gives it")},
};

} // namespace

Table const& storeTable() {
    static RowTable<StoreRow, recorded<&PlatformRecords::store>> const table(
        "kvlStoreTable", {1, 1, 6, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
