// SPDX-License-Identifier: BSD-2-Clause
// One board as the agent tells of it: every query's answer, read at one time.
#pragma once

#include <array>
#include <optional>
#include <string>
#include <vector>

#include "agent/Value.h"
#include "board/Board.h"

namespace kvloamd {

/// The longest text that is served; longer ones are cut.
inline constexpr std::size_t kLongestText = 255;

struct BoardRow {
    std::uint32_t boardIndex = 0;
    int status = BoardStatusNone;
    int secondaryStatus = BoardStatusNone;
    std::string name;
    std::string model;
    std::string family;
    std::string firmwareName;
    std::string firmwareVersion;
    std::string serialNumber;
    std::optional<int> logicalId;
    std::string errorMessage;
    std::string changeDate; ///< as `dateOctets`
    std::string functionalDescription;
    std::optional<int> boardId;
    std::string sharedMemoryAddress; ///< as `addressText`
    std::string ioAddress;
    std::optional<int> irq;
    std::optional<int> shelfId;
    std::optional<int> pciSlotNumber;
    std::optional<int> busNumber;

    /// The row's place in its table.
    std::array<std::uint32_t, 1> index() const { return {boardIndex}; }

    bool operator==(BoardRow const&) const = default;
};

/// Asks `board` every query. `boardIndex` is its index at the board manager, above 0.
BoardRow readBoard(Board& board, int boardIndex);

/// The serial number as `readBoard` gives it.
std::string readSerialNumber(Board& board);

/// What each of `boards` is known by wherever something is kept for it: its serial number; where
/// that is unknown, or a board's before it, the board index besides. None is empty.
std::vector<std::string> keptNames(std::vector<BoardRow> const& boards);

/// `text` as it is served: what is not printable ASCII becomes '?', what is too long is cut.
std::string printable(std::string_view text);

/// Seconds since the epoch as the 11 octets of a date with its offset from UTC, in local time;
/// empty for 0 or less, which is an unknown date, and for years that have no four digits.
std::string dateOctets(long seconds);

/// "0xd0000000"; empty for -1, which is an unknown address. The platform's addresses have four
/// bytes and arrive sign-extended, so other negative numbers are read as those four bytes.
std::string addressText(long address);

} // namespace kvloamd
