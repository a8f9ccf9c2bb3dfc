// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/LinkWatch.h"

#include <utility>

#include "agent/notifications/StandardNotifications.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

bool hasChanged(std::optional<int> former, std::optional<int> now) {
    if (!former || !now) return false;
    if (former == kNotPresent || now == kNotPresent) return false;
    return isDown(*former) != isDown(*now);
}

} // namespace

void LinkWatch::update(Rows<InterfaceRow> const& interfaces, Clock::time_point begun) {
    std::vector<Link> links;
    links.reserve(interfaces.size());
    auto former = m_links.begin();
    for (InterfaceRow const& row : interfaces) {
        while (former != m_links.end() && former->ifIndex < row.ifIndex)
            ++former;
        bool const stayed = former != m_links.end() && former->ifIndex == row.ifIndex &&
                            former->boardIndex == row.boardIndex;
        if (stayed && hasChanged(former->operStatus, row.operStatus) && isEnabled(row))
            m_queue.push(changeOf(row, begun));
        links.push_back({row.ifIndex, row.boardIndex, row.operStatus});
    }
    m_links = std::move(links);
}

Notification LinkWatch::changeOf(InterfaceRow const& row, Clock::time_point begun) const {
    Notification change = linkChange(row, begun);
    if (row.type == kTypeDs1 && row.lastChange)
        change.sysUpTime = m_counters.sysUpTime(*row.lastChange);
    return change;
}

bool LinkWatch::isEnabled(InterfaceRow const& row) const {
    return m_settings.find({Setting::LinkUpDownTraps, row.ifIndex}).value_or(row.linkUpDownTraps) ==
           kEnabled;
}

} // namespace kvloamd
