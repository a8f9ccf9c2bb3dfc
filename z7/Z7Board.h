// SPDX-License-Identifier: BSD-2-Clause
// The common base of Z7 boards.
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>

#include "access/DevMapBoardIf.h"
#include "board/Board.h"

/// A `Z7Board` is a board that the device mapper knows. It answers the hardware queries from its
/// device mapper record, and turns status values into state changes and notifications. Concrete
/// boards add the remaining queries and the work of starting, stopping and pinging.
///
/// The queries are thread-safe, also while the board starts or stops, and none waits for the
/// platform. `ProcessExternalEvent` takes no lock: a concrete board whose `PingBoard` changes the
/// status must itself keep the ping thread and the delivery thread apart.
class KVLOAM_API Z7Board : public Board {
  public:
    /// `id`: the board's handle in the device mapper.
    explicit Z7Board(long id);
    ~Z7Board() override;

    int GetSerialNumber(char* serialNumber) override;
    int GetErrorMessage(char* message) override;
    long GetDeviceChangeDate() override;
    int GetFunctionalDescription(char* description) override;
    long GetSharedMemoryBaseAddress() override;
    long GetIOBaseAddress() override;
    int GetIRQ() override;
    int GetPCISlotNumber() override;
    int GetBusNumber() override;
    /// Adds `listener` and at once passes it an event of the board's present status, on the
    /// caller's thread. Returns -1.
    int AddBoardStatusListener(BoardStatusListener* listener) override;

    /// Changes the board to `status`: 3 starts it, 4 stops it, 15 stops it and marks it as failed,
    /// 13 and 14 are recorded, any other value is ignored. A repeated status does not repeat the
    /// work, but 3 always reads the device mapper record anew. Returns -1.
    virtual int ProcessExternalEvent(BoardStatusEnum status);

    /// Called on the factory's ping thread, once per interval.
    virtual int PingBoard() = 0;
    virtual int SetStatus(BoardStatusEnum status) = 0;
    virtual int SetSecondaryStatus(BoardStatusEnum status) = 0;
    /// The stages are called one after the other when the board starts.
    virtual int StartStage1() = 0;
    virtual int StartStage2() = 0;
    virtual int StartStage3() = 0;
    /// Called when the board stops.
    virtual int StopBoard() = 0;
    /// These three do nothing here and return 0.
    virtual int create_ipethernet_feature();
    virtual int create_extended_features();
    virtual int destroy_extended_features();

    int GetChassisSlotNumber();
    /// The board's handle in the device mapper.
    long GetBoardIdentifier() const { return m_boardIdentifier; }
    /// 13 or 14 if that was the last status delivered, otherwise 0.
    BoardStatusEnum GetLastCondition();

  protected:
    /// The present device mapper record, a snapshot that does not change, even if the board starts
    /// anew meanwhile.
    std::shared_ptr<DevMapBoardIf const> record();
    void SetErrorMessage(std::string message);
    void SetDeviceChangeDate(long date);

  private:
    void start(BoardStatusEnum status, BoardStatusEnum secondary, long now);
    void stop(BoardStatusEnum status, long now);
    void fail(BoardStatusEnum status, BoardStatusEnum secondary, long now);
    void setLastCondition(BoardStatusEnum condition);
    void tell(BoardStatusEnum status);

    long m_boardIdentifier;
    std::shared_ptr<DevMapBoardIf const> m_record;
    std::string m_serialNumber; ///< never changes
    std::string m_errorMessage;
    std::atomic<long> m_deviceChangeDate{0};
    std::atomic<BoardStatusEnum> m_lastCondition{BoardStatusNone};
    /// Guards the record's pointer and the error message. Never held during a callback or a
    /// platform request.
    std::mutex m_mutex;
};
