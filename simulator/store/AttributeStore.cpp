// SPDX-License-Identifier: BSD-2-Clause
// The simulated attribute store: the file, and the storage library's calls.
#include "simulator/store/AttributeStore.h"

#include <cstdlib>
#include <cstring>
#include <limits>

#include "simulator/base/Text.h"
#include "simulator/store/StoreFile.h"

namespace kvlsim {

/// A `Reading` is the statements of an open store; its connection is destroyed last.
struct AttributeStore::Reading {
    explicit Reading(Database opened) : database(std::move(opened)) {}

    Database database;
    Statement exists{database, "SELECT 1 FROM record WHERE instance = ?1 AND type = ?2"};
    Statement following{database, "SELECT min(instance), count(*) FROM record "
                                  "WHERE parent = ?1 AND type = ?2 AND instance > ?3"};
    Statement data{database, "SELECT data FROM record WHERE instance = ?1 AND type = ?2"};

    bool has(std::string_view type, int instance) {
        Execution const execution(exists);
        exists.bind(1, std::int64_t(instance));
        exists.bind(2, type);
        return exists.step();
    }

    /// The first record behind `last`, 0 when there is none.
    int after(std::string_view type, int parent, int last) {
        Execution const execution(following);
        following.bind(1, std::int64_t(parent));
        following.bind(2, type);
        following.bind(3, std::int64_t(last));
        following.step();
        std::int64_t const instance = following.integer(0);
        if (instance > std::numeric_limits<int>::max())
            throw DatabaseError("an instance is out of range");
        return static_cast<int>(instance);
    }
};

/// Runs a call of the storage library. A fault of the file is answered with QSB_EGENERAL.
template <typename Call>
QSBResult AttributeStore::guarded(Call call) const {
    try {
        return undoingUnfinished(call);
    } catch (std::exception const&) {
        return QSB_EGENERAL;
    }
}

AttributeStore::AttributeStore(std::function<StoreContents()> contents)
    : m_contents(std::move(contents)) {}

AttributeStore::~AttributeStore() = default;

void AttributeStore::setDirectory(std::string directory) {
    std::lock_guard const lock(m_mutex);
    m_directory = std::move(directory);
}

std::string AttributeStore::path() const {
    if (m_directory.empty())
        throw StoreError("no attribute store: the process has no VQRXCFGPATH; set it to a "
                         "directory");
    return m_directory + "/" + kStoreFileName;
}

Database AttributeStore::openFile(DatabaseUse use) {
    std::string const file = path();
    try {
        makeStoreFile(file, m_contents);
        return openStoreFile(file, use);
    } catch (std::exception const& error) {
        throw StoreError(file + ": " + oneLine(error.what()));
    }
}

QSBResult AttributeStore::open(std::string_view& rootType, int& rootInstance) {
    // Read here, on the caller's thread, because only the caller may be changing it.
    char const* const directory = std::getenv("VQRXCFGPATH");
    std::lock_guard const lock(m_mutex);
    return guarded([&] {
        if (m_reading == nullptr) {
            m_directory = directory == nullptr ? "" : directory;
            auto reading = std::make_unique<Reading>(openFile(DatabaseUse::read));
            if (!reading->has(kRootRecord.name, kRootInstance))
                throw DatabaseError("no root record");
            m_reading = std::move(reading);
        }
        rootType = kRootRecord.name;
        rootInstance = kRootInstance;
        return QSB_SUCCESS;
    });
}

QSBResult AttributeStore::first(std::string_view type, std::string_view parentType, int parent,
                                int& instance) {
    std::lock_guard const lock(m_mutex);
    if (m_reading == nullptr) return QSB_EFUNSEQ;
    m_walk.reset();
    RecordType const* const wanted = recordTypeNamed(type);
    if (wanted == nullptr) return QSB_ENOTYPE;
    if (wanted->parent.empty() || wanted->parent != parentType) return QSB_ENOPARENTTYPE;
    return guarded([&] {
        if (!m_reading->has(parentType, parent)) return QSB_ENOPARENTINST;
        int const found = m_reading->after(type, parent, 0);
        if (found == 0) return QSB_ENOINST;
        m_walk = Walk{std::string(type), parent, found};
        instance = found;
        return QSB_SUCCESS;
    });
}

QSBResult AttributeStore::next(int& instance) {
    std::lock_guard const lock(m_mutex);
    if (m_reading == nullptr || !m_walk) return QSB_EFUNSEQ;
    if (instance != m_walk->last) return QSB_EINVALID;
    return guarded([&] {
        int const found = m_reading->after(m_walk->type, m_walk->parent, m_walk->last);
        if (found == 0) return QSB_ENOMORE;
        instance = m_walk->last = found;
        return QSB_SUCCESS;
    });
}

QSBResult AttributeStore::value(std::string_view type, int instance, int offset, int length,
                                void* buffer) {
    std::lock_guard const lock(m_mutex);
    if (m_reading == nullptr) return QSB_EFUNSEQ;
    RecordType const* const wanted = recordTypeNamed(type);
    if (wanted == nullptr) return QSB_ENOTYPE;
    if (offset < 0 || length <= 0 || length > wanted->size || offset > wanted->size - length)
        return QSB_EINVALID;
    return guarded([&] {
        Statement& data = m_reading->data;
        Execution const execution(data);
        data.bind(1, std::int64_t(instance));
        data.bind(2, type);
        if (!data.step()) return QSB_ENOINST;
        std::string_view const bytes = data.bytes(0);
        if (bytes.size() != static_cast<std::size_t>(wanted->size)) return QSB_EGENERAL;
        std::memcpy(buffer, bytes.data() + offset, static_cast<std::size_t>(length));
        return QSB_SUCCESS;
    });
}

QSBResult AttributeStore::close() {
    std::lock_guard const lock(m_mutex);
    if (m_reading == nullptr) return QSB_EFUNSEQ;
    m_walk.reset();
    m_reading.reset();
    return QSB_SUCCESS;
}

} // namespace kvlsim
