// SPDX-License-Identifier: BSD-2-Clause
// A program of another project: loads a board module and lists what the library finds with it.
#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>

#include "board/Board.h"
#include "boardplatform/dm_client.h"
#include "kvloam.h"

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: ListBoards <board module>\n");
        return 2;
    }
    void* const module = dlopen(argv[1], RTLD_NOW);
    void* const entry = module == nullptr ? nullptr : dlsym(module, KVL_BOARD_MODULE_ENTRY_POINT);
    if (entry == nullptr) {
        std::fprintf(stderr, "%s\n", dlerror());
        return 1;
    }
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    manager->Attach(ReferenceCounter<BoardFactory>(
        reinterpret_cast<KVLCreateBoardFactory*>(entry)(KVL_BOARD_MODULE_ABI_VERSION)));
    for (auto board = manager->GetFirstBoard(); board.get() != nullptr;
         board = manager->GetNextBoard(board)) {
        char name[256];
        board->GetName(name);
        std::printf("%s: status %d\n", name, board->GetStatus());
        auto const feature = board->GetFirstFeature(DS1LineFeature::iid());
        auto* const lines = dynamic_cast<DS1LineFeature*>(feature.get());
        if (lines == nullptr) continue;
        for (auto line = lines->GetFirstDevice(); line.get() != nullptr;
             line = lines->GetNextDevice(line)) {
            line->GetName(name);
            std::printf("  line %s\n", name);
        }
    }
    std::fflush(stdout);
    std::_Exit(0); // the module's threads go on
}
