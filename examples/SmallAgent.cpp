// SPDX-License-Identifier: BSD-2-Clause
// The smallest agent: loads a board module, lists its boards, and prints their status changes until
// it reads a line, or the end, of standard input.
#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>

#include "kvloam.h"

namespace {

/// Prints status changes. Called on the thread that delivers the change, so it returns quickly.
class Printer final : public BoardStatusListener {
  public:
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        char serialNumber[256];
        event->GetBoard()->GetSerialNumber(serialNumber);
        std::printf("%s: status %d\n", serialNumber, event->GetBoardStatus());
        std::fflush(stdout);
        return 0;
    }
};

} // namespace

int main(int argc, char** argv) {
    char const* const file = argc > 1 ? argv[1] : "z7simkvl.so";
    void* const module = dlopen(file, RTLD_NOW);
    void* const entry = module == nullptr ? nullptr : dlsym(module, KVL_BOARD_MODULE_ENTRY_POINT);
    if (entry == nullptr) {
        std::fprintf(stderr, "%s; name a board module as the first argument\n", dlerror());
        return 1;
    }
    auto* const create = reinterpret_cast<KVLCreateBoardFactory*>(entry);
    ReferenceCounter<BoardFactory> const factory(create(KVL_BOARD_MODULE_ABI_VERSION));
    if (factory.get() == nullptr) {
        std::fprintf(
            stderr, "%s was built for another version of the module interface; rebuild it\n", file);
        return 1;
    }
    Printer printer;
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    manager->AddBoardStatusListener(&printer); // before Attach, to be notified of its boards too
    manager->Attach(factory);
    for (auto board = manager->GetFirstBoard(); board.get() != nullptr;
         board = manager->GetNextBoard(board)) {
        char name[256];
        board->GetName(name);
        std::printf("board %d: %s\n", manager->GetIndexByBoard(board), name);
    }
    std::fflush(stdout);
    std::getchar();
    std::_Exit(0); // destroys nothing: another thread may be delivering a change
}
