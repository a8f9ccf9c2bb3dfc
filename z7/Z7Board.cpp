// SPDX-License-Identifier: BSD-2-Clause
#include "z7/Z7Board.h"

#include <cstring>
#include <ctime>

namespace {

std::shared_ptr<DevMapBoardIf> readRecord(long id) {
    return std::make_shared<DevMapBoardIf>(id);
}

/// Copies `text` with its terminator. The caller's buffer must be large enough.
int copyText(std::string const& text, char* buffer) {
    std::memcpy(buffer, text.c_str(), text.size() + 1);
    return 0;
}

} // namespace

Z7Board::Z7Board(long id) : m_boardIdentifier(id) {
    auto const record = readRecord(id);
    m_serialNumber = record->SerialNumber();
    m_deviceChangeDate = record->StateChangeDate();
    m_record = record;
}

Z7Board::~Z7Board() = default;

std::shared_ptr<DevMapBoardIf const> Z7Board::record() {
    std::scoped_lock const guard(m_mutex);
    return m_record;
}

int Z7Board::GetSerialNumber(char* serialNumber) {
    return copyText(m_serialNumber, serialNumber);
}

int Z7Board::GetErrorMessage(char* message) {
    std::scoped_lock const guard(m_mutex);
    return copyText(m_errorMessage, message);
}

long Z7Board::GetDeviceChangeDate() {
    return m_deviceChangeDate;
}

int Z7Board::GetFunctionalDescription(char* description) {
    return copyText(record()->Description(), description);
}

long Z7Board::GetSharedMemoryBaseAddress() {
    return record()->SharedMemoryBaseAddress();
}

long Z7Board::GetIOBaseAddress() {
    return record()->IOBaseAddress();
}

int Z7Board::GetIRQ() {
    return static_cast<int>(record()->IRQ());
}

int Z7Board::GetPCISlotNumber() {
    return static_cast<int>(record()->PciSlotNumber());
}

int Z7Board::GetBusNumber() {
    return static_cast<int>(record()->PciBusNumber());
}

int Z7Board::GetChassisSlotNumber() {
    return static_cast<int>(record()->ChassisSlot());
}

BoardStatusEnum Z7Board::GetLastCondition() {
    return m_lastCondition;
}

void Z7Board::SetErrorMessage(std::string message) {
    std::scoped_lock const guard(m_mutex);
    m_errorMessage.swap(message);
}

void Z7Board::SetDeviceChangeDate(long date) {
    m_deviceChangeDate.store(date, std::memory_order_relaxed);
}

void Z7Board::setLastCondition(BoardStatusEnum condition) {
    m_lastCondition.store(condition, std::memory_order_relaxed);
}

int Z7Board::AddBoardStatusListener(BoardStatusListener* listener) {
    Board::AddBoardStatusListener(listener);
    listener->ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent>(
        new BoardStatusEvent(GetStatus(), ReferenceCounter<Board>(this))));
    return -1;
}

int Z7Board::create_ipethernet_feature() {
    return 0;
}

int Z7Board::create_extended_features() {
    return 0;
}

int Z7Board::destroy_extended_features() {
    return 0;
}

int Z7Board::ProcessExternalEvent(BoardStatusEnum status) {
    long const now = std::time(nullptr);
    BoardStatusEnum const current = GetStatus();
    BoardStatusEnum const secondary = GetSecondaryStatus();
    switch (status) {
    case BoardStatusStarted:
        start(current, secondary, now);
        break;
    case BoardStatusStopped:
        stop(current, now);
        break;
    case BoardStatusStartPending:
    case BoardStatusStopPending:
        setLastCondition(status);
        break;
    case BoardStatusFailed:
        fail(current, secondary, now);
        break;
    default:
        break;
    }
    // Asked after the change: concrete boards rely on it.
    GetStatus();
    return -1;
}

void Z7Board::start(BoardStatusEnum status, BoardStatusEnum secondary, long now) {
    // The new record is complete before readers see it. The last reader of the old one drops it.
    std::shared_ptr<DevMapBoardIf const> record = readRecord(m_boardIdentifier);
    {
        std::scoped_lock const guard(m_mutex);
        m_record.swap(record);
    }
    if (status != BoardStatusStarted) {
        StartStage1();
        StartStage2();
        StartStage3();
        create_extended_features();
        create_ipethernet_feature();
        SetStatus(BoardStatusStarted);
        SetErrorMessage({});
        SetDeviceChangeDate(now);
    }
    if (GetSecondaryStatus() != BoardStatusNone) {
        SetSecondaryStatus(BoardStatusNone);
        SetDeviceChangeDate(now);
    }
    if (GetStatus() != status)
        tell(BoardStatusStarted);
    else if (BoardStatusEnum const changed = GetSecondaryStatus(); changed != secondary)
        tell(changed);
    setLastCondition(BoardStatusNone);
}

void Z7Board::stop(BoardStatusEnum status, long now) {
    if (status != BoardStatusStopped) {
        SetStatus(BoardStatusStopped);
        SetDeviceChangeDate(now);
        tell(BoardStatusStopped);
        StopBoard();
        destroy_extended_features();
    }
    setLastCondition(BoardStatusNone);
}

void Z7Board::fail(BoardStatusEnum status, BoardStatusEnum secondary, long now) {
    if (status != BoardStatusStopped) {
        SetStatus(BoardStatusStopped);
        SetDeviceChangeDate(now);
        StopBoard();
        destroy_extended_features();
    }
    if (secondary == BoardStatusFailed) {
        if (status != BoardStatusStopped) tell(BoardStatusStopped);
    } else {
        SetSecondaryStatus(BoardStatusFailed);
        SetDeviceChangeDate(now);
        tell(BoardStatusFailed);
    }
    setLastCondition(BoardStatusNone);
}

void Z7Board::tell(BoardStatusEnum status) {
    NotifyBoardStatusListeners(ReferenceCounter<Board>(this), status);
}
