// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ServiceNotice.h"

#include <cstdint>

#include <systemd/sd-daemon.h>

namespace kvloamd {

ServiceNotice::ServiceNotice() : m_next(Clock::now()) {
    std::uint64_t limit = 0; // microseconds
    if (sd_watchdog_enabled(0, &limit) > 0) m_pause = std::chrono::microseconds(limit / 2);
}

void ServiceNotice::ready(std::string const& status) const {
    sd_notify(0, ("READY=1\nSTATUS=" + status).c_str());
}

void ServiceNotice::reloading() const {
    sd_notify(0, "RELOADING=1");
}

void ServiceNotice::stopping() const {
    sd_notify(0, "STOPPING=1\nSTATUS=stopping");
}

std::optional<Clock::time_point> ServiceNotice::beat() {
    if (!m_pause) return std::nullopt;
    auto const now = Clock::now();
    if (now >= m_next) {
        sd_notify(0, "WATCHDOG=1");
        m_next = now + *m_pause;
    }
    return m_next;
}

} // namespace kvloamd
