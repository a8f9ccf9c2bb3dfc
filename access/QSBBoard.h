// SPDX-License-Identifier: BSD-2-Clause
// One board's record in the platform's attribute store.
#pragma once

#include <memory>
#include <string>

#include "access/QSBAccessor.h"

/// A `QSBBoard` is a board's record, found by serial number. Every getter reads its field anew. A
/// text that cannot be read is "Error", a number -1. While the board is not in the store, every
/// getter searches for it again.
///
/// Thread-bound, like `QSBAccessor`.
class KVLOAM_API QSBBoard {
  public:
    explicit QSBBoard(std::string const& serialNumber);
    ~QSBBoard();
    QSBBoard(QSBBoard const&) = delete;
    QSBBoard& operator=(QSBBoard const&) = delete;

    /// Reads anew which boards the store has, and searches for this one.
    void UpdateInstanceID();

    std::string SerialNumber();
    std::string Model();
    std::string Version();
    std::string FirmwareVersion();
    std::string FirmwareName();
    std::string FunctionalDescription();
    std::string DeviceChangeDate();
    int Type();
    int SharedMemoryBaseAddress();
    int IOBaseAddress();
    int IRQ();
    int BoardID();
    int PCISlotNumber();

  private:
    bool read(int offset, int length, void* buffer);
    std::string text(int offset);
    int number(int offset);

    std::string m_serialNumber;
    int m_instanceID = -1;
    std::unique_ptr<QSBAccessor> m_accessor;
};
