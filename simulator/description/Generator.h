// SPDX-License-Identifier: BSD-2-Clause
// Generates boards and whole chassis. The same seed gives the same result on every machine.
#pragma once

#include <cstdint>
#include <random>
#include <string>

#include <nlohmann/json.hpp>

namespace kvlsim {

/// `GeneratorOptions` say how large a generated chassis is.
struct GeneratorOptions {
    std::int32_t boards = 3;
    std::int32_t devices = 2;    ///< per board
    std::int32_t subDevices = 1; ///< per device, where its type has sub-devices
    std::int32_t processors = 1; ///< per board
    std::int32_t lines = 0;      ///< per board: trunk devices with a DS1 line, behind the others
    std::uint32_t seed = 1;
    std::string family; ///< of all boards, where it is a known one; else families vary
};

/// A `Generator` makes boards from a sequence of pseudo-random numbers. Unsynchronised.
class Generator {
  public:
    explicit Generator(GeneratorOptions const& options)
        : m_options(options), m_random(options.seed) {}

    /// The description of one board; its devices and processors get the handles from `nextHandle`
    /// on, which is moved behind them.
    nlohmann::ordered_json board(std::int32_t handle, std::int32_t& nextHandle);

    /// A chassis file: boards with the handles 1, 2, 3 ..., everything else behind them.
    /// Requires: all handles fit (`objects()` is below Chassis::kRootHandle).
    std::string chassis();

    /// Upper bound of the number of objects in a chassis of these options.
    static std::int64_t objects(GeneratorOptions const& options);

  private:
    /// Line `index` of a board.
    nlohmann::ordered_json line(std::int32_t board, std::int32_t handle, std::int32_t index,
                                bool isE1);
    std::int32_t pick(std::int32_t least, std::int32_t most);

    GeneratorOptions m_options;
    std::mt19937 m_random;
};

} // namespace kvlsim
