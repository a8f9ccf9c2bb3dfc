// SPDX-License-Identifier: BSD-2-Clause
#include <ctime>
#include <utility>

#include "services/LockedText.h"
#include "services/Service.h"

Service::Service(std::string name) : Object(true), m_name(std::move(name)), m_scmName(m_name) {}

Service::~Service() = default;

long Service::GetServiceChangeDate() {
    ObjectGuard const guard(*this);
    return m_changeDate;
}

void Service::SetServiceChangeDate() {
    ObjectGuard const guard(*this);
    m_changeDate = std::time(nullptr);
}

void Service::GetServiceName(char* name) {
    KVL::copy_text(*this, m_name, name);
}
void Service::GetServiceScmName(char* name) {
    KVL::copy_text(*this, m_scmName, name);
}
void Service::SetServiceName(char* name) {
    KVL::set_text(*this, m_name, name);
}
void Service::SetServiceScmName(char* name) {
    KVL::set_text(*this, m_scmName, name);
}

int Service::GetServiceStatus() {
    ObjectGuard const guard(*this);
    return m_status;
}

void Service::SetServiceStatus(int status) {
    ObjectGuard const guard(*this);
    m_status = status;
}

void Service::SetStatusStarted() {}

void Service::SetStatusStopped() {}

ServiceStatusEvent::ServiceStatusEvent() = default;

ServiceStatusEvent::~ServiceStatusEvent() = default;
