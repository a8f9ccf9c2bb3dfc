// SPDX-License-Identifier: BSD-2-Clause
// Interface identifiers, and the fixed list of them that every object carries.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/Export.h"

namespace KVL {

/// An `IID` is an interface identifier: the name of a class in the encoding of the Itanium C++ ABI
/// (its section 5.1), such as "6Object". A plain value; unsynchronised.
class KVLOAM_API IID {
  public:
    /// The length of the longest name that is kept.
    static constexpr std::size_t kMaxLength = 80;

    /// The empty name.
    IID() { m_name[0] = '\0'; }
    /// A name longer than `kMaxLength` characters becomes "<<unknown>>".
    IID(char const* name);
    IID(IID const& other);
    IID& operator=(IID const& other);

    bool operator==(IID const& other) const;
    /// The name; valid as long as the identifier exists.
    char const* tostring() const { return m_name; }

  private:
    friend class IIDList;
    char m_name[kMaxLength + 1]; ///< only the part up to the terminator is set
};

/// An `IIDList` is the set of the identifiers that an object answers to: up to 32, in the order of
/// addition, in one fixed block. Unsynchronised.
class KVLOAM_API IIDList {
  public:
    static constexpr std::int32_t kCapacity = 32;

    IIDList() = default;
    virtual ~IIDList() = default;
    IIDList(IIDList const&) = delete;
    IIDList& operator=(IIDList const&) = delete;

    /// Appends `id` unless the list has it already. A full list silently drops it.
    void add(IID id);
    bool is_element(IID id) const;
    /// Returns an independent copy, which the caller owns.
    IIDList* clone() const;

    /// Keeps only the first `count` identifiers.
    void shrink(std::int32_t count) {
        while (m_count > count)
            [[unlikely]] m_entries[--m_count].m_name[0] = '\0';
    }

  private:
    friend class ListKinds;
    std::int32_t m_count = 0;
    IID m_entries[kCapacity];
};

} // namespace KVL
