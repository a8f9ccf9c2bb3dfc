// SPDX-License-Identifier: BSD-2-Clause
// Reads the modules and services of the service manager.
#pragma once

#include <vector>

#include "agent/rows/ServiceRows.h"
#include "services/ServiceManager.h"

namespace kvloamd {

// All rows are ascending by index. Thread-safe.
std::vector<ModuleRow> readModules(ServiceManager& manager);
std::vector<ServiceRow> readServices(ServiceManager& manager);
PlatformService readPlatformService(ServiceManager& manager);

} // namespace kvloamd
