// SPDX-License-Identifier: BSD-2-Clause
// Boards whose answers a test chooses, and a factory that enters them in the manager's table.
#pragma once

#include <cstring>
#include <functional>
#include <string>
#include <utility>

#include "board/BoardManager.h"

class FakeBoard final : public Board {
  public:
    BoardStatusEnum status = BoardStatusStarted;
    BoardStatusEnum secondaryStatus = BoardStatusNone;
    std::string text = "text";
    std::string serialNumber = "S1";
    int number = 7;
    long address = 0x1000;
    long changeDate = 0;
    std::function<void()> whenAsked = [] {};

    BoardStatusEnum GetStatus() override {
        whenAsked();
        return status;
    }
    BoardStatusEnum GetSecondaryStatus() override { return secondaryStatus; }
    int GetName(char* name) override { return give(name, text + " name"); }
    int GetModel(char* model) override { return give(model, text + " model"); }
    int GetFamily(char* family) override { return give(family, text + " family"); }
    int GetFirmwareName(char* name) override { return give(name, text + " firmware"); }
    int GetFirmwareVersion(char* version) override { return give(version, text + " version"); }
    int GetSerialNumber(char* serial) override { return give(serial, serialNumber); }
    int GetLogicalID() override { return number; }
    int GetErrorMessage(char* message) override { return give(message, text + " error"); }
    long GetDeviceChangeDate() override { return changeDate; }
    int GetFunctionalDescription(char* description) override {
        return give(description, text + " description");
    }
    int GetBoardID() override { return number < 0 ? number : number + 1; }
    long GetSharedMemoryBaseAddress() override { return address; }
    long GetIOBaseAddress() override { return address == -1 ? -1 : address + 1; }
    int GetIRQ() override { return number < 0 ? number : number + 2; }
    int GetShelfID() override { return number < 0 ? number : number + 3; }
    int GetPCISlotNumber() override { return number < 0 ? number : number + 4; }
    int GetBusNumber() override { return number < 0 ? number : number + 5; }

  private:
    static int give(char* answer, std::string const& value) {
        std::strcpy(answer, value.c_str());
        return 0;
    }
};

class FakeFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable> table) override { return AttachBoardTable(table); }
    int AttachBoardTable(ReferenceCounter<BoardTable> table) override {
        m_table = table;
        return 0;
    }

    /// Enters a board; returns its index.
    int enter(ReferenceCounter<Board> board) {
        return enter_at_next_index(*m_table.get(), std::move(board));
    }
    void takeOut(ReferenceCounter<Board> board) { m_table->remove(std::move(board)); }

  private:
    ReferenceCounter<BoardTable> m_table;
};

/// A manager with one attached factory.
struct FakeChassis {
    ReferenceCounter<BoardManager> manager{new BoardManager};
    FakeFactory* factory = new FakeFactory;
    ReferenceCounter<BoardFactory> factoryHandle{factory};

    FakeChassis() { manager->Attach(factoryHandle); }

    /// Makes a board and enters it.
    ReferenceCounter<Board> insert(std::string serialNumber) {
        auto* const board = new FakeBoard;
        ReferenceCounter<Board> handle(board);
        board->serialNumber = std::move(serialNumber);
        factory->enter(handle);
        return handle;
    }
    static FakeBoard& fake(ReferenceCounter<Board> const& board) {
        return static_cast<FakeBoard&>(*board.get());
    }
};
