// SPDX-License-Identifier: BSD-2-Clause
// The handle through which every managed object is passed.
#pragma once

#include <cstdio>
#include <cstdlib>

#include "core/Object.h"
#include "core/ReferenceTable.h"

/// A counted handle of a `T`, a class derived from `Object` (possibly through a virtual base). All
/// handles of an object count together, however they were made; the last one that goes deletes it.
///
/// Handles of one object may be copied and dropped by many threads at once. One handle is not
/// synchronised: it must not be assigned in one thread while another uses it. A handle made from a
/// plain pointer requires that the object is new or that another handle of it lives meanwhile.
template <class T>
class ReferenceCounter : public Object {
  public:
    /// A handle of `object`; null makes an empty handle.
    ReferenceCounter(T* object = nullptr)
        : Object(false),
          m_record(object == nullptr ? nullptr
                                     : ReferenceTable::get_instance()->find_or_make(object)),
          m_object(object) {
        if (m_record != nullptr) {
            m_record->lock();
            m_record->raise();
            m_record->unlock();
        }
    }

    ReferenceCounter(ReferenceCounter const& other) : Object(false) { share(other); }

    /// Takes over what `other` holds; `other` ends empty.
    ReferenceCounter(ReferenceCounter&& other) noexcept : Object(false) { takeOver(other); }

    /// Deliberate: lets go of its own object before it takes on the other's, without a test for
    /// self-assignment; assigning the only handle of an object to itself deletes the object and
    /// leaves the handle empty.
    ReferenceCounter&
    operator=(ReferenceCounter const& other) { // NOLINT(bugprone-unhandled-self-assignment)
        letGo();
        share(other);
        return *this;
    }

    /// As the copying assignment, but `other` ends empty.
    ReferenceCounter& operator=(ReferenceCounter&& other) noexcept {
        letGo();
        takeOver(other);
        return *this;
    }

    ~ReferenceCounter() override { letGo(); }

    /// Lowers the count; at 0 the handle ends empty and the object is deleted. Requires the
    /// record's lock, which is given back before the record goes. Nothing on an empty handle.
    void release() {
        ReferenceInfo* const record = m_record;
        if (record == nullptr || record->lower() != 0) return;
        m_record = nullptr;
        record->unlock();
        ReferenceTable::get_instance()->ReferenceTable::destroy_refcount(m_object);
        delete m_object;
        m_object = nullptr;
    }

    /// The object. On an empty handle the process ends with a message on standard error.
    T* operator->() const {
        if (m_record == nullptr) [[unlikely]] {
            std::fprintf(stderr, "FATAL! ReferenceCounter operator-> returns NULL\n");
            std::fprintf(stderr, "Calling abort\n");
            std::abort();
        }
        return locked();
    }

    /// The object, or null for an empty handle. The pointer is good while a handle lives.
    T* get() const { return m_record == nullptr ? nullptr : locked(); }

  private:
    T* locked() const {
        m_record->lock();
        T* const object = m_object;
        m_record->unlock();
        return object;
    }

    void share(ReferenceCounter const& other) {
        ReferenceInfo* const record = other.m_record;
        if (record == nullptr) {
            m_record = nullptr;
            m_object = nullptr;
            return;
        }
        record->lock();
        m_object = other.m_object;
        m_record = record;
        record->raise();
        record->unlock();
    }

    void takeOver(ReferenceCounter& other) noexcept {
        m_record = other.m_record;
        m_object = other.m_object;
        other.m_record = nullptr;
        other.m_object = nullptr;
    }

    void letGo() {
        if (m_record == nullptr) return;
        m_record->lock();
        release();
        if (m_record != nullptr) m_record->unlock();
    }

    ReferenceInfo* m_record;
    T* m_object;
};
