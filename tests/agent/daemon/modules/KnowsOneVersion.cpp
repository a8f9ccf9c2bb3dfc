// SPDX-License-Identifier: BSD-2-Clause
// A board module that was built for the version that lies DISTANCE from this one, and for no other.
#include "board/BoardModule.h"

namespace {

constexpr int kBuiltFor = KVL_BOARD_MODULE_ABI_VERSION + DISTANCE;

class EmptyFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable>) override { return 0; }
    int AttachBoardTable(ReferenceCounter<BoardTable>) override { return 0; }
};

} // namespace

extern "C" BoardFactory* kvl_create_board_factory(int abi_version) {
    return abi_version == kBuiltFor ? new EmptyFactory : nullptr;
}
