// SPDX-License-Identifier: BSD-2-Clause
// A chassis and its lock: replacing the chassis.
#include "simulator/chassis/GuardedChassis.h"

namespace kvlsim {

void GuardedChassis::putLocked(Chassis& chassis) {
    std::swap(m_chassis, chassis);
    m_chassis.setLineClock(m_lineClock);
    m_loaded = true;
}

void GuardedChassis::put(Chassis chassis) {
    std::unique_lock const lock(m_lock);
    putLocked(chassis);
}

void GuardedChassis::putFirst(Chassis chassis) {
    std::unique_lock const lock(m_lock);
    if (!m_loaded) putLocked(chassis);
}

void GuardedChassis::setLineClock(Chassis::LineClock* clock) {
    std::unique_lock const lock(m_lock);
    m_lineClock = clock;
    m_chassis.setLineClock(clock);
}

} // namespace kvlsim
