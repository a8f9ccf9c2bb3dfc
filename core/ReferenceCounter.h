// SPDX-License-Identifier: BSD-2-Clause
// The handle by which every managed object is passed.
#pragma once

#include <cstdio>
#include <cstdlib>

#include "core/Object.h"
#include "core/ReferenceTable.h"

/// A `ReferenceCounter` is a counted handle of a `T`, a class derived from `Object` (possibly
/// through a virtual base). All handles of an object share one count, also those made independently
/// from its pointer; the last one to be dropped deletes the object.
///
/// A handle is unsynchronised, but any threads may copy and drop different handles of one object at
/// the same time.
template <class T>
class ReferenceCounter : public Object {
  public:
    /// A handle of `object`; null makes an empty handle. Requires that the object is new or that
    /// another handle keeps it meanwhile. When memory runs out, a new object is deleted.
    ReferenceCounter(T* object = nullptr) try
        : Object(false),
          m_record(object == nullptr ? nullptr
                                     : ReferenceTable::get_instance()->add_handle(object)),
          m_object(object) {
    } catch (...) {
        if (ReferenceTable::get_instance()->ReferenceTable::get_refinfo(object) == nullptr)
            delete object;
    }

    ReferenceCounter(ReferenceCounter const& other) : Object(false) { share(other); }

    /// Takes over what `other` holds; `other` ends empty. Not `noexcept`: each handle is an
    /// `Object` with an identifier list of its own, so making one allocates. When that fails,
    /// `other` keeps what it holds.
    ReferenceCounter(ReferenceCounter&& other) // NOLINT(performance-noexcept-move-constructor)
        : Object(false) {
        takeOver(other);
    }

    /// Deliberate: releases its own object before it takes the other's, without a test for
    /// self-assignment. Assigning the only handle of an object to itself deletes the object and
    /// leaves the handle empty.
    ReferenceCounter&
    operator=(ReferenceCounter const& other) { // NOLINT(bugprone-unhandled-self-assignment)
        letGo();
        share(other);
        return *this;
    }

    /// As the copying assignment, but `other` ends empty. Allocates nothing.
    ReferenceCounter& operator=(ReferenceCounter&& other) noexcept {
        letGo();
        takeOver(other);
        return *this;
    }

    ~ReferenceCounter() override { letGo(); }

    /// Lowers the count; at 0 the handle becomes empty and the object is deleted. Requires the
    /// record's lock, which is released before the record is destroyed. Does nothing to an empty
    /// handle.
    void release() {
        ReferenceInfo* const record = m_record;
        if (record == nullptr || record->lower() != 0) return;
        m_record = nullptr;
        record->unlock();
        ReferenceTable::get_instance()->ReferenceTable::destroy_refcount(m_object);
        delete m_object;
        m_object = nullptr;
    }

    /// The object. For an empty handle, aborts the process with a message on standard error.
    T* operator->() const {
        if (m_record == nullptr) [[unlikely]] {
            std::fprintf(stderr, "FATAL! ReferenceCounter operator-> returns NULL\n");
            std::fprintf(stderr, "Calling abort\n");
            std::abort();
        }
        return locked();
    }

    /// The object, or null for an empty handle. The pointer is valid while a handle of it exists.
    T* get() const { return m_record == nullptr ? nullptr : locked(); }

    /// As `get()`, but does not take the record's lock. For searches and for handles that never
    /// change, where locking every record would take most of the time.
    T* unlocked() const { return m_record == nullptr ? nullptr : m_object; }

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
