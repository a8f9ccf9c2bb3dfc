// SPDX-License-Identifier: BSD-2-Clause
// A processor of a board as the device mapper knows it.
#pragma once

#include <string>

#include "access/DeviceMapperIf.h"

/// A `DevMapProcessorIf` is a snapshot of one processor's attributes, read in one request.
///
/// Several threads may read one record while none calls `PopulateAttributes()`.
class KVLOAM_API DevMapProcessorIf {
  public:
    explicit DevMapProcessorIf(long auid);

    /// Reads the attributes anew. Deliberate: a name that is missing now stays as it was, while
    /// other missing attributes read as missing.
    void PopulateAttributes();

    /// Empty if no reading found one.
    std::string Name() const { return m_name; }
    long Auid() const { return m_auid; }
    /// -1 if it is missing.
    long ProcessorNumber() const { return m_processorNumber; }
    /// These four are "unknown" if missing.
    std::string BootKernelVersion() const { return m_bootKernelVersion; }
    std::string BootKernelFilename() const { return m_bootKernelFilename; }
    std::string RealTimeKernelVersion() const { return m_realTimeKernelVersion; }
    std::string RealTimeKernelFilename() const { return m_realTimeKernelFilename; }

  private:
    long m_auid;
    DeviceMapperIf* m_dmIf;
    std::string m_name;
    long m_processorNumber = -1;
    std::string m_bootKernelVersion;
    std::string m_bootKernelFilename;
    std::string m_realTimeKernelVersion;
    std::string m_realTimeKernelFilename;
};
