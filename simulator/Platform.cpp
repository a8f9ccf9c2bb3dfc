// SPDX-License-Identifier: BSD-2-Clause
// The simulated platform of this process: start.
#include "simulator/Platform.h"

#include <cstdio>
#include <cstdlib>
#include <exception>

#include "simulator/BundledChassis.h"
#include "simulator/ChassisReader.h"
#include "simulator/ControlServer.h"
#include "simulator/Description.h"

namespace kvlsim {

namespace {

std::string configured(char const* variable) {
    char const* const value = std::getenv(variable);
    return value == nullptr ? std::string() : std::string(value);
}

} // namespace

Platform::Platform()
    : m_store([this] {
          return read([this](Chassis const* chassis) {
              if (chassis == nullptr) throw StoreError("there is no chassis: " + m_failure);
              return contentsFor(*chassis);
          });
      }),
      m_processes([this] {
          return read([](Chassis const* chassis) {
              if (chassis != nullptr && chassis->processes()) return *chassis->processes();
              return std::vector{ProcessDraft{ProcessKind::self, "", 0, defaultCounters()}};
          });
      }) {}

Platform& Platform::instance() {
    // Never destroyed: other threads may call until the very end of the process.
    static auto* const platform = new Platform;
    return *platform;
}

Platform& Platform::started() {
    static std::once_flag once;
    Platform& platform = instance();
    std::call_once(once, [&platform] {
        platform.store().setDirectory(configured("VQRXCFGPATH"));
        platform.loadConfiguredChassis();
        if (std::string const path = configured("KVLSIM_SOCKET"); !path.empty())
            startControlServer(path, platform);
    });
    return platform;
}

void Platform::replaceChassis(Chassis chassis) {
    {
        std::unique_lock const lock(m_lock);
        putInPlace(chassis);
        m_failure.clear();
    }
    m_processes.restart();
}

void Platform::putInPlace(Chassis& chassis) {
    std::swap(m_chassis, chassis);
    m_chassis.setLineClock(m_lineClock); // the lines are loaded now, not when they were read
    m_loaded = true;
}

void Platform::setLineClock(Chassis::LineClock* clock) {
    std::unique_lock const lock(m_lock);
    m_lineClock = clock;
    m_chassis.setLineClock(clock);
}

std::string Platform::failure() {
    std::shared_lock const lock(m_lock);
    return m_failure;
}

void Platform::loadConfiguredChassis() {
    if (read([](Chassis const* chassis) { return chassis != nullptr; })) return;
    std::string const file = configured("KVLSIM_CHASSIS");
    std::string source = file.empty() ? "the bundled chassis" : file;
    try {
        Chassis chassis = readChassis(file.empty() ? kBundledChassis : readChassisFile(file));
        std::unique_lock const lock(m_lock);
        if (m_loaded) return; // given by loadChassis meanwhile
        putInPlace(chassis);
        return;
    } catch (ChassisError const& error) {
        source = describeError(source, error);
    } catch (std::exception const& error) {
        source += std::string(": ") + error.what();
    }
    std::fprintf(stderr, "kvlsim: %s\n", source.c_str());
    std::unique_lock const lock(m_lock);
    m_failure = source;
}

} // namespace kvlsim
