// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/Wakeup.h"

#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace kvloamd {

Wakeup::Wakeup() : m_descriptor(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
    if (m_descriptor < 0) throw std::system_error(errno, std::generic_category(), "eventfd");
}

Wakeup::~Wakeup() {
    close(m_descriptor);
}

// NOLINTNEXTLINE(readability-make-member-function-const): it changes the state of the descriptor
void Wakeup::wake() {
    // Fails only when the counter is at its limit, and then the descriptor is readable.
    eventfd_write(m_descriptor, 1);
}

// NOLINTNEXTLINE(readability-make-member-function-const): the same
void Wakeup::clear() {
    // Fails only when the descriptor is not readable.
    eventfd_t count = 0;
    eventfd_read(m_descriptor, &count);
}

} // namespace kvloamd
