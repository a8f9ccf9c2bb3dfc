// SPDX-License-Identifier: BSD-2-Clause
// Concrete boards and a factory without work of their own, so that the library's share is measured.
#pragma once

#include <cstring>
#include <numeric>
#include <vector>

#include "z7/Z7BoardFactory.h"

/// Answers every query at once and is always started, so that each stop it is told is a change.
class BenchBoard final : public Z7Board {
  public:
    using Z7Board::Z7Board;

    BoardStatusEnum GetStatus() override { return BoardStatusStarted; }
    BoardStatusEnum GetSecondaryStatus() override { return BoardStatusNone; }
    int GetName(char* text) override { return answer(text); }
    int GetModel(char* text) override { return answer(text); }
    int GetFamily(char* text) override { return answer(text); }
    int GetFirmwareName(char* text) override { return answer(text); }
    int GetFirmwareVersion(char* text) override { return answer(text); }
    int GetLogicalID() override { return 0; }
    int GetBoardID() override { return 0; }
    int GetShelfID() override { return 0; }
    int PingBoard() override { return 0; }
    int SetStatus(BoardStatusEnum) override { return 0; }
    int SetSecondaryStatus(BoardStatusEnum) override { return 0; }
    int StartStage1() override { return 0; }
    int StartStage2() override { return 0; }
    int StartStage3() override { return 0; }
    int StopBoard() override { return 0; }

  private:
    static int answer(char* text) {
        std::strcpy(text, "bench");
        return 0;
    }
};

class BenchFactory final : public Z7BoardFactory {
  public:
    /// `listens`: whether the administrative messages reach the factory.
    BenchFactory(long boards, bool listens)
        : m_identifiers(static_cast<std::size_t>(boards)), m_listens(listens) {
        std::iota(m_identifiers.begin(), m_identifiers.end(), 1L);
        SetPingInterval(0);
    }

    int Initialize(ReferenceCounter<BoardTable> table) override {
        if (m_listens) return Z7BoardFactory::Initialize(table);
        AttachBoardTable(table);
        for (long const id : m_identifiers)
            create_board(id);
        return 0;
    }

    using Z7BoardFactory::notify_all_boards;

  protected:
    std::vector<long> GetBoardIdentifiers() override { return m_identifiers; }
    int RefreshBoardData() override { return 0; }
    Z7Board* MakeBoard(long id) override { return new BenchBoard(id); }

  private:
    std::vector<long> m_identifiers;
    bool m_listens;
};
