// SPDX-License-Identifier: BSD-2-Clause
#include "core/IID.h"

#include <cstring>

#include "core/HandleLists.h"

namespace KVL {

IID::IID(char const* name) {
    std::size_t const length = std::strlen(name);
    if (length <= kMaxLength)
        std::memcpy(m_name, name, length + 1);
    else
        std::strcpy(m_name, "<<unknown>>");
}

IID::IID(IID const& other) {
    std::strcpy(m_name, other.m_name);
}

IID& IID::operator=(IID const& other) {
    if (this != &other) std::strcpy(m_name, other.m_name);
    return *this;
}

bool IID::operator==(IID const& other) const {
    return std::strcmp(m_name, other.m_name) == 0;
}

void IIDList::add(IID id) {
    if (m_count >= kCapacity || is_element(id)) return;
    if (HandleLists::made(this)) HandleLists::noteChange();
    m_entries[m_count++] = id;
}

bool IIDList::is_element(IID id) const {
    for (std::int32_t i = 0; i < m_count; ++i)
        if (m_entries[i] == id) return true;
    return false;
}

IIDList* IIDList::clone() const {
    auto* copy = new IIDList;
    copy->m_count = m_count;
    for (std::int32_t i = 0; i < kCapacity; ++i)
        copy->m_entries[i] = m_entries[i];
    return copy;
}

} // namespace KVL
