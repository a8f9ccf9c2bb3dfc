// SPDX-License-Identifier: BSD-2-Clause
// The root classes of events and of their listeners.
#pragma once

#include "core/Object.h"

/// An `Event` is the object that a notification carries; concrete events derive from it. Without a
/// lock unless `lockable` asks for one. Unsynchronised.
class KVLOAM_API Event : public Object {
  public:
    explicit Event(bool lockable = false) : Object(lockable) {}
    ~Event() override;
};

/// An `EventListener` is the empty base of the listener interfaces, so that one kind of table holds
/// them all. Nothing is deleted through it.
class EventListener {
  protected:
    ~EventListener() = default;
};
