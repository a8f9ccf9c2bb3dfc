// SPDX-License-Identifier: BSD-2-Clause
// A device of a board as the device mapper knows it.
#pragma once

#include <string>
#include <vector>

#include "access/DeviceMapperIf.h"

/// A `DevMapDeviceIf` is a snapshot of one device's attributes, read in one request. It also lists
/// the device's sub-devices.
///
/// Several threads may read one record while none calls `PopulateAttributes()`.
class KVLOAM_API DevMapDeviceIf {
  public:
    /// The device with this name, which is only read. If there is none, everything in the record is
    /// missing.
    explicit DevMapDeviceIf(char* name);
    explicit DevMapDeviceIf(long auid);

    /// Reads the attributes anew. Deliberate: a name that is missing now stays as it was, while
    /// other missing attributes read as missing.
    void PopulateAttributes();

    /// Empty if no reading found one.
    std::string Name() const { return m_name; }
    long Auid() const { return m_auid; }
    /// -1 if it is missing.
    long DeviceType() const { return m_deviceType; }
    /// -1 if it is missing.
    long ChannelCount() const { return m_channelCount; }
    /// Copies the line administration address and returns true. If there is none, leaves `address`
    /// alone and returns false.
    bool LineAdminAddress(QCompDesc& address) const;
    /// Live. The protocol of channel group `index`; 0 if it is missing.
    int ProtocolType(int index);

    /// At most `kDMSearchCapacity`.
    std::vector<long> ListSubDevicesByType(int type);
    /// The sub-devices of all types, type by type.
    std::vector<long> ListAllSubDevices();
    /// The names of all sub-devices; those without a name are left out.
    std::vector<std::string> ListAllSubDeviceNames();
    std::vector<std::string> ListSubDeviceNamesByType(int type);

  private:
    std::vector<std::string> namesOf(std::vector<long> const& auids);

    long m_auid = -1;
    DeviceMapperIf* m_dmIf;
    std::string m_name;
    long m_deviceType = -1;
    long m_channelCount = -1;
    QCompDesc m_lineAdminAddress{};
    bool m_hasLineAdminAddress = false;
};
