// SPDX-License-Identifier: BSD-2-Clause
// The abstract producer of boards.
#pragma once

#include "board/Board.h"
#include "core/IndexedTable.h"

/// The boards in sight, by index. Shared by a board manager and its factories.
using BoardTable = IndexedTable<int, ReferenceCounter<Board>>;

/// Makes boards, keeps a board table current with them, and tells its listeners of their status
/// changes. All operations may be called from any thread; its listeners are changed and walked
/// under the factory's own lock, which is never held during a callback.
class KVLOAM_API BoardFactory : public Object {
  public:
    BoardFactory();
    ~BoardFactory() override;

    /// Called once, when the factory is attached: makes the boards and enters them in `table`,
    /// which the factory keeps.
    virtual int Initialize(ReferenceCounter<BoardTable> table) = 0;
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddBoardStatusListener(BoardStatusListener* listener);
    /// Gives the factory a table to fill.
    virtual int AttachBoardTable(ReferenceCounter<BoardTable> table) = 0;
    /// Hands one event of `board` and `status` to every listener, on the caller's thread. Returns
    /// 0.
    virtual int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status);

    /// Returns 0, or 1 when `listener` is not among the listeners. A notification under way on
    /// another thread may still reach it.
    int RemoveBoardStatusListener(BoardStatusListener* listener);

  private:
    ListenerTable m_listeners;
};
