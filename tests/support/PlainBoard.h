// SPDX-License-Identifier: BSD-2-Clause
// A board that answers every query with a constant.
#pragma once

#include <cstring>

#include "board/Board.h"

class PlainBoard : public Board {
  public:
    BoardStatusEnum GetStatus() override { return BoardStatusStarted; }
    BoardStatusEnum GetSecondaryStatus() override { return BoardStatusNone; }
    int GetName(char* name) override { return copy("plain", name); }
    int GetModel(char* model) override { return copy("model", model); }
    int GetFamily(char* family) override { return copy("family", family); }
    int GetFirmwareName(char* name) override { return copy("firmware", name); }
    int GetFirmwareVersion(char* version) override { return copy("1.0", version); }
    int GetSerialNumber(char* serialNumber) override { return copy("P-1", serialNumber); }
    int GetLogicalID() override { return 1; }
    int GetErrorMessage(char* message) override { return copy("", message); }
    long GetDeviceChangeDate() override { return 0; }
    int GetFunctionalDescription(char* description) override { return copy("board", description); }
    int GetBoardID() override { return 2; }
    long GetSharedMemoryBaseAddress() override { return 3; }
    long GetIOBaseAddress() override { return 4; }
    int GetIRQ() override { return 5; }
    int GetShelfID() override { return 6; }
    int GetPCISlotNumber() override { return 7; }
    int GetBusNumber() override { return 8; }

  private:
    static int copy(char const* text, char* buffer) {
        std::strcpy(buffer, text);
        return 0;
    }
};
