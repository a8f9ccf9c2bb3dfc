// SPDX-License-Identifier: BSD-2-Clause
// A board module whose one board hangs, like a platform that hangs, as soon as the file exists that
// the environment variable SLOW_BOARD_ORDER names. It then creates the file of SLOW_BOARD_MARK.
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "board/BoardModule.h"
#include "tests/support/FakeBoards.h"

namespace {

class SlowFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable> table) override {
        auto* const board = new FakeBoard;
        ReferenceCounter<Board> const handle(board);
        board->whenAsked = [] {
            char const* const order = std::getenv("SLOW_BOARD_ORDER");
            if (order != nullptr && std::filesystem::exists(order)) hang();
        };
        enter_at_next_index(*table.get(), handle);
        return 0;
    }
    int AttachBoardTable(ReferenceCounter<BoardTable>) override { return 0; }

  private:
    [[noreturn]] static void hang() {
        if (char const* const mark = std::getenv("SLOW_BOARD_MARK"); mark != nullptr)
            std::ofstream(mark) << "hanging\n";
        for (;;)
            pause();
    }
};

} // namespace

extern "C" BoardFactory* kvl_create_board_factory(int) {
    return new SlowFactory;
}
