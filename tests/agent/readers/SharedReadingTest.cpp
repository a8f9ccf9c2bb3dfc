// SPDX-License-Identifier: BSD-2-Clause
// Readings that share what has not changed, against readings of everything, while the simulated
// platform changes at random.
#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "LineClocks.h"
#include "agent/readers/BoardSource.h"
#include "agent/readers/BoardTurns.h"
#include "agent/readers/EntityReader.h"
#include "agent/readers/InterfaceReader.h"
#include "agent/readers/PlatformReader.h"
#include "agent/readers/ResourceReader.h"
#include "agent/readers/StableIndices.h"
#include "agent/readers/Whereabouts.h"
#include "agent/rows/Snapshot.h"
#include "board/DS1LineFeature.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/LogCapture.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/StillLineScheduler.h"

namespace kvloamd {
namespace {

/// Sanitizers make everything ten to twenty times slower.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr int kSteps = 4'000;
#else
constexpr int kSteps = 100'000;
#endif

/// A reading after every change would take minutes.
constexpr int kChangesOfAReading = 10;

constexpr long kStarted = 3600;
/// The seconds of the lines and of the readers.
std::atomic<long> s_seconds{kStarted};
/// The date at which these seconds begin. A step of the system's clock changes it.
std::atomic<long> s_epoch{1'763'800'000};

long dateOfLines() {
    return s_epoch + s_seconds;
}

/// The clocks of the readers. They stand still between two readings, however slow the machine is.
Clocks readersClocks() {
    return {[] { return Clock::time_point(std::chrono::seconds(s_seconds)); },
            [] { return std::chrono::milliseconds(std::chrono::seconds(dateOfLines())); }};
}

/// Tells the source and the turns what the agent's listener tells them.
class Listener final : public BoardStatusListener {
  public:
    std::function<void(ReferenceCounter<Board>, BoardStatusEnum)> heard;

    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        heard(event->GetBoard(), event->GetBoardStatus());
        return 0;
    }
};

/// All readers of an agent.
class Reading {
  public:
    /// `turns`: null reads everything every time.
    Reading(BoardManager& manager, Clock::time_point started, BoardTurns* turns)
        : m_source(manager, turns),
          m_interfaces(manager, m_indices, started, turns, readersClocks()),
          m_resources(manager, turns),
          m_isFull(turns == nullptr),
          m_started(started) {}

    BoardSource& source() { return m_source; }
    Settings& settings() { return m_settings; }
    std::vector<PlacedLine> const& lines() const { return m_interfaces.lines(); }
    /// Of the last reading.
    Rows<BoardRow> const& boards() const { return m_boards; }

    Snapshot read(std::vector<FaultRow> const& faults) {
        Snapshot snapshot;
        snapshot.boards = m_boards = m_source.read();
        snapshot.records = m_platform.read(snapshot.boards);
        snapshot.interfaces = m_interfaces.read(snapshot.boards);
        snapshot.resources = m_resources.read(snapshot.boards);
        snapshot.faults.rows = faults;
        if (!m_entities || m_isFull)
            m_entities.emplace(m_entityIndices, m_settings, m_started,
                               [] { return 1'000'000'000L; });
        snapshot.entities = m_entities->read(snapshot);
        noteWhereabouts(snapshot);
        return snapshot;
    }

  private:
    BoardSource m_source;
    Rows<BoardRow> m_boards;
    StableIndices m_indices{1000};
    InterfaceReader m_interfaces;
    ResourceReader m_resources;
    PlatformReader m_platform{std::chrono::milliseconds(0), false};
    StableIndices m_entityIndices{1};
    Settings m_settings;
    bool m_isFull;
    Clock::time_point m_started;
    std::optional<EntityReader> m_entities;
};

std::vector<LineCounts> countsOf(ClosedIntervals const& closed) {
    std::vector<LineCounts> all;
    for (std::size_t i = 0; i < closed.counts.size(); ++i)
        all.push_back(closed.counts[i]);
    return all;
}

bool isSame(LineRow one, LineRow const& other) {
    if (one.closed != nullptr && other.closed != nullptr) {
        ClosedIntervals const& a = *one.closed;
        ClosedIntervals const& b = *other.closed;
        if (countsOf(a) == countsOf(b) && a.valid == b.valid && a.total == b.total)
            one.closed = other.closed;
    }
    return one == other;
}

template <class Row>
bool isSame(Row const& one, Row const& other) {
    return one == other;
}

/// Appends the name of a table whose rows differ, with the first of the rows that do.
template <class Row>
void compareRows(char const* name, Rows<Row> const& shared, Rows<Row> const& full,
                 std::string& difference) {
    if (shared.size() != full.size()) {
        difference += std::string(name) + " has " + std::to_string(shared.size()) + " rows, not " +
                      std::to_string(full.size()) + "; ";
        return;
    }
    for (std::size_t i = 0; i < shared.size(); ++i) {
        if (isSame(shared[i], full[i])) continue;
        difference += std::string(name) + " differs in row " + std::to_string(i) + "; ";
        return;
    }
}

/// Appends whether the lines are others, or in other places.
void compareLines(std::vector<PlacedLine> const& shared, std::vector<PlacedLine> const& full,
                  std::string& difference) {
    auto const isSame = [](PlacedLine const& one, PlacedLine const& other) {
        return one.ifIndex == other.ifIndex && one.line.get() == other.line.get() &&
               one.boardIndex == other.boardIndex;
    };
    if (!std::ranges::equal(shared, full, isSame)) difference += "the lines' objects differ; ";
}

/// Empty when both say the same.
std::string difference(Snapshot const& shared, Snapshot const& full) {
    std::string found;
    InterfaceRows const& a = shared.interfaces;
    InterfaceRows const& b = full.interfaces;
    compareRows("boards", shared.boards, full.boards, found);
    compareRows("resources", shared.resources, full.resources, found);
    compareRows("interfaces", a.interfaces, b.interfaces, found);
    compareRows("stack", a.stack, b.stack, found);
    compareRows("lines", a.lines, b.lines, found);
    compareRows("bearers", a.bearers, b.bearers, found);
    compareRows("ds0Channels", a.ds0Channels, b.ds0Channels, found);
    compareRows("signalling", a.signalling, b.signalling, found);
    compareRows("lapds", a.lapds, b.lapds, found);
    compareRows("ethernets", a.ethernets, b.ethernets, found);
    compareRows("receiveAddresses", a.receiveAddresses, b.receiveAddresses, found);
    compareRows("ports", a.ports, b.ports, found);
    if (a.intervalsBefore != b.intervalsBefore) found += "the intervals before lines differ; ";
    if (a.lastChange != b.lastChange) found += "the last change of interfaces differs; ";
    if (a.stackLastChange != b.stackLastChange) found += "the last change of the stack differs; ";
    compareRows("entities", shared.entities.physical->entities, full.entities.physical->entities,
                found);
    compareRows("contains", shared.entities.physical->contains, full.entities.physical->contains,
                found);
    compareRows("aliases", shared.entities.physical->aliases, full.entities.physical->aliases,
                found);
    compareRows("states", shared.entities.states, full.entities.states, found);
    if (shared.entities.ofBoards != full.entities.ofBoards) found += "entities of boards differ; ";
    if (shared.entities.ofInterfaces != full.entities.ofInterfaces)
        found += "entities of interfaces differ; ";
    return found;
}

constexpr char const* kBoardOne =
    R"({handle: 1, attributes: {SERIAL_NUMBER: S1, NAME: one, PCI_SLOT_NUMBER: 1}, devices: [)"
    R"({handle: 11, type: 501, attributes: {NAME: line-1, CIRCUIT: c-1}, line: {type: esf}},)"
    R"({handle: 12, type: 501, attributes: {NAME: line-2}, line: {type: d4}}]})";
constexpr char const* kBoardTwo =
    R"({handle: 2, attributes: {SERIAL_NUMBER: S2, NAME: two, PCI_SLOT_NUMBER: 2}, devices: [)"
    R"({handle: 21, type: 501, attributes: {NAME: line-1}, line: {type: e1-crc}},)"
    R"({handle: 22, type: 503, attributes: {NAME: voice, GAIN: 3}}],)"
    R"( processors: [{handle: 29, attributes: {NAME: cpu, PROC_NUM: 0}}]})";
constexpr char const* kBoardThree =
    R"({handle: 3, attributes: {SERIAL_NUMBER: S3, NAME: three, PCI_SLOT_NUMBER: 3,)"
    R"( ETHERNET_ADDRESS: "02:00:5e:00:00:03", ETHERNET_SPEED: 100000000,)"
    R"( ETHERNET_OPER_STATUS: 1, ETHERNET_IN_OCTETS: 1, IP_ADDRESS_0: 192.0.2.3,)"
    R"( IP_MASK_0: 255.255.255.0}})";
constexpr char const* kBoardFour =
    R"({handle: 4, attributes: {SERIAL_NUMBER: S4, NAME: four}, devices: [)"
    R"({handle: 41, type: 514, attributes: {NAME: line-1, Protocol_Type_0: 4},)"
    R"( line: {type: e1-crc}, channels: {bearers: 3}}]})";
constexpr std::array kBoards{kBoardOne, kBoardTwo, kBoardThree, kBoardFour};
constexpr std::array kLines{11, 12, 21, 41};

/// Changes the platform at random. What cannot be done now is refused, and changes nothing.
class Platform {
  public:
    Platform(unsigned seed, OpenFactory& factory, StillLineScheduler& scheduler)
        : m_random(seed), m_factory(factory), m_scheduler(scheduler) {}

    static void load() {
        std::string text = "boards:\n";
        for (char const* const board : kBoards)
            text += std::string("  - ") + board + "\n";
        kvlsim::loadChassis(text);
    }

    /// Makes one change. Returns what it was.
    std::string change(Reading& first, Reading& second, std::vector<FaultRow>& faults) {
        int const board = number(1, 4);
        int const line = kLines[static_cast<std::size_t>(number(0, 3))];
        switch (number(0, 23)) {
        case 0:
        case 21:
        case 22:
            return command({{"command", "start"}, {"board", board}});
        case 1:
            return command({{"command", "stop"}, {"board", board}});
        case 2:
            if (number(0, 1) != 0) return "nothing";
            return command({{"command", "fail"}, {"board", board}});
        case 3:
            if (number(0, 3) != 0) return "nothing";
            return command({{"command", "remove"}, {"board", board}});
        case 4: {
            nlohmann::json description = described(board);
            return command({{"command", "insert"}, {"board", description}});
        }
        case 5:
            if (number(0, 3) != 0) return "nothing";
            return command({{"command", "replace"},
                            {"board", board},
                            {"serial", "S" + std::to_string(number(1, 9))}});
        case 6: // shows when the board starts; a start of a board that runs is not announced
            return set(board, "NAME", "board-" + std::to_string(number(0, 3))) +
                   command({{"command", "stop"}, {"board", board}}) +
                   command({{"command", "start"}, {"board", board}});
        case 7:
            return set(line, "NAME", "line-" + std::to_string(number(0, 3)));
        case 8: // nobody announces these
            return set(3, "ETHERNET_IN_OCTETS", number(0, 1'000'000));
        case 9:
            return set(3, "ETHERNET_OPER_STATUS", number(1, 2));
        case 10: {
            char const* const alarms[] = {"los", "lof", "ais", "rai", "loopback"};
            return command({{"command", "line-alarm"},
                            {"line", line},
                            {"alarm", alarms[number(0, 4)]},
                            {"clear", number(0, 2) != 0}});
        }
        case 11:
            return command({{"command", "line-mend"}, {"line", line}});
        case 12:
            return command({{"command", "line-errors"},
                            {"line", line},
                            {"errors", {{"code-violations", number(1, 90)}}}});
        case 13:
            return command({{"command", "line-rates"},
                            {"line", line},
                            {"rates", {{"path-violations", number(0, 3)}}}});
        case 14:
            return command({{"command", "call-setup"}, {"trunk", 41}, {"peer", "555"}});
        case 15:
            return command({{"command", "call-release"}, {"trunk", 41}, {"channel", number(1, 3)}});
        case 16:
            return command({{"command", "call-charge"},
                            {"trunk", 41},
                            {"channel", number(1, 3)},
                            {"units", number(1, 5)}});
        case 17: {
            char const* const states[] = {"inactive", "l1-active", "l2-active"};
            return command(
                {{"command", "call-signalling"}, {"trunk", 41}, {"state", states[number(0, 2)]}});
        }
        case 18:
            return setTraps(first);
        case 19:
            return alias(first, second);
        case 20:
            return faulty(first, faults);
        default:
            return pass();
        }
    }

  private:
    int number(int least, int most) { return std::uniform_int_distribution(least, most)(m_random); }

    static std::string command(nlohmann::json const& command) {
        bool const ok = kvlsim::execute(command).value("ok", false);
        sim::drain();
        return command.dump() + (ok ? "" : " (refused)");
    }
    static std::string set(int object, char const* attribute, nlohmann::json const& value) {
        return command(
            {{"command", "set"}, {"object", object}, {"attribute", attribute}, {"value", value}});
    }
    /// The board as the control commands take it.
    static nlohmann::json described(int board) {
        static nlohmann::json const boards[] = {
            {{"handle", 1},
             {"attributes", {{"SERIAL_NUMBER", "S1"}, {"NAME", "one"}, {"PCI_SLOT_NUMBER", 1}}},
             {"devices",
              {{{"handle", 11},
                {"type", 501},
                {"attributes", {{"NAME", "line-1"}}},
                {"line", {{"type", "esf"}}}},
               {{"handle", 12},
                {"type", 501},
                {"attributes", {{"NAME", "line-2"}}},
                {"line", {{"type", "esf"}}}}}}},
            {{"handle", 2},
             {"attributes", {{"SERIAL_NUMBER", "S2"}, {"NAME", "two"}, {"PCI_SLOT_NUMBER", 1}}},
             {"devices",
              {{{"handle", 21},
                {"type", 501},
                {"attributes", {{"NAME", "line-1"}}},
                {"line", {{"type", "e1-crc"}}}}}}},
            {{"handle", 3},
             {"attributes",
              {{"SERIAL_NUMBER", "S3"},
               {"NAME", "three"},
               {"ETHERNET_ADDRESS", "02:00:5e:00:00:03"},
               {"ETHERNET_SPEED", 100000000},
               {"ETHERNET_OPER_STATUS", 1}}}},
            {{"handle", 4},
             {"attributes", {{"SERIAL_NUMBER", "S4"}, {"NAME", "four"}}},
             {"devices",
              {{{"handle", 41},
                {"type", 514},
                {"attributes", {{"NAME", "line-1"}}},
                {"line", {{"type", "e1-crc"}}},
                {"channels", {{"bearers", 3}}}}}}}};
        return boards[board - 1];
    }
    /// An operator sets whether a line's changes are notified.
    std::string setTraps(Reading& reading) {
        auto const& lines = reading.lines();
        if (lines.empty()) return "nothing";
        auto const place = static_cast<std::size_t>(number(0, static_cast<int>(lines.size()) - 1));
        lines[place].line.get()->SetLineStatusChangeTrapEnable(number(1, 2));
        return "traps of line " + std::to_string(lines[place].ifIndex);
    }
    std::string alias(Reading& first, Reading& second) {
        SettingKey const key{Setting::EntityAlias, static_cast<std::uint32_t>(number(1, 60))};
        std::string const text = "alias " + std::to_string(number(0, 3));
        first.settings().exchange(key, text);
        second.settings().exchange(key, text);
        return text;
    }
    std::string faulty(Reading const& reading, std::vector<FaultRow>& faults) {
        faults.clear();
        if (number(0, 1) == 0 || reading.boards().empty()) return "no fault";
        int const last = static_cast<int>(reading.boards().size()) - 1;
        auto const place = static_cast<std::size_t>(number(0, last));
        faults.push_back({});
        faults.back().boardIndex = reading.boards()[place].boardIndex;
        faults.back().value = 7;
        return "a fault";
    }
    /// Time passes, the system's clock is set, or boards are pinged.
    std::string pass() {
        switch (number(0, 9)) {
        case 0:
            s_epoch = s_epoch + number(-5000, 5000);
            return "a clock step";
        case 1:
            m_factory.ping_boards();
            return "a ping";
        default:
            break;
        }
        int const seconds = number(0, 200) == 0 ? 950 : number(1, 12);
        for (int i = 0; i < seconds; ++i) {
            ++s_seconds;
            m_scheduler.pass(s_seconds);
        }
        return std::to_string(seconds) + " seconds";
    }

    std::mt19937 m_random;
    OpenFactory& m_factory;
    StillLineScheduler& m_scheduler;
};

TEST(SharedReadingTest, SharingShowsWhatReadingEverythingShows) {
    LogCapture const quiet;
    StillLineScheduler& scheduler = StillLineScheduler::install();
    LineClocks::inUse() = {dateOfLines, [] { return s_seconds.load(); }};
    kvlsim::setLineClock([] { return std::chrono::nanoseconds(std::chrono::seconds(s_seconds)); });
    Platform::load();
    auto* const factory = new OpenFactory;
    factory->SetPingInterval(0);
    ReferenceCounter<BoardFactory> const factoryHandle(factory);
    auto* const manager = new BoardManager; // as in the agent, never destroyed
    static ReferenceCounter<BoardManager> const managerHandle(manager);

    Clock::time_point const started{std::chrono::seconds(kStarted)};
    static BoardTurns turns;
    static auto* const shared = new Reading(*manager, started, &turns);
    static auto* const full = new Reading(*manager, started, nullptr);
    static Listener listener;
    listener.heard = [&](ReferenceCounter<Board> const& board, BoardStatusEnum status) {
        int const index = manager->GetIndexByBoard(board);
        if (index == 0) return;
        if (status == BoardStatusRemoved) {
            shared->source().boardHasGone(index);
            full->source().boardHasGone(index);
        }
        turns.note(static_cast<std::uint32_t>(index));
    };
    manager->AddBoardStatusListener(&listener);
    manager->Attach(factoryHandle);

    unsigned const seed = 20251122;
    Platform platform(seed, *factory, scheduler);
    std::vector<FaultRow> faults;
    std::string since;
    std::size_t shownLines = 0;
    Snapshot former;
    Snapshot formerInFull;
    for (int step = 0; step < kSteps; ++step) {
        since += platform.change(*shared, *full, faults) + "\n";
        if (step % kChangesOfAReading != 0) continue;
        Snapshot const one = shared->read(faults);
        Snapshot const other = full->read(faults);
        std::string different = difference(one, other);
        compareLines(shared->lines(), full->lines(), different);
        ASSERT_EQ(different, "") << "step " << step << ", after\n" << since;
        ASSERT_EQ(difference(former, formerInFull), "")
            << "the snapshot before step " << step << " has changed, after\n"
            << since;
        former = one;
        formerInFull = other;
        since.clear();
        shownLines += one.interfaces.lines.size();
    }
    // Boards come, go and fail all the time, and yet there is mostly something to compare.
    EXPECT_GT(shownLines, static_cast<std::size_t>(kSteps / kChangesOfAReading));
    listener.heard = [](auto const&, auto) {};
    kvlsim::setLineClock(nullptr);
}

} // namespace
} // namespace kvloamd
