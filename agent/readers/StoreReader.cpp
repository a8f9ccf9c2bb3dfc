// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StoreReader.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <system_error>

#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

/// A text; the record answers "Error" for one that cannot be read.
std::string textUnlessError(std::string const& text) {
    return text == "Error" ? std::string() : printable(text);
}

} // namespace

bool storeIsConfigured() {
    if (char const* const directory = std::getenv("VQRXCFGPATH")) return *directory != '\0';
    std::error_code fault;
    return std::filesystem::exists("/usr/velquor/cfg", fault);
}

bool StoreReading::good() {
    // The first name of the list is none.
    return std::any_of(std::next(std::begin(KVL::kQSBFamilies)), std::end(KVL::kQSBFamilies),
                       [this](char const* family) {
                           int instance = -1;
                           // The name is only read.
                           return m_accessor.FindFamilyID(const_cast<char*>(family), &instance) ==
                                  0;
                       });
}

std::optional<StoreRow> StoreReading::read(std::string const& serialNumber,
                                           std::uint32_t boardIndex) {
    // A board that is not there would be looked for again by every getter.
    if (serialNumber.empty() || m_accessor.GetBoardInstance(serialNumber) == -1)
        return std::nullopt;
    QSBBoard board(serialNumber);
    StoreRow row;
    row.boardIndex = boardIndex;
    row.serialNumber = textUnlessError(board.SerialNumber());
    // The record has disappeared meanwhile, or cannot be read any more.
    if (row.serialNumber != serialNumber) return std::nullopt;
    row.model = textUnlessError(board.Model());
    row.version = textUnlessError(board.Version());
    row.firmwareName = textUnlessError(board.FirmwareName());
    row.firmwareVersion = textUnlessError(board.FirmwareVersion());
    row.functionalDescription = textUnlessError(board.FunctionalDescription());
    row.type = unlessNegative(board.Type());
    row.sharedMemoryAddress = addressText(board.SharedMemoryBaseAddress());
    row.ioAddress = addressText(board.IOBaseAddress());
    row.irq = unlessNegative(board.IRQ());
    row.boardId = unlessNegative(board.BoardID());
    row.pciSlotNumber = unlessNegative(board.PCISlotNumber());
    row.deviceChangeDate = textUnlessError(board.DeviceChangeDate());
    return row;
}

} // namespace kvloamd
