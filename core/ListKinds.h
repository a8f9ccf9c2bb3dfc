// SPDX-License-Identifier: BSD-2-Clause
// The identifier lists of objects whose classes have identifiers.
#pragma once

#include "core/HandleLists.h"
#include "core/IID.h"
#include "core/RecyclingPool.h"

namespace KVL {

struct ListKind;

/// A `KindList` is a list that `ListKinds` has made. It has the identifiers of its kind first.
class KindList final : public RootedIIDList {
  public:
    explicit KindList(ListKind& kind);

    ListKind& kind() const { return *m_kind; }

  private:
    ListKind* m_kind;
};

/// `ListKinds` hands out the lists of objects to which the library's classes give identifiers, and
/// takes them back. All objects of a class have the same identifiers, unless a program adds more.
/// So the lists of one kind are private mappings of a `ListFile`, as those of handles are: they
/// need memory of their own only when they are changed. Thread-safe.
class ListKinds {
  public:
#ifdef KVLOAM_NO_POOL
    static IIDList* take(IIDList const& /*list*/, IID const& /*id*/) {
        return nullptr;
    }
    static bool made(IIDList const* /*list*/) {
        return false;
    }
    static void give(IIDList* /*list*/) {}
#else
    /// A list with the identifiers of `list` and then `id`. Null when no such list can be handed
    /// out; `id` must then be added to `list` itself. Throws `std::bad_alloc`.
    static IIDList* take(IIDList const& list, IID const& id);
    /// Whether `list` comes from here.
    static bool made(IIDList const* list) {
        return &typeid(*list) == &typeid(KindList);
    }
    static void give(IIDList* list);
#endif
};

} // namespace KVL
