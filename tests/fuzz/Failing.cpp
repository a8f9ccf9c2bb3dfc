// SPDX-License-Identifier: BSD-2-Clause
// A target with a fault: the test of Replay.cpp.
#include "tests/fuzz/FuzzInput.h"

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    fuzz::FuzzInput input(octets, size);
    fuzz::require(input.take(5) != "crash", "no input ends the target");
    return 0;
}
