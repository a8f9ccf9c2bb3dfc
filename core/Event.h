// SPDX-License-Identifier: BSD-2-Clause
// The roots of events and of those who listen to them.
#pragma once

#include "core/Object.h"

/// Root of the objects that notifications carry. Not lockable unless made so.
class KVLOAM_API Event : public Object {
  public:
    explicit Event(bool lockable = false) : Object(lockable) {}
    ~Event() override;
};

/// Root of the listener interfaces. Never deleted through.
class EventListener {
  protected:
    ~EventListener() = default;
};
