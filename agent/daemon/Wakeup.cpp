// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Wakeup.h"

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

// NOLINTNEXTLINE(readability-make-member-function-const): it changes what the descriptor tells
void Wakeup::wake() {
    // Fails only when the count is at its limit, and then the descriptor is readable already.
    eventfd_write(m_descriptor, 1);
}

// NOLINTNEXTLINE(readability-make-member-function-const): the same
void Wakeup::clear() {
    // Fails only when nobody has woken, and then there is nothing to clear.
    eventfd_t count = 0;
    eventfd_read(m_descriptor, &count);
}

} // namespace kvloamd
