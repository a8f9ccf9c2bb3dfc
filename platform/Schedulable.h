// SPDX-License-Identifier: BSD-2-Clause
// What the action scheduler calls back.
#pragma once

#include "platform/Export.h"

class KVLOAM_API Schedulable {
  public:
    /// Called on the scheduler's thread when the object's time has come, with the scheduler's list
    /// locked: it must not call the scheduler, nor drop what might. The result is ignored.
    virtual int ScheduledAction() = 0;

  protected:
    ~Schedulable() = default;
};
