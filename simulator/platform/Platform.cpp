// SPDX-License-Identifier: BSD-2-Clause
// The simulated platform of this process: its parts, and the loading of its chassis.
#include "simulator/platform/Platform.h"

#include <cstdio>
#include <cstdlib>
#include <exception>

#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Findings.h"
#include "simulator/platform/BundledChassis.h"
#include "simulator/store/StoreContents.h"

namespace kvlsim {

Platform::Platform()
    : m_store([this] {
          return read([this](Chassis const* chassis) {
              if (chassis == nullptr) throw StoreError("there is no chassis: " + failure());
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

void Platform::replaceChassis(Chassis chassis) {
    m_chassis.put(std::move(chassis));
    {
        std::lock_guard const lock(m_failureLock);
        m_failure.clear();
    }
    m_processes.restart();
}

std::string Platform::failure() {
    std::lock_guard const lock(m_failureLock);
    return m_failure;
}

void Platform::loadConfiguredChassis() {
    if (read([](Chassis const* chassis) { return chassis != nullptr; })) return;
    std::string const file = configured("KVLSIM_CHASSIS");
    std::string source = file.empty() ? "the bundled chassis" : file;
    try {
        // Another thread's `loadChassis` may have come first: its chassis stays.
        Findings findings;
        auto chassis =
            readChassis(file.empty() ? kBundledChassis : readChassisFile(file), findings);
        for (auto const& warning : findings.warnings(source))
            std::fprintf(stderr, "kvlsim: %s\n", warning.c_str());
        m_chassis.putFirst(std::move(chassis).value());
        return;
    } catch (ChassisError const& error) {
        source = describeError(source, error);
    } catch (std::exception const& error) {
        source += std::string(": ") + error.what();
    }
    std::fprintf(stderr, "kvlsim: %s\n", source.c_str());
    std::lock_guard const lock(m_failureLock);
    m_failure = source;
}

std::string configured(char const* variable) {
    char const* const value = std::getenv(variable);
    return value == nullptr ? std::string() : std::string(value);
}

} // namespace kvlsim
