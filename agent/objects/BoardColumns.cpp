// SPDX-License-Identifier: BSD-2-Clause
// kvlBoardTable: the boards, with every query of the abstract board.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "board/Board.h"

namespace kvloamd {

namespace {

/// KvlBoardState. A board with any other status says nothing about it.
constexpr NamedNumber kStates[] = {
    {BoardStatusNone, "none"},
    {BoardStatusStarted, "started"},
    {BoardStatusStopped, "stopped"},
    {BoardStatusAdded, "added"},
    {BoardStatusRemoved, "removed"},
    {BoardStatusStartPending, "startPending"},
    {BoardStatusStopPending, "stopPending"},
    {BoardStatusFailed, "failed"},
};

template <auto Field>
Value status(BoardRow const& row) {
    return std::int64_t{row.*Field};
}

Value entity(BoardRow const& row) {
    return row.entity == 0 ? Value{} : Value{std::int64_t{row.entity}};
}

using enum ValueType;

constexpr Column<BoardRow> kColumns[] = {
    {"kvlBoardStatus", 2, Integer, status<&BoardRow::status>, oneOf(kStates)},
    {"kvlBoardSecondaryStatus", 3, Integer, status<&BoardRow::secondaryStatus>, oneOf(kStates)},
    {"kvlBoardName", 4, Text, text<&BoardRow::name>},
    {"kvlBoardModel", 5, Text, text<&BoardRow::model>},
    {"kvlBoardFamily", 6, Text, text<&BoardRow::family>},
    {"kvlBoardFirmwareName", 7, Text, text<&BoardRow::firmwareName>},
    {"kvlBoardFirmwareVersion", 8, Text, text<&BoardRow::firmwareVersion>},
    {"kvlBoardSerialNumber", 9, Text, text<&BoardRow::serialNumber>},
    {"kvlBoardLogicalId", 10, Integer, number<&BoardRow::logicalId>},
    {"kvlBoardErrorMessage", 11, Text, text<&BoardRow::errorMessage>},
    {"kvlBoardChangeDate", 12, Date, textIfKnown<&BoardRow::changeDate>},
    {"kvlBoardFunctionalDescription", 13, Text, text<&BoardRow::functionalDescription>},
    {"kvlBoardHardwareId", 14, Integer, number<&BoardRow::boardId>},
    {"kvlBoardSharedMemoryAddress", 15, Text, textIfKnown<&BoardRow::sharedMemoryAddress>},
    {"kvlBoardIoAddress", 16, Text, textIfKnown<&BoardRow::ioAddress>},
    {"kvlBoardIrq", 17, Integer, number<&BoardRow::irq>},
    {"kvlBoardShelfId", 18, Integer, number<&BoardRow::shelfId>},
    {"kvlBoardPciSlotNumber", 19, Integer, number<&BoardRow::pciSlotNumber>},
    {"kvlBoardBusNumber", 20, Integer, number<&BoardRow::busNumber>},
    {"kvlBoardPhysicalIndex", 21, Integer, entity},
};

} // namespace

Table const& boardTable() {
    static RowTable<BoardRow, &Snapshot::boards> const table("kvlBoardTable", {1, 1, 2, 4, 1},
                                                             kColumns);
    return table;
}

} // namespace kvloamd
