// SPDX-License-Identifier: BSD-2-Clause
// A file descriptor with an owner.
#include "simulator/base/Descriptor.h"

#include <unistd.h>

namespace kvlsim {

Descriptor::~Descriptor() {
    if (m_fd >= 0) close(m_fd);
}

} // namespace kvlsim
