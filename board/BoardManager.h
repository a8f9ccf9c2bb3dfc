// SPDX-License-Identifier: BSD-2-Clause
// The agent's view of all boards.
#pragma once

#include "board/BoardFactory.h"
#include "core/kvlvector.h"

/// A `BoardManager` owns the board table that every attached factory fills, walks it by index or by
/// board, and passes the factories' status changes on to the agent's listeners.
///
/// Board indices are 1, 2, 3 ... in the order in which boards came. The index of a board that has
/// gone is not used again. 0 is no board and ends every walk.
///
/// The walks are thread-safe. The table may change between two steps: a walk by index continues
/// with the next higher index if its own is still there, and ends otherwise. Call `Attach` and
/// `AddBoardStatusListener` during set-up, on one thread. Destroy a manager only while no status
/// change is being delivered.
class KVLOAM_API BoardManager : public Object, public BoardStatusListener {
  public:
    BoardManager();
    ~BoardManager() override;

    /// The board at the lowest index, or an empty handle.
    virtual ReferenceCounter<Board> GetFirstBoard();
    /// The board at the next index above `index`; an empty handle if `index` is the highest or is
    /// not in the table.
    virtual ReferenceCounter<Board> GetNextBoard(int index);
    virtual ReferenceCounter<Board> GetNextBoard(ReferenceCounter<Board> board);
    virtual ReferenceCounter<Board> GetBoardByIndex(int index);
    virtual int GetNumberOfBoards();
    virtual int GetFirstBoardIndex();
    virtual int GetIndexByBoard(ReferenceCounter<Board> board);
    virtual int GetNextBoardIndex(int index);
    /// Listens to `factory`, keeps it, and initialises it with the board table. Returns 0.
    virtual int Attach(ReferenceCounter<BoardFactory> factory);
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddBoardStatusListener(BoardStatusListener* listener);
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

  private:
    ListenerTable m_listeners;
    ReferenceCounter<BoardTable> m_boards;
    ReferenceCounter<kvlvector<ReferenceCounter<BoardFactory>>> m_factories;
};
