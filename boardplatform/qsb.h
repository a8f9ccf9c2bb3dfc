// SPDX-License-Identifier: BSD-2-Clause
// The board platform's attribute storage library: typed records below one root record.
//
// The environment variable VQRXCFGPATH names the storage. Thread-bound: one thread makes all calls.
#pragma once

#pragma GCC visibility push(default)

enum QSBResult : int {
    QSB_SUCCESS = 0,
    QSB_EGENERAL = 1,
    QSB_EINVALID = 2,
    QSB_EEXISTS = 3,
    QSB_ENOPARENTTYPE = 4,
    QSB_ENOPARENTINST = 5,
    QSB_ENOTYPE = 6,
    QSB_ENOINST = 7,
    QSB_ENOMORE = 8,
    QSB_EFUNSEQ = 9,
    QSB_ENOSPACE = 10
};

/// The size of the buffer for the root record's type name.
inline constexpr int kQSBTypeNameSize = 255;

extern "C" {

/// Opens the storage and fills in the root record's type name (a buffer of `kQSBTypeNameSize`) and
/// instance. Every call returns a `QSBResult`.
int QSBOpenStorage(char* rootType, int* rootInstance);
/// The first record of `type` under the given parent.
int QSBGetFirstInstance(char const* type, char const* parentType, int parentInstance,
                        int* instance);
/// The next record of the same type and parent.
int QSBGetNextInstance(int* instance);
/// Copies `length` bytes from `offset` of the record.
int QSBGetDataValue(char const* type, int instance, int offset, int length, void* buffer);
int QSBCloseStorage();
}

#pragma GCC visibility pop
