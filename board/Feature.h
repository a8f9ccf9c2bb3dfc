// SPDX-License-Identifier: BSD-2-Clause
// The root class of board features.
#pragma once

#include "core/Object.h"

KVLOAM_API int min(int a, int b);
KVLOAM_API int max(int a, int b);

/// A `Feature` is one capability of a board: a set of lines, a pool of resources, an Ethernet port.
/// A board's features are found by interface identifier. The name is unsynchronised: set it before
/// other threads see the feature.
class KVLOAM_API Feature : public Object {
  public:
    /// The longest name that is not cut.
    static constexpr int kMaxNameLength = 256;

    Feature();
    ~Feature() override;

    /// Copies `name`, cut to `kMaxNameLength` characters. Returns 1.
    int SetFeatureName(char const* name);
    /// The name, owned by the feature; empty until one is set.
    char* GetFeatureName() { return m_name; }

  private:
    char m_name[kMaxNameLength + 1];
};
