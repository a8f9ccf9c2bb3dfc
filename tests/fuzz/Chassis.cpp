// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the reader of chassis files. A chassis that it accepts must survive being printed.
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/store/StoreContents.h"
#include "tests/fuzz/FuzzInput.h"

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    std::string const text(reinterpret_cast<char const*>(octets), size);
    kvlsim::Findings findings(kvlsim::Findings::OnError::collect);
    auto const chassis = kvlsim::readChassis(text, findings);
    findings.errors("chassis");
    findings.warnings("chassis");
    fuzz::require(chassis.has_value() != findings.hasErrors(), "a faulty chassis is refused");
    if (!chassis) return 0;
    kvlsim::contentsFor(*chassis);
    for (std::int32_t const handle : chassis->root().children) {
        auto const board = kvlsim::toJson(*chassis->find(handle), *chassis);
        fuzz::require(board.is_object(), "a board can be printed");
        // Throws, and so is a finding, if what is printed cannot be read again.
        kvlsim::readBoard(kvlsim::describeJson(board));
    }
    return 0;
}
