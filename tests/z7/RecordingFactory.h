// SPDX-License-Identifier: BSD-2-Clause
// A Z7 factory of recording boards that opens the factory's internal operations.
#pragma once

#include <string>
#include <vector>

#include "access/DeviceMapperIf.h"
#include "tests/z7/RecordingBoard.h"
#include "z7/Z7BoardFactory.h"

class RecordingFactory final : public Z7BoardFactory {
  public:
    using Z7BoardFactory::check_for_changed_boards;
    using Z7BoardFactory::create_board;
    using Z7BoardFactory::notify_all_boards;
    using Z7BoardFactory::notify_board;
    using Z7BoardFactory::ping_boards;

    std::vector<long> GetBoardIdentifiers() override {
        calls += "list ";
        return DeviceMapperIf::get_interface()->ListAllBoards();
    }
    int RefreshBoardData() override {
        calls += "refresh ";
        return 0;
    }
    Z7Board* MakeBoard(long id) override {
        calls += "make" + std::to_string(id) + " ";
        if (id == unbuildable) return nullptr;
        auto* const board = new RecordingBoard(id);
        board->status = firstStatus;
        return board;
    }

    std::string calls;
    BoardStatusEnum firstStatus = BoardStatusStopped; ///< of the boards made
    long unbuildable = 0;
};
