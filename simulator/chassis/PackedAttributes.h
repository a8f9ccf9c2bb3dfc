// SPDX-License-Identifier: BSD-2-Clause
// The attributes of an object of the chassis, in little memory.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include "simulator/chassis/AttributeMap.h"
#include "simulator/chassis/AttributeValue.h"

namespace kvlsim {

/// A `PackedAttributes` is the set of an object's attributes in one piece of memory, where they lie
/// one behind the other: most of a chassis is attributes, and a map of them takes four times as
/// much. An object has few enough to look through them all. Unsynchronised.
class PackedAttributes {
  public:
    /// The longest name.
    static constexpr std::size_t kMaxName = 0xFFFF;

    PackedAttributes() = default;
    explicit PackedAttributes(AttributeMap const& attributes);

    std::size_t size() const { return m_size; }
    /// Nothing if there is no such attribute.
    std::optional<AttributeValue> find(std::string_view name) const;
    /// Adds the attribute, or gives it another value. Throws std::length_error for a name that is
    /// too long; has changed nothing when it throws.
    void set(std::string_view name, AttributeValue const& value);
    /// Returns whether there was such an attribute.
    bool unset(std::string_view name);

    /// Calls `use(name, value)`, a std::string_view and an AttributeValue, for each.
    template <class Use>
    void forEach(Use const& use) const {
        for (std::size_t place = 0; place < m_bytes.size();) {
            Packed const each = at(place);
            use(each.name, AttributeValue(each.form, each.value));
            place = each.end;
        }
    }

  private:
    /// What precedes the name and the value of an attribute.
    struct Head {
        std::uint32_t valueSize;
        std::uint16_t nameSize;
        ValueForm form;
    };
    /// An attribute where it lies.
    struct Packed {
        std::string_view name;
        std::string_view value;
        ValueForm form;
        std::size_t end; ///< where the next one begins
    };

    static std::size_t packedSize(std::string_view name, AttributeValue const& value);
    Packed at(std::size_t place) const;
    /// Where it lies; the end if there is no such attribute.
    std::size_t placeOf(std::string_view name) const;
    void append(std::string_view name, AttributeValue const& value);

    std::size_t m_size = 0;
    std::vector<char> m_bytes;
};

} // namespace kvlsim
