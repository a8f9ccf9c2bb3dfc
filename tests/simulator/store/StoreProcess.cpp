// SPDX-License-Identifier: BSD-2-Clause
// A process that uses an attribute store, for tests that kill it.
//
// write DIRECTORY   changes the store without end, after a line "writing"
// read DIRECTORY    lists the store without the right to write: "boards N", or why it cannot
#include <unistd.h>

#include <cstdio>
#include <exception>
#include <string>

#include "simulator/store/AttributeStore.h"

namespace {

kvlsim::StoreContents boards() {
    kvlsim::StoreContents contents;
    contents.families = {"NX5"};
    for (int i = 0; i < 20; ++i) {
        kvlsim::StoreBoardDraft draft;
        draft.serial = "A" + std::to_string(i);
        draft.family = "NX5";
        contents.boards.push_back(kvlsim::makeRecord(draft, nullptr));
    }
    return contents;
}

void write(kvlsim::AttributeStore& store) {
    auto const& model = *kvlsim::boardFieldNamed("Model");
    store.list(); // makes the file
    std::puts("writing");
    std::fflush(stdout);
    for (int i = 0;; i = (i + 1) % 1000) {
        store.set("A" + std::to_string(i % 20), {{&model, "model " + std::to_string(i)}});
        store.addFamily("MINE");
        store.removeFamily("MINE");
    }
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 3) return 2;
    constexpr uid_t nobody = 65534;
    bool const reads = std::string(argv[1]) == "read";
    if (reads && geteuid() == 0 && setuid(nobody) != 0) return 2;
    kvlsim::AttributeStore store(boards);
    store.setDirectory(argv[2]);
    try {
        if (!reads) write(store);
        std::printf("boards %zu\n", store.list().boards.size());
    } catch (std::exception const& error) {
        std::printf("%s\n", error.what());
    }
    return 0;
}
