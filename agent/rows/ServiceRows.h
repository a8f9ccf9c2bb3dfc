// SPDX-License-Identifier: BSD-2-Clause
// Modules and services as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace kvloamd {

struct ModuleRow {
    std::uint32_t moduleIndex = 0;
    std::string name;
    std::string purpose;
    std::string version;
    std::string date; ///< as `dateOctets`

    std::array<std::uint32_t, 1> index() const { return {moduleIndex}; }
};

struct ServiceRow {
    std::uint32_t serviceIndex = 0;
    std::string name;
    std::string scmName;
    std::optional<int> status; ///< absent until it has been set
    std::string changeDate;    ///< as `dateOctets`

    std::array<std::uint32_t, 1> index() const { return {serviceIndex}; }
};

/// The board platform's own service.
struct PlatformService {
    std::optional<int> status; ///< absent until it has been set
    std::string changeDate;    ///< as `dateOctets`
};

} // namespace kvloamd
