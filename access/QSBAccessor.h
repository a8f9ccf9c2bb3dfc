// SPDX-License-Identifier: BSD-2-Clause
// The platform's attribute store, opened once per process, with its boards by serial number.
#pragma once

#include <map>
#include <string>

#include "boardplatform/qsb.h"
#include "platform/Export.h"

namespace KVL {

/// A `QSBRecordType` is a record type of the attribute store.
struct QSBRecordType {
    char name[32];
    char parent[32];
    int size; ///< bytes
};

/// The record types that the library reads: a family's and a board's.
inline constexpr QSBRecordType kQSBRecordTypes[] = {{"Family", "root", 30},
                                                    {"Board", "Family", 2128}};
/// Names the layout of the board record.
inline constexpr char const* kQSBBoardLayout = "BW1.0_BCI_Struct";

/// The board families of the store. The first entry is no family and is never searched.
inline constexpr char const* kQSBFamilies[] = {"", "NX5", "QUILLON", "VORN", "Z7", "VELQUOR"};
/// The board models of the store.
inline constexpr char const* kQSBModels[] = {"NX5-T1",  "NX5-E1",  "QUILLON-T1", "QUILLON-E1",
                                             "VORN-T1", "VORN-E1", "Z7-T1",      "Z7-E1"};
/// The names of the storage library's results, by result.
inline constexpr char const* kQSBResultNames[] = {
    "QSB_SUCCESS",       "QSB_EGENERAL",      "QSB_EINVALID", "QSB_EEXISTS",
    "QSB_ENOPARENTTYPE", "QSB_ENOPARENTINST", "QSB_ENOTYPE",  "QSB_ENOINST",
    "QSB_ENOMORE",       "QSB_EFUNSEQ",       "QSB_ENOSPACE"};

} // namespace KVL

/// A `QSBAccessor` keeps the store open while it lives. The first accessor opens the store and
/// reads which boards it has; the last one closes it.
///
/// Thread-bound: one thread uses all accessors and `QSBBoard`s of a process.
class KVLOAM_API QSBAccessor {
  public:
    QSBAccessor();
    ~QSBAccessor();
    QSBAccessor(QSBAccessor const&) = delete;
    QSBAccessor& operator=(QSBAccessor const&) = delete;

    /// Opens the store. Sets the environment variable VQRXCFGPATH to "/usr/velquor/cfg" if it is
    /// not set. Returns whether the store is open.
    bool OpenStorage();
    /// Opens the store if it is closed. If it is open then, reads anew which boards it has.
    void Update();
    void CreateSerialNumberToInstanceIDMap();
    /// The instance of the board's record, or -1.
    int GetBoardInstance(std::string const& serialNumber);
    /// Finds the record of a family. Returns 0; if there is none, sets the instance to -1 and
    /// returns
    /// 1. The name is only read.
    int FindFamilyID(char* familyName, int* familyInstance);

  private:
    static bool m_QSBOpened;
    static int m_QSBAccessorInstances;
    static char m_rootType[kQSBTypeNameSize];
    static int m_rootInstance;
    static std::map<std::string, int> m_SNtoInstance; ///< by serial number
};
