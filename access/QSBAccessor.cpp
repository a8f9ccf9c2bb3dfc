// SPDX-License-Identifier: BSD-2-Clause
#include "access/QSBAccessor.h"

#include <cstddef>
#include <cstdlib>
#include <cstring>

namespace {

constexpr char const* kFamilyType = KVL::kQSBRecordTypes[0].name;
constexpr char const* kBoardType = KVL::kQSBRecordTypes[1].name;
constexpr int kFamilyNameSize = KVL::kQSBRecordTypes[0].size;
constexpr int kSerialNumberOffset = 404;
constexpr int kTextSize = 80;

} // namespace

bool QSBAccessor::m_QSBOpened = false;
int QSBAccessor::m_QSBAccessorInstances = 0;
char QSBAccessor::m_rootType[kQSBTypeNameSize] = {};
int QSBAccessor::m_rootInstance = 0;
std::map<std::string, int> QSBAccessor::m_SNtoInstance;

QSBAccessor::QSBAccessor() {
    if (!m_QSBOpened && OpenStorage()) CreateSerialNumberToInstanceIDMap();
    ++m_QSBAccessorInstances;
}

QSBAccessor::~QSBAccessor() {
    if (--m_QSBAccessorInstances > 0) return;
    m_SNtoInstance.clear();
    QSBCloseStorage();
    m_QSBOpened = false;
}

bool QSBAccessor::OpenStorage() {
    constexpr int kKeepExisting = 0;
    setenv("VQRXCFGPATH", "/usr/velquor/cfg", kKeepExisting);
    if (QSBOpenStorage(m_rootType, &m_rootInstance) != QSB_SUCCESS) return false;
    m_rootType[sizeof m_rootType - 1] = '\0';
    m_QSBOpened = true;
    return true;
}

void QSBAccessor::Update() {
    if (!m_QSBOpened && !OpenStorage()) return;
    CreateSerialNumberToInstanceIDMap();
}

void QSBAccessor::CreateSerialNumberToInstanceIDMap() {
    m_SNtoInstance.clear();
    for (std::size_t family = 1; family < std::size(KVL::kQSBFamilies); ++family) {
        int familyInstance = -1;
        if (FindFamilyID(const_cast<char*>(KVL::kQSBFamilies[family]), &familyInstance) != 0)
            continue;
        int board = -1;
        int result = QSBGetFirstInstance(kBoardType, kFamilyType, familyInstance, &board);
        for (; result == QSB_SUCCESS; result = QSBGetNextInstance(&board)) {
            char serialNumber[kTextSize] = {};
            if (QSBGetDataValue(kBoardType, board, kSerialNumberOffset, kTextSize, serialNumber) ==
                QSB_SUCCESS)
                m_SNtoInstance[std::string(serialNumber, strnlen(serialNumber, kTextSize))] = board;
        }
    }
}

int QSBAccessor::GetBoardInstance(std::string const& serialNumber) {
    auto const found = m_SNtoInstance.find(serialNumber);
    return found == m_SNtoInstance.end() ? -1 : found->second;
}

int QSBAccessor::FindFamilyID(char* familyName, int* familyInstance) {
    *familyInstance = -1;
    int family = -1;
    int result = QSBGetFirstInstance(kFamilyType, m_rootType, m_rootInstance, &family);
    for (; result == QSB_SUCCESS; result = QSBGetNextInstance(&family)) {
        char name[kFamilyNameSize + 1] = {};
        if (QSBGetDataValue(kFamilyType, family, 0, kFamilyNameSize, name) != QSB_SUCCESS) return 1;
        if (std::strcmp(name, familyName) == 0) {
            *familyInstance = family;
            return 0;
        }
    }
    return 1;
}
