// SPDX-License-Identifier: BSD-2-Clause
// A board module with two boards. The first one throws when it is asked, while the file exists that
// the environment variable FAULTY_BOARD_MARK names.
#include <unistd.h>

#include <cstdlib>
#include <stdexcept>

#include "board/BoardModule.h"
#include "tests/support/FakeBoards.h"

namespace {

class FaultyFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable> table) override {
        auto* const faulty = new FakeBoard;
        ReferenceCounter<Board> const handle(faulty);
        faulty->whenAsked = [] {
            char const* const mark = std::getenv("FAULTY_BOARD_MARK");
            if (mark != nullptr && access(mark, F_OK) == 0)
                throw std::runtime_error("the bus is gone");
        };
        enter_at_next_index(*table.get(), handle);
        auto* const sound = new FakeBoard;
        sound->serialNumber = "S2";
        enter_at_next_index(*table.get(), ReferenceCounter<Board>(sound));
        return 0;
    }
    int AttachBoardTable(ReferenceCounter<BoardTable>) override { return 0; }
};

} // namespace

extern "C" BoardFactory* kvl_create_board_factory(int) {
    return new FaultyFactory;
}
