// SPDX-License-Identifier: BSD-2-Clause
// The entry point of the reference board module.
#include <cstdlib>

#include "Settings.h"
#include "Z7SimBoardFactory.h"
#include "board/BoardModule.h"

BoardFactory* kvl_create_board_factory(int abi_version) {
    if (abi_version != KVL_BOARD_MODULE_ABI_VERSION) return nullptr;
    auto* const factory = new Z7SimBoardFactory;
    factory->SetPingInterval(readPingInterval(std::getenv(kPingIntervalVariable)));
    factory->SetFailureTimes(readFailureTimes(std::getenv(kFailureDeclarationVariable),
                                              std::getenv(kFailureClearingVariable)));
    return factory;
}
