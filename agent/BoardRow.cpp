// SPDX-License-Identifier: BSD-2-Clause
#include "agent/BoardRow.h"

#include <cinttypes>
#include <cstdio>
#include <ctime>
#include <set>

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

std::vector<std::string> keptNames(std::vector<BoardRow> const& boards) {
    std::vector<std::string> names;
    std::set<std::string> taken;
    for (BoardRow const& board : boards) {
        std::string name = board.serialNumber == "unknown" ? "" : board.serialNumber;
        if (name.empty() || taken.contains(name)) name += "@" + std::to_string(board.boardIndex);
        taken.insert(name);
        names.push_back(std::move(name));
    }
    return names;
}

std::string printable(std::string_view text) {
    std::string served(text.substr(0, kLongestText));
    for (char& character : served)
        if (character < ' ' || character > '~') character = '?';
    return served;
}

std::string dateOctets(long seconds) {
    if (seconds <= 0) return {};
    std::time_t const time = seconds;
    std::tm local{};
    if (localtime_r(&time, &local) == nullptr || local.tm_year + 1900 > 9999) return {};
    int const year = local.tm_year + 1900;
    long const offset = local.tm_gmtoff < 0 ? -local.tm_gmtoff : local.tm_gmtoff;
    std::string octets;
    for (long const octet :
         {static_cast<long>(year / 256), static_cast<long>(year % 256),
          static_cast<long>(local.tm_mon + 1), static_cast<long>(local.tm_mday),
          static_cast<long>(local.tm_hour), static_cast<long>(local.tm_min),
          static_cast<long>(local.tm_sec), 0L, static_cast<long>(local.tm_gmtoff < 0 ? '-' : '+'),
          offset / 3600, offset / 60 % 60})
        octets.push_back(static_cast<char>(octet));
    return octets;
}

std::string addressText(long address) {
    if (address == -1) return {};
    std::uint64_t const value =
        address < 0 ? static_cast<std::uint32_t>(address) : static_cast<std::uint64_t>(address);
    char text[24];
    std::snprintf(text, sizeof text, "0x%08" PRIx64, value);
    return text;
}

} // namespace kvloamd
