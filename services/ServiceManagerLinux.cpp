// SPDX-License-Identifier: BSD-2-Clause
#include <ctime>
#include <string>
#include <utility>

#include "core/TableWalk.h"
#include "services/ServiceManager.h"

ServiceManager* ServiceManager::s_instance = nullptr;

ServiceManager* ServiceManager::GetInstance() {
    if (s_instance == nullptr) {
        s_instance = new ServiceManager;
        s_instance->InitializeModules();
        s_instance->InitializeServices();
    }
    return s_instance;
}

ServiceManager::ServiceManager()
    : Object(true), m_modules(new ModuleTable), m_services(new ServiceTable) {}

ServiceManager::~ServiceManager() = default;

void ServiceManager::InitializeModules() {}

void ServiceManager::InitializeServices() {}

void ServiceManager::AddModule(char const* name) {
    std::string const base = std::string(name).substr(0, kMaxModuleNameLength);
    std::string purpose = "KVL Extension Module for " + base;
    std::string version = "5.2";
    ReferenceCounter<Module> module(new Module(base + "kvl"));
    module->SetModuleDate(std::time(nullptr));
    module->SetModulePurpose(purpose.data());
    module->SetModuleVersion(version.data());
    enter_at_next_index(*m_modules.get(), std::move(module));
}

ReferenceCounter<Module> ServiceManager::GetFirstModule() {
    return KVL::first_entry(*m_modules.unlocked());
}

ReferenceCounter<Module> ServiceManager::GetNextModule(int index) {
    return KVL::entry_after(*m_modules.unlocked(), index);
}

ReferenceCounter<Module> ServiceManager::GetNextModule(ReferenceCounter<Module> module) {
    return GetNextModule(GetIndexByModule(std::move(module)));
}

ReferenceCounter<Module> ServiceManager::GetModuleByIndex(int index) {
    return KVL::entry_at(*m_modules.unlocked(), index);
}

int ServiceManager::GetNumberOfModules() {
    return KVL::number_of_entries(*m_modules.unlocked());
}

int ServiceManager::GetFirstModuleIndex() {
    return m_modules.unlocked()->first_index();
}

int ServiceManager::GetIndexByModule(ReferenceCounter<Module> module) {
    return KVL::index_of(*m_modules.unlocked(), module);
}

int ServiceManager::GetNextModuleIndex(int index) {
    return m_modules.unlocked()->next_index(index);
}

ReferenceCounter<Service> ServiceManager::GetFirstService() {
    return KVL::first_entry(*m_services.unlocked());
}

ReferenceCounter<Service> ServiceManager::GetNextService(int index) {
    return KVL::entry_after(*m_services.unlocked(), index);
}

ReferenceCounter<Service> ServiceManager::GetNextService(ReferenceCounter<Service> service) {
    return GetNextService(GetIndexByService(std::move(service)));
}

ReferenceCounter<Service> ServiceManager::GetServiceByIndex(int index) {
    return KVL::entry_at(*m_services.unlocked(), index);
}

int ServiceManager::GetNumberOfServices() {
    return KVL::number_of_entries(*m_services.unlocked());
}

int ServiceManager::GetFirstServiceIndex() {
    return m_services.unlocked()->first_index();
}

int ServiceManager::GetIndexByService(ReferenceCounter<Service> service) {
    return KVL::index_of(*m_services.unlocked(), service);
}

int ServiceManager::GetNextServiceIndex(int index) {
    return m_services.unlocked()->next_index(index);
}

long ServiceManager::GetVelquorServiceChangeDate() {
    return m_velquorServiceChangeDate;
}

int ServiceManager::GetVelquorServiceStatus() {
    return m_velquorServiceStatus;
}

void ServiceManager::SetVelquorServiceChangeDate(long date) {
    m_velquorServiceChangeDate = date;
}

void ServiceManager::SetVelquorServiceStatus(int status) {
    m_velquorServiceStatus = status;
}

int ServiceManager::AddServiceStatusListener(ServiceStatusListener* listener) {
    ObjectGuard const guard(*this);
    m_listeners.AddListener(listener);
    return 0;
}

int ServiceManager::ProcessServiceStatusEvent(ReferenceCounter<ServiceStatusEvent> event) {
    for_each_listener<ServiceStatusListener>(
        m_listeners, this,
        [&](ServiceStatusListener* listener) { listener->ProcessServiceStatusEvent(event); });
    return 0;
}

int ServiceManager::NotifyServiceStatusListeners(int /*status*/) {
    return 0;
}

int ServiceManager::RetrieveModuleInfo(ReferenceCounter<Module> /*module*/, char* /*info*/) {
    return 1;
}

int ServiceManager::RetrieveServiceInfo(ReferenceCounter<Service> /*service*/, char* /*info*/) {
    return 1;
}
