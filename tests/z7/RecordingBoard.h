// SPDX-License-Identifier: BSD-2-Clause
// A Z7 board that records the calls of its operations.
#pragma once

#include <cstring>

#include <functional>
#include <string>

#include "z7/Z7Board.h"

/// A board that is stopped at first. `calls` gets one word for each change or notification, in
/// order.
class RecordingBoard final : public Z7Board {
  public:
    explicit RecordingBoard(long id) : Z7Board(id) {}

    using Z7Board::SetDeviceChangeDate;
    using Z7Board::SetErrorMessage;

    BoardStatusEnum GetStatus() override {
        queries += "status ";
        return status;
    }
    BoardStatusEnum GetSecondaryStatus() override {
        queries += "secondary ";
        return secondary;
    }
    int GetName(char* name) override { return copy(record()->Name(), name); }
    int GetModel(char* model) override { return copy("model", model); }
    int GetFamily(char* family) override { return copy(record()->Family(), family); }
    int GetFirmwareName(char* name) override { return copy(record()->FirmwareName(), name); }
    int GetFirmwareVersion(char* version) override {
        return copy(record()->FirmwareVersion(), version);
    }
    int GetLogicalID() override { return 0; }
    int GetBoardID() override { return static_cast<int>(record()->BoardID()); }
    int GetShelfID() override { return static_cast<int>(record()->ShelfID()); }

    int PingBoard() override {
        onPing();
        return note("ping");
    }
    int SetStatus(BoardStatusEnum to) override {
        status = to;
        return note("status" + std::to_string(to));
    }
    int SetSecondaryStatus(BoardStatusEnum to) override {
        secondary = to;
        return note("secondary" + std::to_string(to));
    }
    int StartStage1() override { return note("stage1"); }
    int StartStage2() override { return note("stage2"); }
    int StartStage3() override { return note("stage3"); }
    int StopBoard() override { return note("stop"); }
    int create_ipethernet_feature() override { return note("ipethernet"); }
    int create_extended_features() override { return note("features"); }
    int destroy_extended_features() override { return note("nofeatures"); }
    int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum told) override {
        note("tell" + std::to_string(told));
        return Z7Board::NotifyBoardStatusListeners(board, told);
    }

    BoardStatusEnum status = BoardStatusStopped;
    BoardStatusEnum secondary = BoardStatusNone;
    std::string calls;
    std::string queries;
    std::function<void()> onPing = [] {};

  private:
    static int copy(std::string const& text, char* buffer) {
        std::strcpy(buffer, text.c_str());
        return 0;
    }
    int note(std::string const& call) {
        calls += (calls.empty() ? "" : " ") + call;
        return 0;
    }
};
