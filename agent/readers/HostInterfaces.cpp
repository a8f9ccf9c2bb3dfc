// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/HostInterfaces.h"

#include <net/if.h>

#include <algorithm>
#include <memory>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

std::vector<HostInterface> listHostInterfaces() {
    std::vector<HostInterface> all;
    std::unique_ptr<struct if_nameindex, void (*)(struct if_nameindex*)> const list(
        if_nameindex(), if_freenameindex);
    for (auto const* each = list.get(); each != nullptr && each->if_index != 0; ++each)
        all.push_back({each->if_index, each->if_name});
    return all;
}

std::uint32_t HostInterfaces::highest() const {
    std::uint32_t highest = 0;
    for (HostInterface const& each : m_list())
        highest = std::max(highest, each.ifIndex);
    return highest;
}

std::uint32_t HostInterfaces::conflicts(Rows<InterfaceRow> const& ours, Clock::time_point now) {
    if (std::exchange(m_asked, true) && now - m_last < kPause) return m_conflicts;
    m_last = now;
    std::uint32_t const former = std::exchange(m_conflicts, 0);
    HostInterface first;
    for (HostInterface& each : m_list()) {
        if (!std::ranges::binary_search(ours, each.ifIndex, {}, &InterfaceRow::ifIndex)) continue;
        if (m_conflicts++ == 0) first = std::move(each);
    }
    if (m_conflicts > 0 && former == 0)
        log(LogLevel::Warning,
            "interface " + first.name + " of the host has ifIndex " +
                std::to_string(first.ifIndex) +
                ", as an interface of a board has (such conflicts: " + std::to_string(m_conflicts) +
                "); snmpd mixes the columns of both. Stop the agent, delete ifindex.sqlite, and "
                "start it with a higher --interface-base");
    if (m_conflicts == 0 && former > 0)
        log(LogLevel::Info, "no interface of the host has the ifIndex of a board's any more");
    return m_conflicts;
}

} // namespace kvloamd
