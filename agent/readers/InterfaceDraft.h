// SPDX-License-Identifier: BSD-2-Clause
// The interfaces of one board while they are being read.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>

#include "agent/readers/BoardInterfaces.h"
#include "agent/rows/IndexKey.h"
#include "board/DS1LineDevice.h"
#include "core/Object.h"

namespace kvloamd {

/// An `InterfaceDraft` collects the interfaces of one board: it numbers them, keeps their names
/// different, and knows which lines there are. Unsynchronised.
class InterfaceDraft {
  public:
    /// What has been entered so far.
    BoardInterfaces& found() { return m_found; }
    BoardInterfaces const& found() const { return m_found; }
    BoardInterfaces take() { return std::move(m_found); }

    /// Enters an interface under a name that no other of its kind has. The row is good until the
    /// next one is entered.
    InterfaceRow& enter(IndexKind kind, std::string const& name);
    /// Enters an interface without a name of its own under its position among those of its kind.
    InterfaceRow& enterNameless(IndexKind kind);
    /// Notes that `higher` lies above `lower`, unless `lower` is 0.
    void stack(std::uint32_t higher, std::uint32_t lower);

    /// Remembers the line whose row, of this name and circuit, was entered as number `index`.
    void addLine(DS1LineDevice const& line, std::string const& name, std::string const& circuit,
                 std::uint32_t index);
    /// The line that is called `name`, or whose circuit is; 0 when there is none.
    std::uint32_t findLine(std::string const& name) const;
    /// The line that `channel` itself says; 0 if it says none of this board. Nothing if the channel
    /// cannot say.
    std::optional<std::uint32_t> lineOf(Object& channel) const;
    bool isE1(std::uint32_t line) const;

  private:
    BoardInterfaces m_found;
    std::set<IndexKey> m_taken;
    std::map<IndexKind, int> m_nameless;
    std::map<std::string, std::uint32_t> m_lines; ///< by name and by circuit
    std::map<DS1LineDevice const*, std::uint32_t> m_lineObjects;
};

} // namespace kvloamd
