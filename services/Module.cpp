// SPDX-License-Identifier: BSD-2-Clause
#include "services/Module.h"

#include <ctime>
#include <utility>

#include "services/LockedText.h"

Module::Module(std::string name)
    : Object(true), m_date(std::time(nullptr)), m_name(std::move(name)) {}

Module::~Module() = default;

long Module::GetModuleDate() {
    ObjectGuard const guard(*this);
    return m_date;
}

void Module::SetModuleDate(long date) {
    ObjectGuard const guard(*this);
    m_date = date;
}

void Module::GetModuleName(char* name) {
    KVL::copy_text(*this, m_name, name);
}
void Module::GetModulePurpose(char* purpose) {
    KVL::copy_text(*this, m_purpose, purpose);
}
void Module::GetModuleVersion(char* version) {
    KVL::copy_text(*this, m_version, version);
}
void Module::SetModuleName(char* name) {
    KVL::set_text(*this, m_name, name);
}
void Module::SetModulePurpose(char* purpose) {
    KVL::set_text(*this, m_purpose, purpose);
}
void Module::SetModuleVersion(char* version) {
    KVL::set_text(*this, m_version, version);
}
