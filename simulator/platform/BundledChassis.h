// SPDX-License-Identifier: BSD-2-Clause
// The example chassis chassis/small.yaml, compiled in.
#pragma once

namespace kvlsim {

extern char const* const kBundledChassis;

} // namespace kvlsim
