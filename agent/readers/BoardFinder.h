// SPDX-License-Identifier: BSD-2-Clause
// Finds boards in the device mapper by their serial numbers.
#pragma once

#include <map>
#include <optional>
#include <string>

namespace kvloamd {

/// The device mapper's boards as they were when it was made. A board tells its serial number but
/// not its handle.
class BoardFinder {
  public:
    /// Asks the device mapper for all boards, however many, and each for its serial number.
    BoardFinder();

    /// Whether the device mapper answered.
    bool good() const { return m_good; }
    /// The handle of the board with this serial number, as `readSerialNumber` gives it. Nothing
    /// when there is none, or several, or the serial number is not known.
    std::optional<long> find(std::string const& serialNumber) const;
    /// The serial number of the board that its driver knows by this number; nothing when there is
    /// none, or several, or the serial number is not known.
    std::optional<std::string> serialNumberOfDriverBoard(long driverBoard) const;

  private:
    bool m_good = false;
    std::map<std::string, std::optional<long>> m_handles; ///< nothing: of several boards
    std::map<long, std::string> m_driverBoards;           ///< empty: of several boards
};

} // namespace kvloamd
