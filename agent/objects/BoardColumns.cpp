// SPDX-License-Identifier: BSD-2-Clause
// kvlBoardTable: the boards, with every query of the abstract board.
#include "agent/objects/EntityColumnTable.h"
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

using enum ValueType;

constexpr Column<BoardRow> kColumns[] = {
    {"kvlBoardStatus", 2, Integer, status<&BoardRow::status>,
     about("The board's state").oneOf(kStates)},
    {"kvlBoardSecondaryStatus", 3, Integer, status<&BoardRow::secondaryStatus>,
     about("Whether the board has failed").oneOf(kStates)},
    {"kvlBoardName", 4, Text, text<&BoardRow::name>, about("The board's name")},
    {"kvlBoardModel", 5, Text, text<&BoardRow::model>, about("The board's model")},
    {"kvlBoardFamily", 6, Text, text<&BoardRow::family>,
     about("The family of boards that the model belongs to")},
    {"kvlBoardFirmwareName", 7, Text, text<&BoardRow::firmwareName>,
     about("The name of the firmware that the board runs")},
    {"kvlBoardFirmwareVersion", 8, Text, text<&BoardRow::firmwareVersion>,
     about("The version of the board's firmware")},
    {"kvlBoardSerialNumber", 9, Text, text<&BoardRow::serialNumber>,
     about("The board's serial number, which identifies it everywhere and always").identifies()},
    {"kvlBoardLogicalId", 10, Integer, number<&BoardRow::logicalId>,
     about("The logical identifier by which the host's telephony software names the board")},
    {"kvlBoardErrorMessage", 11, Text, text<&BoardRow::errorMessage>,
     about("What is wrong with the board")},
    {"kvlBoardChangeDate", 12, Date, textIfKnown<&BoardRow::changeDate>,
     about("When the board's state last changed")},
    {"kvlBoardFunctionalDescription", 13, Text, text<&BoardRow::functionalDescription>,
     about("The purpose of the board, in words")},
    {"kvlBoardHardwareId", 14, Integer, number<&BoardRow::boardId>,
     about("The board identifier that is stored in the hardware")},
    {"kvlBoardSharedMemoryAddress", 15, Text, textIfKnown<&BoardRow::sharedMemoryAddress>,
     about("The base address of the board's shared memory")},
    {"kvlBoardIoAddress", 16, Text, textIfKnown<&BoardRow::ioAddress>,
     about("The base address of the board's input and output ports")},
    {"kvlBoardIrq", 17, Integer, number<&BoardRow::irq>, about("The board's interrupt number")},
    {"kvlBoardShelfId", 18, Integer, number<&BoardRow::shelfId>,
     about("The shelf that contains the board")},
    {"kvlBoardPciSlotNumber", 19, Integer, number<&BoardRow::pciSlotNumber>,
     about("The board's slot on its PCI bus")},
    {"kvlBoardBusNumber", 20, Integer, number<&BoardRow::busNumber>, about("The board's PCI bus")},
    {"kvlBoardPhysicalIndex", 21, Integer, notOfTheRow<BoardRow>,
     about("The physical entity that the board is")},
};

} // namespace

Table const& boardTable() {
    static EntityColumnTable<BoardRow, &Snapshot::boards, &EntityRows::ofBoards> const table(
        "kvlBoardTable", {1, 1, 2, 4, 1}, kColumns);
    return table;
}

} // namespace kvloamd
