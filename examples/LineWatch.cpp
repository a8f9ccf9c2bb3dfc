// SPDX-License-Identifier: BSD-2-Clause
// Watches the DS1 lines of a board module. Prints every change of a line's status. For an empty
// line of standard input it prints the running interval of every line, and for a line's name that
// line's closed intervals.
#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <iterator>
#include <string>

#include "kvloam.h"

namespace {

/// The names of the bits of a line's status, lowest first.
constexpr char const* kStatusNames[] = {
    "NoAlarm",       "RcvFarEndLOF",    "XmtFarEndLOF",  "RcvAIS",          "XmtAIS",
    "LossOfFrame",   "LossOfSignal",    "LoopbackState", "T16AIS",          "RcvFarEndLOMF",
    "XmtFarEndLOMF", "RcvTestCode",     "OtherFailure",  "UnavailSigState", "NetEquipOOS",
    "RcvPayloadAIS", "Ds2PerfThreshold"};

/// Prints line status changes. Called on a thread of the board module.
class Printer final : public DS1LineStatusListener {
  public:
    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override {
        char name[64];
        event->GetLine()->GetName(name);
        std::printf("%s:", name);
        for (std::size_t bit = 0; bit < std::size(kStatusNames); ++bit)
            if ((event->GetLineStatus() >> bit & 1) != 0) std::printf(" %s", kStatusNames[bit]);
        std::printf("\n");
        std::fflush(stdout);
        return 0;
    }
};

/// Calls `call(lines)` for the line feature of every board that has one.
template <class Call>
void forEachFeature(BoardManager& manager, Call const& call) {
    for (auto board = manager.GetFirstBoard(); board.get() != nullptr;
         board = manager.GetNextBoard(board)) {
        auto const feature = board->GetFirstFeature(DS1LineFeature::iid());
        if (auto* const lines = dynamic_cast<DS1LineFeature*>(feature.get())) call(*lines);
    }
}

void printHead(char const* first) {
    std::printf("%-20s %4s %4s %4s %4s %4s %6s %4s %4s %4s %6s\n", first, "ES", "SES", "SEFS",
                "UAS", "CSS", "PCV", "LES", "BES", "DM", "LCV");
}

void printRow(std::string const& first, DS1IntervalTable& table, int n) {
    std::printf("%-20s %4d %4d %4d %4d %4d %6d %4d %4d %4d %6d\n", first.c_str(),
                table.GetErrorSeconds(n), table.GetSeverelyErrorSeconds(n),
                table.GetSeverelyErrorFramingSeconds(n), table.GetUnavailableSeconds(n),
                table.GetControlledSlipSeconds(n), table.GetPathCodingViolations(n),
                table.GetLineErrorSeconds(n), table.GetBurstyErrorSeconds(n),
                table.GetDegradedMinutes(n), table.GetLineCodeViolations(n));
}

void printRunningIntervals(BoardManager& manager) {
    printHead("running interval");
    forEachFeature(manager, [](DS1LineFeature& lines) {
        for (auto line = lines.GetFirstDevice(); line.get() != nullptr;
             line = lines.GetNextDevice(line)) {
            char name[64];
            line->GetName(name);
            printRow(name, *line->GetIntervalTable().get(), 0);
        }
    });
}

void printHistory(BoardManager& manager, std::string const& name) {
    bool found = false;
    forEachFeature(manager, [&](DS1LineFeature& lines) {
        auto const line = lines.Find(name.c_str());
        if (found || line.get() == nullptr) return;
        found = true;
        auto const table = line->GetIntervalTable();
        printHead("intervals ago");
        for (int n = 0; n <= table->GetValidIntervals(); ++n)
            printRow(std::to_string(n), *table.get(), n);
    });
    if (!found) std::printf("no line is called \"%s\"\n", name.c_str());
}

BoardFactory* load(char const* file) {
    void* const module = dlopen(file, RTLD_NOW);
    void* const entry = module == nullptr ? nullptr : dlsym(module, KVL_BOARD_MODULE_ENTRY_POINT);
    if (entry == nullptr) {
        std::fprintf(stderr, "%s; name a board module as the first argument\n", dlerror());
        return nullptr;
    }
    return reinterpret_cast<KVLCreateBoardFactory*>(entry)(KVL_BOARD_MODULE_ABI_VERSION);
}

} // namespace

int main(int argc, char** argv) {
    ReferenceCounter<BoardFactory> const factory(load(argc > 1 ? argv[1] : "z7simkvl.so"));
    if (factory.get() == nullptr) return 1;
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    manager->Attach(factory);
    Printer printer;
    forEachFeature(*manager.get(),
                   [&](DS1LineFeature& lines) { lines.AddLineStatusListener(&printer); });
    printRunningIntervals(*manager.get());
    std::fflush(stdout);
    for (std::string name; std::getline(std::cin, name); std::fflush(stdout)) {
        if (name.empty())
            printRunningIntervals(*manager.get());
        else
            printHistory(*manager.get(), name);
    }
    std::_Exit(0); // destroys nothing: another thread may be delivering a change
}
