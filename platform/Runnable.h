// SPDX-License-Identifier: BSD-2-Clause
// The body of a thread.
#pragma once

#include "platform/Export.h"

class KVLOAM_API Runnable {
  public:
    virtual void Run() = 0;

  protected:
    ~Runnable() = default;
};
