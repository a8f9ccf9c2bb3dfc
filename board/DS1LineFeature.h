// SPDX-License-Identifier: BSD-2-Clause
// The abstract set of a board's DS1 lines.
#pragma once

#include "board/DS1LineDevice.h"
#include "board/InterfaceFeature.h"
#include "core/Event.h"

/// A `DS1LineStatusEvent` is a change of one line's status.
class KVLOAM_API DS1LineStatusEvent : public Event {
  public:
    DS1LineStatusEvent(DS1LineStatusEnum status, ReferenceCounter<DS1LineDevice> line);
    ~DS1LineStatusEvent() override;

    /// The line's status bits after the change.
    virtual DS1LineStatusEnum GetLineStatus();
    virtual ReferenceCounter<DS1LineDevice> GetLine();

  private:
    DS1LineStatusEnum m_status;
    ReferenceCounter<DS1LineDevice> m_line;
};

/// A `DS1LineStatusListener` receives line status changes from features that deliver them, on the
/// thread that notifies. All listeners of a notification receive the same event object.
class KVLOAM_API DS1LineStatusListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) = 0;

  protected:
    ~DS1LineStatusListener() = default;
};

/// A `DS1LineFeature` holds a board's DS1 lines. The concrete feature says which threads may walk
/// them.
class KVLOAM_API DS1LineFeature : public KVL::InterfaceFeature {
  public:
    DS1LineFeature();
    ~DS1LineFeature() override;

    /// The lines as interfaces, in the order of `GetFirstDevice` and `GetNextDevice`.
    ReferenceCounter<KVL::Interface> GetFirstInterface() override;
    ReferenceCounter<KVL::Interface>
    GetNextInterface(ReferenceCounter<KVL::Interface> previous) override;

    /// The listener is not owned.
    virtual int AddLineStatusListener(DS1LineStatusListener* listener) = 0;
    virtual ReferenceCounter<DS1LineDevice> GetFirstDevice() = 0;
    virtual ReferenceCounter<DS1LineDevice>
    GetNextDevice(ReferenceCounter<DS1LineDevice> previous) = 0;
    /// The first line with this name, or an empty handle.
    virtual ReferenceCounter<DS1LineDevice> Find(char const* name);

    static KVL::IID iid() { return KVL::IID("14DS1LineFeature"); }
};
