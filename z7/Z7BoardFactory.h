// SPDX-License-Identifier: BSD-2-Clause
// The factory of Z7 boards, which follows the boards of the device mapper.
#pragma once

#include <atomic>
#include <map>
#include <vector>

#include "access/ExternalEventAdaptor.h"
#include "board/BoardFactory.h"
#include "platform/KVLThread_pthread.h"
#include "z7/Z7Board.h"

/// A `Z7BoardFactory` creates one board for every board present, enters it in the board table,
/// turns administrative messages into status changes, and pings every board on a thread of its own.
/// Concrete factories say which boards there are and create them.
///
/// Once initialised, a factory lives as long as the process: its thread and the event service hold
/// plain pointers to it.
///
/// Threads: the agent's thread (`Initialize`, `SetPingInterval`), the ping thread (`Run`,
/// `ping_boards`) and the platform's delivery thread (`ProcessExternalEvent` and everything that it
/// calls). The factory's own lock guards the board map and the table's handle, and is never held
/// during a callback, a ping or a platform request. Lock order: factory, then board table.
class KVLOAM_API Z7BoardFactory : public BoardFactory,
                                  public BoardStatusListener,
                                  public ExternalEventListener,
                                  public KVLThread_pthread,
                                  public Runnable {
  public:
    static constexpr int kDefaultPingInterval = 60; ///< seconds

    Z7BoardFactory();
    ~Z7BoardFactory() override;

    /// Creates the boards present and enters them in `table`, subscribes to the administrative
    /// messages, and starts the ping thread unless the ping interval is 0 or less. Returns 0.
    int Initialize(ReferenceCounter<BoardTable> table) override;
    /// Replaces the table. Returns 0.
    int AttachBoardTable(ReferenceCounter<BoardTable> table) override;
    /// Does nothing and returns -1.
    virtual int Update();
    /// Passes a board's status change on to the factory's own listeners. Returns 0.
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;
    /// Returns 0.
    int ProcessExternalEvent(ReferenceCounter<ExternalEvent> event) override;
    /// Sets the ping interval from the ping thread's next sleep on. Without a positive interval,
    /// `Initialize` starts no ping thread. Returns 0.
    virtual int SetPingInterval(int seconds);

  protected:
    /// Creates the board `id`, enters it in the table and the map, announces it with status 9, and
    /// listens to it, which announces its present status. Returns 0, or -1 if the concrete factory
    /// creates none.
    virtual int create_board(long id);
    /// Compares the map with the boards present: announces boards that have gone with status 10 and
    /// removes them, and creates new ones. A board whose serial number has changed is another
    /// board. Returns 0.
    virtual int check_for_changed_boards();

  public:
    /// The ping thread's body. Never returns.
    void Run() override;

  protected:
    /// The boards present now.
    virtual std::vector<long> GetBoardIdentifiers() = 0;
    /// Called before boards are created at the start and before every pass of pings.
    virtual int RefreshBoardData() = 0;
    /// Creates the board `id`, or returns null. The caller puts it into a handle at once.
    virtual Z7Board* MakeBoard(long id) = 0;

    /// Delivers `status` to the board `id`, if there is one. Returns -1.
    int notify_board(long id, BoardStatusEnum status);
    /// Delivers `status` to every board, in the order of their identifiers. Returns -1.
    int notify_all_boards(BoardStatusEnum status);
    /// One pass of pings, in the order of identifiers. Returns 0.
    int ping_boards();

  private:
    using BoardMap = std::map<long, ReferenceCounter<Board>>;

    BoardMap copyBoards();
    ReferenceCounter<Board> findBoard(long id);
    void dropBoard(long id, ReferenceCounter<Board> const& board);

    std::atomic<int> m_pingInterval{kDefaultPingInterval};
    ReferenceCounter<BoardTable> m_boardTable;
    BoardMap m_boards;
    ReferenceCounter<ExternalEventAdaptor> m_eventAdaptor;
    ReferenceCounter<BoardFactory> m_self; ///< set once initialised; never dropped
};
