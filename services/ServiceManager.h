// SPDX-License-Identifier: BSD-2-Clause
// The system's modules and services.
#pragma once

#include <atomic>

#include "core/IndexedTable.h"
#include "services/Module.h"
#include "services/Service.h"

/// Keeps the records of modules and services, walked by index, and the status of the board
/// platform's own service. Indices count from 1; 0 ends a walk.
///
/// The first `GetInstance()` must return before several threads use the manager; then all
/// operations may be called from any thread. Its lock is never held during a callback.
class KVLOAM_API ServiceManager : public Object, public ServiceStatusListener {
  public:
    /// The longest name that `AddModule` takes.
    static constexpr int kMaxModuleNameLength = 230;

    /// The single instance, made by the first call and never destroyed.
    static ServiceManager* GetInstance();

    ~ServiceManager() override;
    /// These two do nothing here; a variant for another platform fills the tables in them.
    virtual void InitializeModules();
    virtual void InitializeServices();
    /// Enters the module of the library `<name>kvl` with today's date, version "5.2" and a purpose
    /// that names it. A longer name than `kMaxModuleNameLength` is cut.
    virtual void AddModule(char const* name);
    /// An empty handle when there is none.
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
    /// The board platform's service; the setters tell nobody.
    virtual long GetVelquorServiceChangeDate();
    virtual int GetVelquorServiceStatus();
    virtual void SetVelquorServiceChangeDate(long date);
    virtual void SetVelquorServiceStatus(int status);
    /// Adds `listener`, once. Returns 0. The listener is not owned.
    virtual int AddServiceStatusListener(ServiceStatusListener* listener);
    /// Hands `event` to every listener. Returns 0.
    int ProcessServiceStatusEvent(ReferenceCounter<ServiceStatusEvent> event) override;
    /// Does nothing here; returns 0.
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
