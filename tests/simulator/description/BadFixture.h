// SPDX-License-Identifier: BSD-2-Clause
// A chassis file that must be refused.
#pragma once

#include <string>

#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Description.h"

struct BadFixture {
    char const* file;
    char const* refusal; ///< behind the file's name
};

/// What reading the fixture is refused with.
inline std::string refusalOf(BadFixture const& fixture) {
    std::string const path = std::string(KVLSIM_FIXTURES "/") + fixture.file;
    try {
        kvlsim::readChassis(kvlsim::readChassisFile(path));
    } catch (kvlsim::ChassisError const& error) {
        return kvlsim::describeError(fixture.file, error);
    }
    return "accepted";
}
