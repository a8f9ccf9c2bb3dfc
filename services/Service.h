// SPDX-License-Identifier: BSD-2-Clause
// One system service, and those who listen to services.
#pragma once

#include <string>

#include "core/Event.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// A service's record. The getters that take a `char*` copy the whole text with its terminator,
/// without a length limit: the caller's buffer holds it. A record may be read and written by
/// several threads.
class KVLOAM_API Service : public Object {
  public:
    /// Known by `name` to the host's service control as well. Status and change date are 0.
    explicit Service(std::string name);
    ~Service() override;

    /// When the status changed last: seconds since the epoch.
    long GetServiceChangeDate();
    /// Dates the last change now.
    void SetServiceChangeDate();
    void GetServiceName(char* name);
    /// The name under which the host's service control knows the service.
    void GetServiceScmName(char* name);
    /// Leaves the service control's name as it is.
    void SetServiceName(char* name);
    void SetServiceScmName(char* name);
    int GetServiceStatus();
    void SetServiceStatus(int status);
    /// Deliberate: these two change nothing; the owner of the service sets its status.
    void SetStatusStarted();
    void SetStatusStopped();

  private:
    int m_status = 0;
    std::string m_name;
    std::string m_scmName;
    ListenerTable m_listeners;
    long m_changeDate = 0;
};

/// Tells of a service's status.
class KVLOAM_API ServiceStatusEvent : public Event {
  public:
    ServiceStatusEvent();
    ~ServiceStatusEvent() override;
};

class KVLOAM_API ServiceStatusListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessServiceStatusEvent(ReferenceCounter<ServiceStatusEvent> event) = 0;

  protected:
    ~ServiceStatusListener() = default;
};
