// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ChangeTimes.h"

namespace kvloamd {

std::uint32_t ChangeTimes::at(std::uint32_t ifIndex, long date, Clock::time_point seen) {
    std::scoped_lock const guard(m_mutex);
    auto const [change, isNew] = m_changes.try_emplace(ifIndex);
    if (isNew)
        change->second = {date, m_uptime.of(date)};
    else if (change->second.date != date)
        change->second = {date, m_uptime.at(seen)};
    return change->second.ticks;
}

} // namespace kvloamd
