// SPDX-License-Identifier: BSD-2-Clause
// The record of a system service, and service listeners.
#pragma once

#include <string>

#include "core/Event.h"
#include "core/ListenerTable.h"
#include "core/ReferenceCounter.h"

/// A `Service` is the record of a system service. The getters that take a `char*` copy the whole
/// text with its terminator, without a length limit; the caller's buffer must be large enough.
/// Thread-safe.
class KVLOAM_API Service : public Object {
  public:
    /// `name` is also the service control's name of the service. Status and change date are 0.
    explicit Service(std::string name);
    ~Service() override;

    /// The time of the last status change, in seconds since the epoch.
    long GetServiceChangeDate();
    /// Sets the time of the last status change to now.
    void SetServiceChangeDate();
    void GetServiceName(char* name);
    /// The host's service control's name of the service.
    void GetServiceScmName(char* name);
    /// Does not change the service control's name.
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

/// A `ServiceStatusEvent` announces a change of a service's status.
class KVLOAM_API ServiceStatusEvent : public Event {
  public:
    ServiceStatusEvent();
    ~ServiceStatusEvent() override;
};

/// A `ServiceStatusListener` receives changes of service statuses, on the thread that notifies.
class KVLOAM_API ServiceStatusListener : public EventListener {
  public:
    /// The result is ignored.
    virtual int ProcessServiceStatusEvent(ReferenceCounter<ServiceStatusEvent> event) = 0;

  protected:
    ~ServiceStatusListener() = default;
};
