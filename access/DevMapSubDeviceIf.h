// SPDX-License-Identifier: BSD-2-Clause
// A sub-device of a device as the device mapper knows it.
#pragma once

#include <string>

#include "access/DeviceMapperIf.h"

/// A snapshot of one sub-device's attributes (a time slot, a channel), read in one request.
class KVLOAM_API DevMapSubDeviceIf {
  public:
    /// The sub-device of that name; the name is only read. An unknown name makes a record in which
    /// everything is missing.
    explicit DevMapSubDeviceIf(char* name);
    explicit DevMapSubDeviceIf(long auid);

    /// Reads the attributes anew.
    void PopulateAttributes();

    /// Empty when it is missing.
    std::string Name() const { return m_name; }
    long Auid() const { return m_auid; }
    /// -1 when it is missing.
    long DeviceType() const { return m_deviceType; }
    /// 0 when it is missing.
    long GetOutVariant() const { return m_outVariant; }
    /// -1 when it is missing.
    long FrontEndType() const { return m_frontEndType; }

    /// Each copies its descriptor and returns true; without one, leaves `address` alone and returns
    /// false.
    bool TSCAddress(QCompDesc& address) const;
    bool ClusterAddress(QCompDesc& address) const;
    bool CTBusAddress(QCompDesc& address) const;
    bool IPVSCAddress(QCompDesc& address) const;

  private:
    long m_auid = -1;
    DeviceMapperIf* m_dmIf;
    std::string m_name;
    long m_deviceType = -1;
    QCompDesc m_tscAddress{};
    long m_outVariant = 0;
    bool m_hasTSCAddress = false;
    QCompDesc m_ipvscAddress{};
    bool m_hasIPVSCAddress = false;
    QCompDesc m_clusterAddress{};
    bool m_hasClusterAddress = false;
    QCompDesc m_ctBusAddress{};
    bool m_hasCTBusAddress = false;
    long m_frontEndType = -1;
};
