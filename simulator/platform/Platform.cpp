// SPDX-License-Identifier: BSD-2-Clause
// The simulated platform of this process: its parts, and the loading of its chassis.
#include "simulator/platform/Platform.h"

#include <malloc.h>

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <future>
#include <string>
#include <system_error>
#include <thread>

#include "simulator/base/ThreadStart.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/Findings.h"
#include "simulator/platform/BundledChassis.h"
#include "simulator/store/StoreContents.h"

namespace kvlsim {

namespace {

/// Reads the text on a thread of its own, for which the C library has a heap of its own: what stays
/// of a chassis would otherwise lie scattered over the memory of its description, and what is
/// between would be too small for most of what comes later.
Description describeApart(std::string const& yamlText, Findings& findings) {
    std::packaged_task<Description()> reading([&] { return describeYaml(yamlText, findings); });
    std::future<Description> description = reading.get_future();
    try {
        startThread("kvlsim-reader", [&] { reading(); }).join();
    } catch (std::system_error const&) {
        reading(); // there is no other thread to be had
    }
    return description.get();
}

/// Gives the memory that the description took back to the system. The C library itself keeps it
/// where another thread uses the end of the same heap.
void releaseFreeMemory() {
#ifdef __GLIBC__
    malloc_trim(0);
#endif
}

} // namespace

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
        Chassis chassis = readChassis(
            describeApart(file.empty() ? kBundledChassis : readChassisFile(file), findings),
            findings);
        for (auto const& warning : findings.warnings(source))
            std::fprintf(stderr, "kvlsim: %s\n", warning.c_str());
        m_chassis.putFirst(std::move(chassis));
        releaseFreeMemory();
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
