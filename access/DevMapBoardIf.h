// SPDX-License-Identifier: BSD-2-Clause
// A board as the device mapper knows it.
#pragma once

#include <ctime>

#include <string>
#include <vector>

#include "access/DeviceMapperIf.h"

/// A `DevMapBoardIf` is a snapshot of one board's attributes, read in one request when it is made.
/// A few more attributes are read live at each call. A missing text is "unknown", a missing number
/// -1.
///
/// Thread-safe: the snapshot does not change.
class KVLOAM_API DevMapBoardIf {
  public:
    /// `auid`: the board's handle in the device mapper. If it is no board's, everything in the
    /// record is missing.
    explicit DevMapBoardIf(long auid);

    std::string SerialNumber() const { return m_serialNumber; }
    std::string Name() const { return m_name; }
    std::string FirmwareName() const { return m_firmwareName; }
    std::string FirmwareName1() const { return m_firmwareName1; }
    std::string Description() const { return m_description; }
    std::string Family() const { return m_family; }
    std::string FirmwareVersion() const { return m_firmwareVersion; }
    long PciSlotNumber() const { return m_pciSlotNumber; }
    long PciBusNumber() const { return m_pciBusNumber; }
    /// Deliberate: 0 if the platform answers with less than two bytes.
    long SharedMemoryBaseAddress() const { return m_sharedMemoryBaseAddress; }
    long IOBaseAddress() const { return m_ioBaseAddress; }
    long IRQ() const { return m_irq; }
    long BoardID() const { return m_boardID; }
    long ShelfID() const { return m_shelfID; }
    long VORNDriverBoardID() const { return m_vornDriverBoardID; }
    long ChassisSlot() const { return m_chassisSlot; }

    /// Live; -1 if it is missing.
    long LogicalID();
    /// Live; -1 if it is missing.
    long BoardCondition();
    /// Live; -1 if it is missing.
    long BoardPresent();
    /// Live. Seconds since the epoch; 0 if it is missing, is not a date, or does not fit `time_t`.
    time_t StateChangeDate();

    /// The board's devices of one type, at most `kDMSearchCapacity`.
    std::vector<long> ListDevicesByType(int type);
    /// The board's devices of all types, type by type.
    std::vector<long> ListAllDevices();
    std::vector<long> ListProcessors();

  private:
    DeviceMapperClient& client() const { return *m_dmIf->GetDMClient(); }
    long readLive(char const* name);

    long m_auid;
    DeviceMapperIf* m_dmIf;
    std::string m_serialNumber;
    long m_pciSlotNumber = -1;
    long m_pciBusNumber = -1;
    long m_shelfID = -1;
    long m_sharedMemoryBaseAddress = -1;
    long m_ioBaseAddress = -1;
    long m_irq = -1;
    long m_chassisSlot = -1;
    std::string m_firmwareName;
    std::string m_firmwareName1;
    std::string m_description;
    std::string m_name;
    long m_vornDriverBoardID = -1;
    std::string m_family;
    long m_boardID = -1;
    std::string m_firmwareVersion;
};
