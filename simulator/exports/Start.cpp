// SPDX-License-Identifier: BSD-2-Clause
// The start of the simulated platform.
#include "simulator/exports/Start.h"

#include <mutex>

#include "simulator/control/ControlServer.h"

namespace kvlsim {

Platform& startedPlatform() {
    static std::once_flag once;
    Platform& platform = Platform::instance();
    std::call_once(once, [&platform] {
        platform.store().setDirectory(configured("VQRXCFGPATH"));
        platform.loadConfiguredChassis();
        if (std::string const path = configured("KVLSIM_SOCKET"); !path.empty())
            startControlServer(path, platform);
    });
    return platform;
}

} // namespace kvlsim
