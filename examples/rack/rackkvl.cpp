// SPDX-License-Identifier: BSD-2-Clause
// The factory of the rack's boards, and the module's entry point.
#include <chrono>
#include <map>
#include <string>
#include <thread>

#include "RackBoard.h"

/// Keeps the board table up to date with the rack, which it reads once a second on a thread of its
/// own.
class RackBoardFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable> table) override {
        AttachBoardTable(table);
        update(); // the boards that are present now
        // The thread never ends, so its handle keeps the factory for good.
        std::thread([factory = ReferenceCounter<RackBoardFactory>(this)] {
            for (;; std::this_thread::sleep_for(std::chrono::seconds(1)))
                factory->update();
        }).detach();
        return 0;
    }
    int AttachBoardTable(ReferenceCounter<BoardTable> table) override {
        m_table = table;
        return 0;
    }

  private:
    void update() {
        auto const cards = readRack();
        if (!cards) return; // the rack does not answer, which does not mean that it is empty
        for (auto entry = m_boards.begin(); entry != m_boards.end();) {
            auto const [serialNumber, board] = *entry++;
            if (cards->count(serialNumber) == 0) remove(serialNumber, board);
        }
        for (auto const& [serialNumber, reading] : *cards) {
            if (m_boards.count(serialNumber) == 0) add(serialNumber);
            follow(m_boards[serialNumber], reading);
        }
    }
    void add(std::string const& serialNumber) {
        ReferenceCounter<RackBoard> const board(new RackBoard(serialNumber));
        m_boards[serialNumber] = board;
        enter_at_next_index(*m_table.get(), ReferenceCounter<Board>(board.get()));
        announce(board, BoardStatusAdded);
    }
    void remove(std::string const& serialNumber, ReferenceCounter<RackBoard> const& board) {
        announce(board, BoardStatusRemoved);
        m_table->remove(ReferenceCounter<Board>(board.get()));
        m_boards.erase(serialNumber);
        if (board->GetStatus() == BoardStatusStarted) board->stop();
    }
    void follow(ReferenceCounter<RackBoard> const& board, CardReading const& reading) {
        board->update(reading);
        bool const runs = board->GetStatus() == BoardStatusStarted;
        if (reading.running == runs) return;
        if (reading.running)
            board->start();
        else
            board->stop();
        announce(board, board->GetStatus());
    }
    /// Notifies the listeners of the board, then those of the factory.
    void announce(ReferenceCounter<RackBoard> const& board, BoardStatusEnum status) {
        ReferenceCounter<Board> const handle(board.get());
        board->NotifyBoardStatusListeners(handle, status);
        NotifyBoardStatusListeners(handle, status);
    }

    ReferenceCounter<BoardTable> m_table;
    std::map<std::string, ReferenceCounter<RackBoard>> m_boards; ///< by serial number
};

BoardFactory* kvl_create_board_factory(int abi_version) {
    return abi_version == KVL_BOARD_MODULE_ABI_VERSION ? new RackBoardFactory : nullptr;
}
