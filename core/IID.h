// SPDX-License-Identifier: BSD-2-Clause
// Interface identifiers, and the fixed list of them that every object carries.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/Export.h"

namespace KVL {

/// Names a class by its type name in the Itanium ABI's encoding (Itanium C++ ABI, section 5.1),
/// such as "6Object". A plain value.
class KVLOAM_API IID {
  public:
    /// The longest name that is kept as it is.
    static constexpr std::size_t kMaxLength = 80;

    /// The empty name.
    IID() { m_name[0] = '\0'; }
    /// A name of more than `kMaxLength` characters becomes "<<unknown>>".
    IID(char const* name);
    IID(IID const& other);
    IID& operator=(IID const& other);

    bool operator==(IID const& other) const;
    /// Lives as long as the identifier.
    char const* tostring() const { return m_name; }

  private:
    friend class IIDList;
    char m_name[kMaxLength + 1]; ///< only the part up to the terminator is ever written or read
};

/// Up to 32 identifiers in the order of addition, in one fixed block. Not synchronised.
class KVLOAM_API IIDList {
  public:
    static constexpr std::int32_t kCapacity = 32;

    IIDList() = default;
    virtual ~IIDList() = default;
    IIDList(IIDList const&) = delete;
    IIDList& operator=(IIDList const&) = delete;

    /// Appends `id` unless it is an element already. A full list drops it silently.
    void add(IID id);
    bool is_element(IID id) const;
    /// An independent copy; the caller owns it.
    IIDList* clone() const;

    /// Back to the first `count` identifiers.
    void shrink(std::int32_t count) {
        while (m_count > count)
            [[unlikely]] m_entries[--m_count].m_name[0] = '\0';
    }

  private:
    std::int32_t m_count = 0;
    IID m_entries[kCapacity];
};

} // namespace KVL
