// SPDX-License-Identifier: BSD-2-Clause
// The record of a loaded module.
#pragma once

#include <string>

#include "core/Object.h"

/// A `Module` is the record of a loaded module. The getters that take a `char*` copy the whole text
/// with its terminator, without a length limit; the caller's buffer must be large enough.
/// Thread-safe.
class KVLOAM_API Module : public Object {
  public:
    /// Version "0.0", purpose "Unknown", dated now.
    explicit Module(std::string name);
    ~Module() override;

    /// The time at which the module was loaded, in seconds since the epoch.
    long GetModuleDate();
    void SetModuleDate(long date);
    void GetModuleName(char* name);
    void GetModulePurpose(char* purpose);
    void GetModuleVersion(char* version);
    void SetModuleName(char* name);
    void SetModulePurpose(char* purpose);
    void SetModuleVersion(char* version);

  private:
    long m_date;
    std::string m_name;
    std::string m_purpose = "Unknown";
    std::string m_version = "0.0";
};
