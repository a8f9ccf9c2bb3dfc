// SPDX-License-Identifier: BSD-2-Clause
// The objects that the action scheduler calls back.
#pragma once

#include "platform/Export.h"

/// A `Schedulable` is an object that the action scheduler calls back. The scheduler does not own
/// it.
class KVLOAM_API Schedulable {
  public:
    /// Called on the scheduler's thread when the object is due. The scheduler's list is locked
    /// meanwhile, so this must neither call the scheduler nor drop a handle whose object might. The
    /// result is ignored.
    virtual int ScheduledAction() = 0;

  protected:
    ~Schedulable() = default;
};
