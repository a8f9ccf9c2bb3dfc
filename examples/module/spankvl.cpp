// SPDX-License-Identifier: BSD-2-Clause
// A board with a T1 line, the factory of such boards, and the module's entry point.
#include <atomic>

#include "SpanLine.h"

/// A board with one T1 line. Most answers come from the board's device mapper record, which the
/// base keeps. The base also calls the operations that start and stop the board, on the platform's
/// delivery thread.
class SpanBoard final : public Z7Board {
  public:
    explicit SpanBoard(long id) : Z7Board(id) {
        auto const lines = DevMapBoardIf(id).ListDevicesByType(501); // T1
        if (!lines.empty()) AddFeature({new SpanLineFeature(lines.front())});
    }

    BoardStatusEnum GetStatus() override { return m_status; }
    BoardStatusEnum GetSecondaryStatus() override { return m_secondary; }
    int GetName(char* text) override { return putText(record()->Name(), text); }
    int GetModel(char* text) override { return GetName(text); }
    int GetFamily(char* text) override { return putText(record()->Family(), text); }
    int GetFirmwareName(char* text) override { return putText(record()->FirmwareName(), text); }
    int GetFirmwareVersion(char* t) override { return putText(record()->FirmwareVersion(), t); }
    int GetLogicalID() override { return -1; }
    int GetBoardID() override { return static_cast<int>(record()->BoardID()); }
    int GetShelfID() override { return static_cast<int>(record()->ShelfID()); }

    int SetStatus(BoardStatusEnum status) override { return put(status, m_status); }
    int SetSecondaryStatus(BoardStatusEnum status) override { return put(status, m_secondary); }
    int PingBoard() override { return 0; }
    int StartStage1() override { return 0; }
    int StartStage2() override { return 0; }
    int StartStage3() override { return 0; }
    int StopBoard() override { return 0; }

  private:
    std::atomic<BoardStatusEnum> m_status{BoardStatusStopped};
    std::atomic<BoardStatusEnum> m_secondary{BoardStatusNone};
};

/// The factory for the boards of platform "NX5"; other modules handle the others. The base keeps
/// the board table current.
class SpanBoardFactory final : public Z7BoardFactory {
  protected:
    std::vector<long> GetBoardIdentifiers() override {
        return DeviceMapperIf::get_interface()->ListBoardsByPlatform("NX5");
    }
    int RefreshBoardData() override { return 0; }
    Z7Board* MakeBoard(long id) override {
        auto* const board = new SpanBoard(id);
        // A board that runs already sends no message about it.
        if (DevMapBoardIf(id).BoardCondition() == BoardStatusStarted)
            board->SetStatus(BoardStatusStarted);
        return board;
    }
};

BoardFactory* kvl_create_board_factory(int abi_version) {
    return abi_version == KVL_BOARD_MODULE_ABI_VERSION ? new SpanBoardFactory : nullptr;
}
