// SPDX-License-Identifier: BSD-2-Clause
// A card of the rack as a board.
#pragma once

#include <atomic>
#include <memory>
#include <string>

#include "Rack.h"
#include "kvloam.h"

/// A card of the rack. Every query is thread-safe and answers from memory. `start` and `stop` are
/// thread-bound (the factory's thread).
class RackBoard final : public Board {
  public:
    explicit RackBoard(std::string const& serialNumber);
    ~RackBoard() override;

    BoardStatusEnum GetStatus() override { return m_status; }
    BoardStatusEnum GetSecondaryStatus() override { return BoardStatusNone; }
    int GetName(char* name) override;
    int GetModel(char* model) override;
    int GetFamily(char* family) override;
    int GetFirmwareName(char* name) override;
    int GetFirmwareVersion(char* version) override;
    int GetSerialNumber(char* serialNumber) override;
    int GetLogicalID() override { return -1; }
    int GetErrorMessage(char* message) override;
    long GetDeviceChangeDate() override { return m_changed; }
    int GetFunctionalDescription(char* description) override;
    int GetBoardID() override { return -1; }
    long GetSharedMemoryBaseAddress() override { return -1; }
    long GetIOBaseAddress() override { return -1; }
    int GetIRQ() override { return -1; }
    int GetShelfID() override { return -1; }
    int GetPCISlotNumber() override { return -1; }
    int GetBusNumber() override { return -1; }

    /// Stores a reading for the line and the channels.
    void update(CardReading const& reading);
    /// Adds the line and the channels.
    void start();
    /// Removes the line and the channels.
    void stop();

  private:
    std::shared_ptr<Card> const m_card;
    std::atomic<BoardStatusEnum> m_status{BoardStatusStopped};
    std::atomic<long> m_changed{0};
    ReferenceCounter<Feature> m_lines;
    ReferenceCounter<Feature> m_channels;
};
