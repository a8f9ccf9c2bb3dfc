// SPDX-License-Identifier: BSD-2-Clause
// A fault in a description, as one line.
#include "simulator/chassis/ChassisError.h"

namespace kvlsim {

std::string describeError(std::string_view source, ChassisError const& error) {
    std::string line(source);
    if (error.line() > 0) line.append(":").append(std::to_string(error.line()));
    return line + ": " + error.what();
}

} // namespace kvlsim
