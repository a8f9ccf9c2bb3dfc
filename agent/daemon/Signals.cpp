// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Signals.h"

#include <pthread.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <cerrno>
#include <initializer_list>
#include <system_error>

namespace kvloamd {

namespace {

sigset_t setOf(std::initializer_list<int> numbers) {
    sigset_t signals{};
    sigemptyset(&signals);
    for (int const number : numbers)
        sigaddset(&signals, number);
    return signals;
}

} // namespace

Signals::Signals() {
    std::signal(SIGPIPE, SIG_IGN);
    sigset_t const signals = setOf({SIGTERM, SIGINT, SIGHUP});
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    // A write beyond the file size limit fails instead, as on a full disk.
    std::signal(SIGXFSZ, SIG_IGN);
    m_descriptor = signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK);
    if (m_descriptor < 0) throw std::system_error(errno, std::generic_category(), "signalfd");
}

Signals::~Signals() {
    close(m_descriptor);
}

std::optional<Signal> Signals::next() const {
    signalfd_siginfo taken;
    if (read(m_descriptor, &taken, sizeof taken) != sizeof taken) return std::nullopt;
    return taken.ssi_signo == SIGHUP ? Signal::Reload : Signal::Stop;
}

void Signals::letStopThrough() const {
    while (next()) {
    }
    sigset_t const signals = setOf({SIGTERM, SIGINT});
    pthread_sigmask(SIG_UNBLOCK, &signals, nullptr);
}

} // namespace kvloamd
