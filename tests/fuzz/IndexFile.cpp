// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the file that keeps indices and settings across restarts: the agent must serve whatever is
// in it, give every interface an index of its own, and keep them in the next run.
#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include "agent/log/Log.h"
#include "agent/readers/KeptSettings.h"
#include "agent/readers/StableIndices.h"
#include "agent/readers/StateFile.h"
#include "tests/fuzz/DatabaseFile.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"

namespace kvloamd {
namespace {

constexpr std::int64_t kToday = 20000;

/// One run of the agent, as far as its file is concerned.
struct Run {
    explicit Run(std::string const& path)
        : file(path, "interfaces", std::chrono::milliseconds::zero()),
          indices(file, 1000, {.date = [] { return kToday; }}),
          kept(file, indices, settings) {
        file.open();
    }

    std::vector<std::uint32_t> ask(std::string const& board) {
        std::vector<IndexKey> const keys{
            {IndexKind::Line, "line1"}, {IndexKind::Line, "line2"}, {IndexKind::Ethernet, "eth"}};
        auto given = indices.indicesOf({board, true}, keys);
        indices.save();
        return given;
    }

    Settings settings;
    StateFile file;
    StableIndices indices;
    KeptSettings kept;
};

/// A folder with the state of a run.
class State {
  public:
    State() {
        setLogLevel(LogLevel::Error);
        Run run(file());
        std::uint32_t const index = run.ask("A").front();
        run.settings.exchange({Setting::LinkUpDownTraps, index}, 2);
        run.kept.save();
        run.ask("B");
        m_sound = fuzz::contentsOf(file());
    }
    std::string file() const { return m_folder.file("ifindex.sqlite"); }
    std::string const& sound() const { return m_sound; }
    void clear() const {
        for (auto const& entry : std::filesystem::directory_iterator(m_folder.path()))
            std::filesystem::remove(entry);
    }

  private:
    fuzz::Folder m_folder;
    std::string m_sound;
};

void runTwice(std::string const& file) {
    std::vector<std::uint32_t> all;
    bool kept = false;
    {
        Run run(file);
        for (char const* const board : {"A", "B", "C"})
            for (std::uint32_t const index : run.ask(board))
                all.push_back(index);
        run.settings.exchange({Setting::LineStatusChangeTraps, all.front()}, 1);
        run.kept.save();
        kept = run.file.state() == Persistence::Kept;
    }
    std::vector<std::uint32_t> given;
    std::ranges::copy_if(all, std::back_inserter(given), [](std::uint32_t index) { return index; });
    std::ranges::sort(given);
    fuzz::require(std::ranges::adjacent_find(given) == given.end(), "every index is given once");
    if (!kept) return;
    Run next(file);
    std::vector<std::uint32_t> again;
    for (char const* const board : {"A", "B", "C"})
        for (std::uint32_t const index : next.ask(board))
            again.push_back(index);
    fuzz::require(again == all, "the next run gives the same indices");
}

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static kvloamd::State const state;
    fuzz::FuzzInput input(octets, size);
    bool const hasJournal = input.octet() == 'j';
    std::string const journal = hasJournal ? input.text() : std::string();
    state.clear();
    fuzz::writeFile(state.file(),
                    fuzz::databaseFile(input, state.sound(),
                                       {"block", "interface", "seen", "calendar", "setting"}));
    if (hasJournal) fuzz::writeFile(state.file() + "-journal", journal);
    kvloamd::runTwice(state.file());
    return 0;
}
