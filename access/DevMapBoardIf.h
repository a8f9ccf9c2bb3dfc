// SPDX-License-Identifier: BSD-2-Clause
// A board as the device mapper knows it.
#pragma once

#include <ctime>

#include <string>
#include <vector>

#include "access/DeviceMapperIf.h"

/// A snapshot of one board's attributes, read in one request when it is made, and a few attributes
/// that are read live at each call. A text that is missing is "unknown", a number -1.
///
/// The snapshot does not change, so several threads may read one record.
class KVLOAM_API DevMapBoardIf {
  public:
    /// `auid`: the board's handle in the device mapper. A handle of no board makes a record in
    /// which everything is missing.
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
    /// Deliberate: 0 where the platform answers with less than two bytes.
    long SharedMemoryBaseAddress() const { return m_sharedMemoryBaseAddress; }
    long IOBaseAddress() const { return m_ioBaseAddress; }
    long IRQ() const { return m_irq; }
    long BoardID() const { return m_boardID; }
    long ShelfID() const { return m_shelfID; }
    long VORNDriverBoardID() const { return m_vornDriverBoardID; }
    long ChassisSlot() const { return m_chassisSlot; }

    /// Live. -1 when there is none.
    long LogicalID();
    /// Live. -1 when there is none.
    long BoardCondition();
    /// Live. -1 when there is none.
    long BoardPresent();
    /// Live. Seconds since the epoch; 0 when there is none, it is no date, or `time_t` cannot
    /// hold it.
    time_t StateChangeDate();

    /// The board's devices of one type, at most `kDMSearchCapacity`.
    std::vector<long> ListDevicesByType(int type);
    /// The board's devices of all types, type by type.
    std::vector<long> ListAllDevices();
    std::vector<long> ListProcessors();

  private:
    DeviceMapperClient& client() const { return *m_dmIf->GetDMClient(); }
    long readInPlace(char const* name);

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
