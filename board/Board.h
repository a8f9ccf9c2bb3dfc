// SPDX-License-Identifier: BSD-2-Clause
// The abstract board, and the status changes it tells.
#pragma once

#include <vector>

#include "board/Feature.h"
#include "core/Event.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// The state of a board, and what is announced of it.
enum BoardStatusEnum : int {
    BoardStatusNone = 0,
    BoardStatusStarted = 3,
    BoardStatusStopped = 4,
    BoardStatusAdded = 9,    ///< announced of a newly found board
    BoardStatusRemoved = 10, ///< announced of a board that has gone
    BoardStatusStartPending = 13,
    BoardStatusStopPending = 14,
    BoardStatusFailed = 15 ///< a secondary status
};

class BoardStatusListener;

/// A telephony board: its descriptive queries, its features, and its status listeners.
///
/// All operations may be called from any thread. The features and listeners are changed and walked
/// under the board's own lock, which is never held during a callback; whoever needs several steps
/// in one piece holds `lock()` around them.
///
/// Queries that take a `char*` write a terminated text without a length limit (a device mapper text
/// is at most 128 bytes with its terminator; 256 bytes serve every query) and return 0. A number
/// that is not known is -1.
class KVLOAM_API Board : public Object {
  public:
    Board();
    ~Board() override;

    virtual BoardStatusEnum GetStatus() = 0;
    /// `BoardStatusFailed` while the board has failed, else `BoardStatusNone`.
    virtual BoardStatusEnum GetSecondaryStatus() = 0;
    virtual int GetName(char* name) = 0;
    virtual int GetModel(char* model) = 0;
    virtual int GetFamily(char* family) = 0;
    virtual int GetFirmwareName(char* name) = 0;
    virtual int GetFirmwareVersion(char* version) = 0;
    virtual int GetSerialNumber(char* serialNumber) = 0;
    virtual int GetLogicalID() = 0;
    virtual int GetErrorMessage(char* message) = 0;
    /// When the board's state changed last: seconds since the epoch; 0 when it is not known.
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
    /// Hands one event of `board` and `status` to every listener, on the caller's thread. Returns
    /// 0.
    virtual int NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status);

    int GetFeatureListSize();
    /// Appends `feature`; duplicates are kept. Returns 1.
    int AddFeature(ReferenceCounter<Feature> feature);
    /// Removes the first entry of the same feature. Returns 1, or 0 when there is none.
    int RemoveFeature(ReferenceCounter<Feature> feature);
    /// The first feature that answers to `iid`, its own or an inherited one; else an empty handle.
    ReferenceCounter<Feature> GetFirstFeature(KVL::IID iid);
    /// The next such feature after `previous`; an empty handle when there is none, or when
    /// `previous` is not among the features.
    ReferenceCounter<Feature> GetNextFeature(ReferenceCounter<Feature> previous, KVL::IID iid);

  private:
    std::vector<ReferenceCounter<Feature>> m_features;
    ListenerTable m_listeners;
};

/// One status change of one board.
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

/// Told of board status changes. Called on the thread that notifies, which is the board platform's
/// delivery thread or a factory's ping thread. All listeners of a notification see one event
/// object.
class KVLOAM_API BoardStatusListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) = 0;

  protected:
    ~BoardStatusListener() = default;
};

namespace KVL {

/// Makes the one event of a notification and hands it to every board status listener of
/// `listeners`, in order. `guard` as in `for_each_listener`.
void notify_board_status(ListenerTable& listeners, Object* guard, ReferenceCounter<Board>&& board,
                         BoardStatusEnum status);

/// Hands `event` on to every board status listener of `listeners`.
void deliver_board_status(ListenerTable& listeners, Object* guard,
                          ReferenceCounter<BoardStatusEvent> const& event);

} // namespace KVL
