// SPDX-License-Identifier: BSD-2-Clause
// The storage library's functions over the simulated attribute store.
#include <cstring>

#include "boardplatform/qsb.h"
#include "simulator/exports/Start.h"

namespace {

kvlsim::AttributeStore& store() {
    return kvlsim::startedPlatform().store();
}

} // namespace

int QSBOpenStorage(char* rootType, int* rootInstance) {
    if (rootType == nullptr || rootInstance == nullptr) return QSB_EINVALID;
    std::string_view type;
    QSBResult const result = store().open(type, *rootInstance);
    if (result == QSB_SUCCESS) {
        static_assert(kvlsim::kRootRecord.name.size() < kQSBTypeNameSize);
        std::memcpy(rootType, type.data(), type.size());
        rootType[type.size()] = '\0';
    }
    return result;
}

int QSBGetFirstInstance(char const* type, char const* parentType, int parentInstance,
                        int* instance) {
    if (type == nullptr || parentType == nullptr || instance == nullptr) return QSB_EINVALID;
    return store().first(type, parentType, parentInstance, *instance);
}

int QSBGetNextInstance(int* instance) {
    if (instance == nullptr) return QSB_EINVALID;
    return store().next(*instance);
}

int QSBGetDataValue(char const* type, int instance, int offset, int length, void* buffer) {
    if (type == nullptr || buffer == nullptr) return QSB_EINVALID;
    return store().value(type, instance, offset, length, buffer);
}

int QSBCloseStorage() {
    return store().close();
}
