// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardReader.h"

#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

/// The platform's texts have 128 bytes at most; a concrete board may answer longer ones.
constexpr std::size_t kTextCapacity = 4096;

std::string text(Board& board, int (Board::*query)(char*)) {
    char answer[kTextCapacity];
    answer[0] = '\0';
    answer[kTextCapacity - 1] = '\0';
    (board.*query)(answer);
    return printable(answer);
}

std::optional<int> number(int answer) {
    return answer < 0 ? std::nullopt : std::optional(answer);
}

} // namespace

BoardRow readBoard(Board& board, int boardIndex) {
    BoardRow row;
    row.boardIndex = static_cast<std::uint32_t>(boardIndex);
    row.status = board.GetStatus();
    row.secondaryStatus = board.GetSecondaryStatus();
    row.name = text(board, &Board::GetName);
    row.model = text(board, &Board::GetModel);
    row.family = text(board, &Board::GetFamily);
    row.firmwareName = text(board, &Board::GetFirmwareName);
    row.firmwareVersion = text(board, &Board::GetFirmwareVersion);
    row.serialNumber = readSerialNumber(board);
    row.logicalId = number(board.GetLogicalID());
    row.errorMessage = text(board, &Board::GetErrorMessage);
    row.changeDate = dateOctets(board.GetDeviceChangeDate());
    row.functionalDescription = text(board, &Board::GetFunctionalDescription);
    row.boardId = number(board.GetBoardID());
    row.sharedMemoryAddress = addressText(board.GetSharedMemoryBaseAddress());
    row.ioAddress = addressText(board.GetIOBaseAddress());
    row.irq = number(board.GetIRQ());
    row.shelfId = number(board.GetShelfID());
    row.pciSlotNumber = number(board.GetPCISlotNumber());
    row.busNumber = number(board.GetBusNumber());
    return row;
}

std::string readSerialNumber(Board& board) {
    return text(board, &Board::GetSerialNumber);
}

} // namespace kvloamd
