// SPDX-License-Identifier: BSD-2-Clause
// The faults that are raised now, as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace kvloamd {

/// The numbers of the faults that have a name, KVL-OAM-MIB's KvlFaultKind: the alarms of lines.
inline constexpr std::uint32_t kFirstNamedFault = 256;
inline constexpr std::uint32_t kLastNamedFault = 266;
/// The kind of every other fault.
inline constexpr int kOtherFault = 1;

inline int faultKind(std::uint32_t value) {
    bool const isNamed = value >= kFirstNamedFault && value <= kLastNamedFault;
    return isNamed ? static_cast<int>(value) : kOtherFault;
}

/// A fault that has been raised and not been cleared.
struct FaultRow {
    std::uint32_t boardIndex = 0; ///< 0: of a board that the agent does not know
    std::uint32_t value = 0;      ///< the platform's
    int platformBoard = 0;        ///< the number by which the platform speaks of the board
    std::uint32_t time = 0;       ///< when it was raised first: hundredths since the agent's start
    std::string date;             ///< the same, as `dateOctets`
    std::uint32_t times = 0;      ///< how often it has been raised since then

    std::array<std::uint32_t, 2> index() const { return {boardIndex, value}; }
    bool operator==(FaultRow const&) const = default;
};

/// A `Faults` is the list of faults and its counts at one time.
struct Faults {
    std::vector<FaultRow> rows;   ///< ascending by index
    std::uint32_t raised = 0;     ///< raisings since the start
    std::uint32_t unlisted = 0;   ///< raisings of faults that found the list full
    std::uint32_t lastChange = 0; ///< of the list: hundredths of a second since the agent's start
};

} // namespace kvloamd
