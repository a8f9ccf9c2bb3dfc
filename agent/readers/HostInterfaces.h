// SPDX-License-Identifier: BSD-2-Clause
// The host's own network interfaces, which snmpd shows in the same tables as ours.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "agent/rows/Clock.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

struct HostInterface {
    std::uint32_t ifIndex = 0;
    std::string name;
};

/// The kernel's list, whose indices are snmpd's.
std::vector<HostInterface> listHostInterfaces();

/// A `HostInterfaces` finds interfaces of the host that have the ifIndex of one of ours: snmpd
/// would show a mixture of both. The log says when this begins and when it ends. Unsynchronised.
class HostInterfaces {
  public:
    using List = std::function<std::vector<HostInterface>()>;

    /// How often the host is asked at most.
    static constexpr std::chrono::seconds kPause{10};

    explicit HostInterfaces(List list = listHostInterfaces) : m_list(std::move(list)) {}

    /// The highest ifIndex on the host; 0 if there is none.
    std::uint32_t highest() const;
    /// How many of `ours`, which are ascending by index, have an ifIndex of the host.
    std::uint32_t conflicts(Rows<InterfaceRow> const& ours, Clock::time_point now);

  private:
    List m_list;
    bool m_asked = false;
    Clock::time_point m_last; ///< when the host was asked
    std::uint32_t m_conflicts = 0;
};

} // namespace kvloamd
