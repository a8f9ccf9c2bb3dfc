// SPDX-License-Identifier: BSD-2-Clause
// The arguments of one control command, checked as they are taken.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

#include "simulator/chassis/Chassis.h"

namespace kvlsim {

/// A `CommandError` says in one line why a command is refused.
class CommandError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// `Arguments` are the arguments of one control command. All operations throw CommandError when an
/// argument is missing or of the wrong type.
class Arguments {
  public:
    /// Requires: an object that outlives this.
    explicit Arguments(nlohmann::json const& command) : m_command(command) {}

    /// Refuses every argument but these and the command's own name.
    void allow(std::initializer_list<std::string_view> names) const;

    bool has(char const* name) const { return m_command.contains(name); }
    nlohmann::json const& value(char const* name) const;
    std::string text(char const* name) const;
    bool flag(char const* name) const; ///< false when missing
    /// A whole number within the bounds, as a JSON number or a text such as "0x30001".
    std::int64_t number(char const* name, std::int64_t least, std::int64_t most) const;

    /// A board by handle, serial number or NAME (if only one board has it), in this order.
    ChassisObject const& board(Chassis const& chassis) const;
    /// Any object: by handle, serial number of a board, or NAME (if only one object has it).
    ChassisObject const& object(Chassis const& chassis, char const* name = "object") const;
    /// As `board`, but a handle need not be in the chassis.
    std::int32_t boardHandle(Chassis const& chassis) const;

  private:
    std::optional<std::int64_t> readNumber(char const* name) const;
    ChassisObject const* look(char const* name, Chassis const& chassis, bool boardsOnly) const;
    ChassisObject const& found(char const* name, Chassis const& chassis, bool boardsOnly) const;

    nlohmann::json const& m_command;
};

} // namespace kvlsim
