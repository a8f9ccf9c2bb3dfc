// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/InterruptibleStart.h"

#include <poll.h>

#include <csignal>
#include <iterator>

#include "agent/log/Log.h"

namespace kvloamd {

InterruptibleStart::InterruptibleStart(Signals const& signals)
    : m_signals(signals), m_thread([this] { watch(); }) {}

void InterruptibleStart::end() {
    if (!m_thread.joinable()) return;
    m_ended.wake();
    m_thread.join();
}

void InterruptibleStart::watch() {
    pollfd watched[] = {{m_signals.descriptor(), POLLIN, 0}, {m_ended.descriptor(), POLLIN, 0}};
    for (;;) {
        if (poll(watched, std::size(watched), -1) < 0) continue;
        // The start has ended: signals belong to the serving thread.
        if (watched[1].revents != 0) return;
        while (auto const signal = m_signals.next()) {
            if (*signal != Signal::Stop) continue;
            log(LogLevel::Info, "stopped during the start");
            m_signals.letStopThrough();
            raise(SIGTERM);
        }
    }
}

} // namespace kvloamd
