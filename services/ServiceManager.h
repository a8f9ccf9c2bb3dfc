// SPDX-License-Identifier: BSD-2-Clause
// The records of the system's modules and services.
#pragma once

#include <atomic>

#include "core/IndexedTable.h"
#include "services/Module.h"
#include "services/Service.h"

/// The `ServiceManager` keeps the records of modules and services, walked by index, and the status
/// of the board platform's own service. Indices start at 1; 0 ends a walk.
///
/// Thread-safe once the first `GetInstance()` has returned. Its lock is never held during a
/// callback.
class KVLOAM_API ServiceManager : public Object, public ServiceStatusListener {
  public:
    /// The longest name that `AddModule` does not cut.
    static constexpr int kMaxModuleNameLength = 230;

    /// The single instance, created by the first call and never destroyed.
    static ServiceManager* GetInstance();

    ~ServiceManager() override;
    /// These two do nothing here. A variant for another platform fills the tables in them.
    virtual void InitializeModules();
    virtual void InitializeServices();
    /// Enters the module of the library `<name>kvl` with the present time, version "5.2" and a
    /// purpose that names it. A name longer than `kMaxModuleNameLength` is cut.
    virtual void AddModule(char const* name);
    /// An empty handle if there is none.
    virtual ReferenceCounter<Module> GetFirstModule();
    virtual ReferenceCounter<Module> GetNextModule(int index);
    virtual ReferenceCounter<Module> GetNextModule(ReferenceCounter<Module> module);
    virtual ReferenceCounter<Module> GetModuleByIndex(int index);
    virtual int GetNumberOfModules();
    virtual int GetFirstModuleIndex();
    virtual int GetIndexByModule(ReferenceCounter<Module> module);
    virtual int GetNextModuleIndex(int index);
    virtual ReferenceCounter<Service> GetFirstService();
    virtual ReferenceCounter<Service> GetNextService(int index);
    virtual ReferenceCounter<Service> GetNextService(ReferenceCounter<Service> service);
    virtual ReferenceCounter<Service> GetServiceByIndex(int index);
    virtual int GetNumberOfServices();
    virtual int GetFirstServiceIndex();
    virtual int GetIndexByService(ReferenceCounter<Service> service);
    virtual int GetNextServiceIndex(int index);
    /// The board platform's service. The setters notify no listener.
    virtual long GetVelquorServiceChangeDate();
    virtual int GetVelquorServiceStatus();
    virtual void SetVelquorServiceChangeDate(long date);
    virtual void SetVelquorServiceStatus(int status);
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddServiceStatusListener(ServiceStatusListener* listener);
    /// Passes `event` to every listener. Returns 0.
    int ProcessServiceStatusEvent(ReferenceCounter<ServiceStatusEvent> event) override;
    /// Does nothing here and returns 0.
    virtual int NotifyServiceStatusListeners(int status);

    /// These two do nothing and return 1.
    int RetrieveModuleInfo(ReferenceCounter<Module> module, char* info);
    int RetrieveServiceInfo(ReferenceCounter<Service> service, char* info);

  protected:
    ServiceManager();

    using ModuleTable = IndexedTable<int, ReferenceCounter<Module>>;
    using ServiceTable = IndexedTable<int, ReferenceCounter<Service>>;

    /// For variants that fill the tables.
    ReferenceCounter<ModuleTable> const& modules() const { return m_modules; }
    ReferenceCounter<ServiceTable> const& services() const { return m_services; }

  private:
    std::atomic<int> m_velquorServiceStatus{0};
    std::atomic<long> m_velquorServiceChangeDate{0};
    ListenerTable m_listeners;
    ReferenceCounter<ModuleTable> m_modules;
    ReferenceCounter<ServiceTable> m_services;

    static ServiceManager* s_instance;
};
