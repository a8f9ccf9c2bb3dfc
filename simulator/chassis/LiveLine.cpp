// SPDX-License-Identifier: BSD-2-Clause
// The start of a line of the chassis.
#include "simulator/chassis/LiveLine.h"

#include <utility>

#include "simulator/chassis/LinePast.h"

namespace kvlsim {

LiveLine::LiveLine(LineDraft draft, Time now) : m_draft(std::move(draft)) {
    restart(now);
}

void LiveLine::restart(Time now) {
    m_born = now - std::chrono::seconds(m_draft.past.seconds);
    m_line = lineAtLoading(m_draft);
}

} // namespace kvlsim
