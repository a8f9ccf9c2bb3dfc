// SPDX-License-Identifier: BSD-2-Clause
// The abstract factory of boards.
#pragma once

#include "board/Board.h"
#include "core/IndexedTable.h"

/// All boards, by board index. Shared by a board manager and its factories.
using BoardTable = IndexedTable<int, ReferenceCounter<Board>>;

/// A `BoardFactory` creates boards, keeps a board table up to date with them, and announces their
/// status changes to its listeners. Thread-safe. The factory's own lock guards the listeners and is
/// never held during a callback.
class KVLOAM_API BoardFactory : public Object {
  public:
    BoardFactory();
    ~BoardFactory() override;

    /// Called once, when the factory is attached. Creates the boards and enters them in `table`,
    /// which the factory keeps.
    virtual int Initialize(ReferenceCounter<BoardTable> table) = 0;
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddBoardStatusListener(BoardStatusListener* listener);
    /// Gives the factory a table to fill.
    virtual int AttachBoardTable(ReferenceCounter<BoardTable> table) = 0;
    /// Passes one event of `board` and `status` to every listener, on the caller's thread. Returns
    /// 0.
    virtual int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status);

    /// Returns 0, or 1 if `listener` is not among the listeners. A notification under way on
    /// another thread may still reach it.
    int RemoveBoardStatusListener(BoardStatusListener* listener);

  private:
    ListenerTable m_listeners;
};
