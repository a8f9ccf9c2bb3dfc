// SPDX-License-Identifier: BSD-2-Clause
// A device of a board as the device mapper knows it.
#pragma once

#include <string>
#include <vector>

#include "access/DeviceMapperIf.h"

/// A snapshot of one device's attributes, read in one request, and its sub-devices.
class KVLOAM_API DevMapDeviceIf {
  public:
    /// The device of that name; the name is only read. An unknown name makes a record in which
    /// everything is missing.
    explicit DevMapDeviceIf(char* name);
    explicit DevMapDeviceIf(long auid);

    /// Reads the attributes anew.
    void PopulateAttributes();

    /// Empty when it is missing.
    std::string Name() const { return m_name; }
    long Auid() const { return m_auid; }
    /// -1 when it is missing.
    long DeviceType() const { return m_deviceType; }
    /// -1 when it is missing.
    long ChannelCount() const { return m_channelCount; }
    /// Copies the line administration address and returns true; without one, leaves `address` alone
    /// and returns false.
    bool LineAdminAddress(QCompDesc& address) const;
    /// Live. The protocol of channel group `index`; 0 when there is none.
    int ProtocolType(int index);

    /// At most `kDMSearchCapacity`.
    std::vector<long> ListSubDevicesByType(int type);
    /// Those of all types, type by type.
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
