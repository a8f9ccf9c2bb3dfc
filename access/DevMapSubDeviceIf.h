// SPDX-License-Identifier: BSD-2-Clause
// A sub-device of a device as the device mapper knows it.
#pragma once

#include <string>

#include "access/DeviceMapperIf.h"

/// A `DevMapSubDeviceIf` is a snapshot of the attributes of one sub-device (a time slot, a
/// channel), read in one request.
///
/// Several threads may read one record while none calls `PopulateAttributes()`.
class KVLOAM_API DevMapSubDeviceIf {
  public:
    /// The sub-device with this name, which is only read. If there is none, everything in the
    /// record is missing.
    explicit DevMapSubDeviceIf(char* name);
    explicit DevMapSubDeviceIf(long auid);

    /// Reads the attributes anew. Deliberate: a name that is missing now stays as it was, while
    /// other missing attributes read as missing.
    void PopulateAttributes();

    /// Empty if no reading found one.
    std::string Name() const { return m_name; }
    long Auid() const { return m_auid; }
    /// -1 if it is missing.
    long DeviceType() const { return m_deviceType; }
    /// 0 if it is missing.
    long GetOutVariant() const { return m_outVariant; }
    /// -1 if it is missing.
    long FrontEndType() const { return m_frontEndType; }

    /// Each copies its descriptor and returns true. If there is none, it leaves `address` alone and
    /// returns false.
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
