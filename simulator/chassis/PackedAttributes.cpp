// SPDX-License-Identifier: BSD-2-Clause
#include "simulator/chassis/PackedAttributes.h"

#include <cstring>
#include <stdexcept>

namespace kvlsim {

PackedAttributes::PackedAttributes(AttributeMap const& attributes) {
    std::size_t all = 0;
    for (auto const& [name, value] : attributes)
        all += packedSize(name, value);
    m_bytes.reserve(all);
    for (auto const& [name, value] : attributes)
        append(name, value);
}

std::optional<AttributeValue> PackedAttributes::find(std::string_view name) const {
    std::size_t const place = placeOf(name);
    if (place == m_bytes.size()) return std::nullopt;
    Packed const found = at(place);
    return AttributeValue(found.form, found.value);
}

void PackedAttributes::set(std::string_view name, AttributeValue const& value) {
    // What may throw comes first. No more is reserved than is needed.
    m_bytes.reserve(m_bytes.size() + packedSize(name, value));
    unset(name);
    append(name, value);
}

bool PackedAttributes::unset(std::string_view name) {
    std::size_t const place = placeOf(name);
    if (place == m_bytes.size()) return false;
    auto const first = m_bytes.begin() + static_cast<std::ptrdiff_t>(place);
    auto const last = m_bytes.begin() + static_cast<std::ptrdiff_t>(at(place).end);
    m_bytes.erase(first, last);
    --m_size;
    return true;
}

std::size_t PackedAttributes::packedSize(std::string_view name, AttributeValue const& value) {
    if (name.size() > kMaxName) throw std::length_error("the name of an attribute is too long");
    return sizeof(Head) + name.size() + value.bytes().size();
}

PackedAttributes::Packed PackedAttributes::at(std::size_t place) const {
    Head head{};
    std::memcpy(&head, m_bytes.data() + place, sizeof head);
    char const* const name = m_bytes.data() + place + sizeof head;
    return {.name = {name, head.nameSize},
            .value = {name + head.nameSize, head.valueSize},
            .form = head.form,
            .end = place + sizeof head + head.nameSize + head.valueSize};
}

std::size_t PackedAttributes::placeOf(std::string_view name) const {
    std::size_t place = 0;
    while (place < m_bytes.size()) {
        Packed const each = at(place);
        if (each.name == name) break;
        place = each.end;
    }
    return place;
}

/// Requires that it is not there, and that there is room for it.
void PackedAttributes::append(std::string_view name, AttributeValue const& value) {
    std::string_view const bytes = value.bytes();
    Head const head{.valueSize = static_cast<std::uint32_t>(bytes.size()),
                    .nameSize = static_cast<std::uint16_t>(name.size()),
                    .form = value.form()};
    auto const* const first = reinterpret_cast<char const*>(&head);
    m_bytes.insert(m_bytes.end(), first, first + sizeof head);
    m_bytes.insert(m_bytes.end(), name.begin(), name.end());
    m_bytes.insert(m_bytes.end(), bytes.begin(), bytes.end());
    ++m_size;
}

} // namespace kvlsim
