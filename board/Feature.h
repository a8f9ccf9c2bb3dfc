// SPDX-License-Identifier: BSD-2-Clause
// The named root of all board features.
#pragma once

#include "core/Object.h"

KVLOAM_API int min(int a, int b);
KVLOAM_API int max(int a, int b);

/// One capability of a board: a set of lines, a pool of resources, an Ethernet port. Found on its
/// board by interface identifier.
class KVLOAM_API Feature : public Object {
  public:
    /// The longest name that is kept whole.
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
