// SPDX-License-Identifier: BSD-2-Clause
// What a DS1 line may say about its impedance.
#pragma once

#include "platform/Export.h"

/// A `DS1LineImpedance` is a DS1 line that knows its impedance. A class derived from
/// `DS1LineDevice` may derive from this class too; agents find it by a dynamic cast of the line. It
/// has no interface identifier and no reference count of its own.
class KVLOAM_API DS1LineImpedance {
  public:
    /// DS1-MIB's dsx1LineImpedance (RFC 4805): 1 not applicable, 2 unbalanced 75 ohms, 3 balanced
    /// 100 ohms, 4 balanced 120 ohms. Thread-safe.
    virtual int GetLineImpedance() = 0;

  protected:
    DS1LineImpedance() = default;
    DS1LineImpedance(DS1LineImpedance const&) = default;
    DS1LineImpedance& operator=(DS1LineImpedance const&) = default;
    ~DS1LineImpedance() = default;
};
