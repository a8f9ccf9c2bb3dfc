// SPDX-License-Identifier: BSD-2-Clause
#include "core/ListKinds.h"

#ifndef KVLOAM_NO_POOL

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <new>
#include <vector>

#include "core/ListFile.h"

namespace KVL {

namespace {

/// How many lists are mapped at a time.
constexpr std::size_t kMapped = 32;

} // namespace

/// The lists of one kind, and the kinds that have one identifier more.
struct ListKind {
    std::vector<IID> identifiers; ///< in their order, the one of `Object` first
    std::vector<std::unique_ptr<ListKind>> more;
    std::vector<IIDList*> unused; ///< has room for all lists of the kind
    std::size_t made = 0;
    ListPlace place;

    ListKind& with(IID const& id) {
        for (auto const& kind : more)
            if (kind->identifiers.back() == id) return *kind;
        auto kind = std::make_unique<ListKind>();
        kind->identifiers = identifiers;
        kind->identifiers.push_back(id);
        kind->place = ListFile::instance().append(kMapped * sizeof(KindList), [&](void* block) {
            for (std::size_t i = 0; i < kMapped; ++i)
                new (static_cast<KindList*>(block) + i) KindList(*kind);
        });
        more.push_back(std::move(kind));
        return *more.back();
    }

    IIDList* take() {
        if (unused.empty()) makeMore();
        IIDList* const list = unused.back();
        unused.pop_back();
        return list;
    }

    void makeMore() {
        if (unused.capacity() < made + kMapped)
            unused.reserve(std::max(made + kMapped, 2 * unused.capacity()));
        auto* const block = static_cast<KindList*>(ListFile::map(place));
        if (block == nullptr) {
            unused.push_back(new KindList(*this));
            ++made;
            return;
        }
        for (std::size_t i = kMapped; i > 0; --i)
            unused.push_back(std::launder(block + i - 1));
        made += kMapped;
    }
};

namespace {

std::mutex& mutex() {
    static auto* const instance = new std::mutex;
    return *instance;
}

/// The kind that has the identifier of `Object` alone. Never destroyed.
ListKind& rootKind() {
    static auto* const kind = [] {
        auto made = std::make_unique<ListKind>();
        made->identifiers.emplace_back("6Object");
        return made.release();
    }();
    return *kind;
}

} // namespace

KindList::KindList(ListKind& kind) : m_kind(&kind) {
    for (IID const& id : kind.identifiers)
        add(id);
}

IIDList* ListKinds::take(IIDList const& list, IID const& id) {
    std::scoped_lock const guard(mutex());
    ListKind& kind = made(&list) ? static_cast<KindList const&>(list).kind() : rootKind();
    auto const count = static_cast<std::size_t>(list.m_count);
    // A program has added identifiers of its own, or there is nothing to add.
    if (count != kind.identifiers.size() || count >= IIDList::kCapacity || list.is_element(id))
        return nullptr;
    return kind.with(id).take();
}

void ListKinds::give(IIDList* list) {
    ListKind& kind = static_cast<KindList*>(list)->kind();
    list->shrink(static_cast<std::int32_t>(kind.identifiers.size()));
    std::scoped_lock const guard(mutex());
    kind.unused.push_back(list);
}

} // namespace KVL

#endif
