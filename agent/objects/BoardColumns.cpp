// SPDX-License-Identifier: BSD-2-Clause
// kvlBoardTable: the boards, with every query of the abstract board.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "board/Board.h"

namespace kvloamd {

namespace {

/// A status that the MIB module has no name for is left out.
template <int BoardRow::*Field>
Value status(BoardRow const& row) {
    switch (row.*Field) {
    case BoardStatusNone:
    case BoardStatusStarted:
    case BoardStatusStopped:
    case BoardStatusAdded:
    case BoardStatusRemoved:
    case BoardStatusStartPending:
    case BoardStatusStopPending:
    case BoardStatusFailed:
        return std::int64_t{row.*Field};
    default:
        return {};
    }
}

using enum ValueType;

constexpr Column<BoardRow> kColumns[] = {
    {"kvlBoardStatus", 2, Integer, status<&BoardRow::status>},
    {"kvlBoardSecondaryStatus", 3, Integer, status<&BoardRow::secondaryStatus>},
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
};

} // namespace

Table const& boardTable() {
    static RowTable<BoardRow, &Snapshot::boards> const table("kvlBoardTable", {1, 1, 2, 4, 1},
                                                             kColumns);
    return table;
}

} // namespace kvloamd
