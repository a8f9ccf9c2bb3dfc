// SPDX-License-Identifier: BSD-2-Clause
// The abstract board and its status changes.
#pragma once

#include <vector>

#include "board/Feature.h"
#include "core/Event.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// The states of a board, and the changes that are announced.
enum BoardStatusEnum : int {
    BoardStatusNone = 0,
    BoardStatusStarted = 3,
    BoardStatusStopped = 4,
    BoardStatusAdded = 9,    ///< announced for a newly found board
    BoardStatusRemoved = 10, ///< announced for a board that has gone
    BoardStatusStartPending = 13,
    BoardStatusStopPending = 14,
    BoardStatusFailed = 15 ///< a secondary status
};

class BoardStatusListener;

/// A `Board` is a telephony board: its descriptive queries, its features, and its status listeners.
///
/// Thread-safe. The board's own lock guards the features and listeners and is never held during a
/// callback. Callers that must combine several steps hold `lock()` around them.
///
/// Queries that take a `char*` write a terminated text without a length limit and return 0. A
/// device mapper text is at most 128 bytes with its terminator; a buffer of 256 bytes is enough for
/// every query. An unknown number is -1.
class KVLOAM_API Board : public Object {
  public:
    Board();
    ~Board() override;

    virtual BoardStatusEnum GetStatus() = 0;
    /// `BoardStatusFailed` after a failure, until the board starts again; otherwise
    /// `BoardStatusNone`.
    virtual BoardStatusEnum GetSecondaryStatus() = 0;
    virtual int GetName(char* name) = 0;
    virtual int GetModel(char* model) = 0;
    virtual int GetFamily(char* family) = 0;
    virtual int GetFirmwareName(char* name) = 0;
    virtual int GetFirmwareVersion(char* version) = 0;
    virtual int GetSerialNumber(char* serialNumber) = 0;
    virtual int GetLogicalID() = 0;
    virtual int GetErrorMessage(char* message) = 0;
    /// The time of the last change of state, in seconds since the epoch; 0 if it is not known.
    virtual long GetDeviceChangeDate() = 0;
    virtual int GetFunctionalDescription(char* description) = 0;
    virtual int GetBoardID() = 0;
    virtual long GetSharedMemoryBaseAddress() = 0;
    virtual long GetIOBaseAddress() = 0;
    virtual int GetIRQ() = 0;
    virtual int GetShelfID() = 0;
    virtual int GetPCISlotNumber() = 0;
    virtual int GetBusNumber() = 0;
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddBoardStatusListener(BoardStatusListener* listener);
    /// Passes one event of `board` and `status` to every listener, on the caller's thread. Returns
    /// 0.
    virtual int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status);

    int GetFeatureListSize();
    /// Appends `feature`; duplicates are kept. Returns 1.
    int AddFeature(ReferenceCounter<Feature> feature);
    /// Removes the first entry of the same feature. Returns 1, or 0 if there is none.
    int RemoveFeature(ReferenceCounter<Feature> feature);
    /// The first feature with the identifier `iid`, its own or an inherited one; otherwise an empty
    /// handle.
    ReferenceCounter<Feature> GetFirstFeature(KVL::IID iid);
    /// The next such feature after `previous`; an empty handle if there is none, or if `previous`
    /// is not among the features.
    ReferenceCounter<Feature> GetNextFeature(ReferenceCounter<Feature> previous, KVL::IID iid);

  private:
    std::vector<ReferenceCounter<Feature>> m_features;
    ListenerTable m_listeners;
};

/// A `BoardStatusEvent` is one status change of one board. Unsynchronised.
class KVLOAM_API BoardStatusEvent : public Event {
  public:
    BoardStatusEvent();
    BoardStatusEvent(BoardStatusEnum status, ReferenceCounter<Board>&& board);
    ~BoardStatusEvent() override;

    virtual BoardStatusEnum GetBoardStatus();
    virtual ReferenceCounter<Board> GetBoard();
    virtual void SetBoardStatus(BoardStatusEnum status);
    virtual void SetBoard(ReferenceCounter<Board> board);

  private:
    BoardStatusEnum m_status = BoardStatusNone;
    ReferenceCounter<Board> m_board;
};

/// A `BoardStatusListener` receives board status changes, on the thread that notifies: the board
/// platform's delivery thread or a factory's ping thread. All listeners of a notification receive
/// the same event object.
class KVLOAM_API BoardStatusListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) = 0;

  protected:
    ~BoardStatusListener() = default;
};

namespace KVL {

/// Creates one event and passes it to every board status listener of `listeners`, in order. `guard`
/// as in `for_each_listener`.
void notify_board_status(ListenerTable& listeners, Object* guard, ReferenceCounter<Board>&& board,
                         BoardStatusEnum status);

/// Passes `event` to every board status listener of `listeners`.
void deliver_board_status(ListenerTable& listeners, Object* guard,
                          ReferenceCounter<BoardStatusEvent> const& event);

} // namespace KVL
