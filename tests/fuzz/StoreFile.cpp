// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the attribute store with files that others have written: the storage library's calls and
// the operator's changes must answer or refuse.
#include <unistd.h>

#include <cstdlib>
#include <string>

#include "simulator/store/AttributeStore.h"
#include "tests/fuzz/DatabaseFile.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"

namespace {

using kvlsim::AttributeStore;

constexpr int kMaxRecords = 64;

kvlsim::StoreContents contents() {
    kvlsim::StoreBoard board;
    board.family = "NX5";
    board.record.set(*kvlsim::boardFieldNamed("SerialNumber"), std::string("A"));
    return {{"NX5", "VORN"}, {board}};
}

/// Where the store's file is.
class Place {
  public:
    Place() {
        setenv("VQRXCFGPATH", m_folder.path().c_str(), 1);
        AttributeStore store(contents);
        store.setDirectory(m_folder.path());
        store.list();
        m_sound = fuzz::contentsOf(file());
    }
    std::string folder() const { return m_folder.path(); }
    std::string file() const { return m_folder.file(kvlsim::kStoreFileName); }
    std::string const& sound() const { return m_sound; }

  private:
    fuzz::Folder m_folder;
    std::string m_sound;
};

/// Walks the whole store as the library does.
void walk(AttributeStore& store) {
    std::string_view rootType;
    int root = 0;
    if (store.open(rootType, root) != QSB_SUCCESS) return;
    char buffer[2128];
    int family = 0;
    int records = 0;
    for (int result = store.first("Family", rootType, root, family);
         result == QSB_SUCCESS && ++records < kMaxRecords;) {
        store.value("Family", family, 0, 30, buffer);
        int board = 0;
        for (int inner = store.first("Board", "Family", family, board);
             inner == QSB_SUCCESS && ++records < kMaxRecords; inner = store.next(board))
            store.value("Board", board, 404, 80, buffer);
        // The walk of the boards has ended that of the families.
        result = store.first("Family", rootType, root, family);
        for (int seen = 0; result == QSB_SUCCESS && seen < records; ++seen)
            result = store.next(family);
    }
    store.close();
}

template <class Change>
void attempt(Change change) {
    try {
        change();
    } catch (kvlsim::StoreError const&) { // refused
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static Place const place;
    fuzz::FuzzInput input(octets, size);
    bool const hasJournal = input.octet() == 'j';
    std::string const journal = hasJournal ? input.text() : std::string();
    fuzz::writeFile(place.file(), fuzz::databaseFile(input, place.sound(), {"record"}));
    unlink((place.file() + "-journal").c_str());
    if (hasJournal) fuzz::writeFile(place.file() + "-journal", journal);
    AttributeStore store(contents);
    store.setDirectory(place.folder());
    walk(store);
    attempt([&] { store.list(); });
    attempt([&] { store.add(contents().boards[0]); });
    attempt([&] { store.set("A", {}); });
    attempt([&] { store.addFamily("MINE"); });
    attempt([&] { store.removeFamily("NX5"); });
    attempt([&] { store.remove("A"); });
    return 0;
}
