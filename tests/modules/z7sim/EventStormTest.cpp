// SPDX-License-Identifier: BSD-2-Clause
// Boards are read from four threads while an event storm goes over them.
#include <algorithm>
#include <array>
#include <atomic>
#include <random>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "core/ReferenceTable.h"
#include "tests/modules/z7sim/FaultLog.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

constexpr int kBoards = 8;
constexpr int kMessages = 10000;
constexpr int kReaders = 4;

/// What every text attribute is one of: texts of very different lengths, so that a mixture of two
/// shows.
std::array<std::string, 3> const kTexts = {std::string(7, 'a'), std::string(60, 'b'),
                                           std::string(120, 'c')};
constexpr std::array<int, 3> kNumbers = {5, 0x0BAD0BAD, -77};
constexpr std::array<std::string_view, 4> kMessageTexts = {
    "", "board does not answer", "board is reported failed by the platform",
    "another board answers in its place"};

/// Asks a board everything and judges the answers.
class Reader {
  public:
    explicit Reader(FaultLog& faults) : m_faults(faults) {}

    void read(Board& board) {
        text("name", board, &Board::GetName);
        text("model", board, &Board::GetModel);
        text("family", board, &Board::GetFamily);
        text("firmware name", board, &Board::GetFirmwareName);
        text("firmware version", board, &Board::GetFirmwareVersion);
        text("description", board, &Board::GetFunctionalDescription);
        serialNumber(ask(board, &Board::GetSerialNumber));
        std::string const message = ask(board, &Board::GetErrorMessage);
        judge(std::ranges::find(kMessageTexts, message) != kMessageTexts.end(), "message", message);
        BoardStatusEnum const status = board.GetStatus();
        judge(status == BoardStatusStarted || status == BoardStatusStopped, "status",
              std::to_string(status));
        BoardStatusEnum const secondary = board.GetSecondaryStatus();
        judge(secondary == BoardStatusNone || secondary == BoardStatusFailed, "secondary status",
              std::to_string(secondary));
        number("logical ID", board.GetLogicalID());
        number("board ID", board.GetBoardID());
        number("memory address", board.GetSharedMemoryBaseAddress());
        number("I/O address", board.GetIOBaseAddress());
        number("IRQ", board.GetIRQ());
        number("shelf", board.GetShelfID());
        number("slot", board.GetPCISlotNumber());
        number("bus", board.GetBusNumber());
        judge(board.GetDeviceChangeDate() >= 0, "date", "negative");
    }

  private:
    static std::string ask(Board& board, int (Board::*query)(char*)) {
        char buffer[256];
        (board.*query)(buffer);
        return buffer;
    }
    void judge(bool good, char const* what, std::string const& answer) {
        if (!good) m_faults.add(std::string(what) + " \"" + answer + "\"");
    }
    void text(char const* what, Board& board, int (Board::*query)(char*)) {
        std::string const answer = ask(board, query);
        bool const whole = std::ranges::find(kTexts, answer) != kTexts.end();
        // A record made just after its board has gone knows nothing.
        judge(whole || answer == "unknown", what, answer);
    }
    /// Both halves of "12-12" must agree.
    void serialNumber(std::string const& answer) {
        auto const dash = answer.find('-');
        bool const whole =
            dash != std::string::npos && answer.substr(0, dash) == answer.substr(dash + 1);
        judge(whole || answer == "unknown", "serial number", answer);
    }
    void number(char const* what, long answer) {
        judge(answer == -1 || std::ranges::find(kNumbers, answer) != kNumbers.end(), what,
              std::to_string(answer));
    }

    FaultLog& m_faults;
};

/// Reads the board of every event, as an agent's trap does, and counts the statuses.
class TrapListener final : public BoardStatusListener {
  public:
    explicit TrapListener(FaultLog& faults) : m_reader(faults) {}
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        m_reader.read(*event->GetBoard().operator->());
        ++m_heard.at(static_cast<std::size_t>(event->GetBoardStatus()));
        return 0;
    }
    int heard(BoardStatusEnum status) { return m_heard.at(static_cast<std::size_t>(status)); }

  private:
    Reader m_reader;
    std::array<std::atomic<int>, 16> m_heard{};
};

/// Changes the chassis in a fixed sequence. Only the reading threads are not deterministic.
class Storm {
  public:
    Storm() {
        std::string text = "boards:\n";
        for (int handle = 1; handle <= kBoards; ++handle)
            text += sim::board(handle, nextSerial(), attributes());
        kvlsim::loadChassis(text);
    }

    /// One change; every one is announced by at least one message.
    void blow() {
        int const board = pick(kBoards) + 1;
        bool& present = m_present.at(static_cast<std::size_t>(board));
        if (!present) {
            sim::command({{"command", "insert"}, {"board", description(board)}});
            present = true;
            return;
        }
        switch (pick(9)) {
        case 0:
            sim::command({{"command", "remove"}, {"board", board}});
            present = false;
            break;
        case 1:
            sim::command({{"command", "replace"}, {"board", board}, {"serial", nextSerial()}});
            break;
        case 2:
            sim::command({{"command", "stop"}, {"board", board}});
            break;
        case 3:
            sim::command({{"command", "fail"}, {"board", board}});
            break;
        case 4:
            sim::command({{"command", "event"}, {"id", 0x40001 + pick(4)}});
            break;
        case 5:
            sim::command({{"command", "event"}, {"id", 0x40005 + pick(6)}, {"board", board}});
            break;
        case 6: // silent, or answering again: what the pings are to notice
            sim::set(board, "BOARD_PRESENT", pick(2));
            [[fallthrough]];
        default:
            change(board);
            sim::command({{"command", "start"}, {"board", board}});
            break;
        }
    }

    /// All boards back in their places, started and answering.
    void calm() {
        for (int board = 1; board <= kBoards; ++board) {
            if (!m_present.at(static_cast<std::size_t>(board)))
                sim::command({{"command", "insert"}, {"board", description(board)}});
            sim::set(board, "BOARD_PRESENT", 1);
            sim::command({{"command", "start"}, {"board", board}});
        }
        sim::drain();
    }

  private:
    static constexpr std::array<char const*, 6> kTextNames = {
        "NAME", "FAMILY", "DESCRIPTION", "FIRMWARE_NAME", "FIRMWARE_VERSION", "FIRMWARE_NAME1"};
    static constexpr std::array<char const*, 8> kNumberNames = {
        "LOGICAL ID", "Board Id (BLT ID)", "MEMBASEADDR",     "IOBASEADDR",
        "IRQ",        "SHELF_ID",          "PCI_SLOT_NUMBER", "PCI_BUS_NUMBER"};

    int pick(int choices) { return static_cast<int>(m_random() % static_cast<unsigned>(choices)); }
    std::string const& anyText() { return kTexts.at(static_cast<std::size_t>(pick(3))); }
    int anyNumber() { return kNumbers.at(static_cast<std::size_t>(pick(3))); }
    std::string nextSerial() {
        std::string const number = std::to_string(++m_serials);
        return number + "-" + number;
    }
    std::string attributes() {
        std::string text;
        for (char const* const name : kTextNames)
            text += std::string(text.empty() ? "" : ", ") + name + ": " + anyText();
        for (char const* const name : kNumberNames)
            text += std::string(", ") + name + ": " + std::to_string(anyNumber());
        return text;
    }
    sim::Json description(int board) {
        sim::Json attributes = {{"SERIAL_NUMBER", nextSerial()}};
        for (char const* const name : kTextNames)
            attributes[name] = anyText();
        for (char const* const name : kNumberNames)
            attributes[name] = anyNumber();
        return {{"handle", board}, {"attributes", attributes}};
    }
    void change(int board) {
        sim::set(board, kTextNames.at(static_cast<std::size_t>(pick(6))), anyText());
        sim::set(board, kNumberNames.at(static_cast<std::size_t>(pick(8))), anyNumber());
    }

    std::minstd_rand m_random{20240302};
    int m_serials = 0;
    std::array<bool, kBoards + 1> m_present = [] {
        std::array<bool, kBoards + 1> all{};
        all.fill(true);
        return all;
    }();
};

int announced() {
    return sim::command({{"command", "show"}})["events"]["announced"].get<int>();
}

TEST(EventStormTest, BoardsAnswerWholeValuesFromFourThreads) {
    FaultLog faults;
    TrapListener traps(faults);
    Storm storm;
    auto* const factory = new OpenFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    ReferenceCounter<BoardManager> manager(new BoardManager);
    manager->AddBoardStatusListener(&traps);
    factory->SetPingInterval(0);
    manager->Attach(handle);
    int const objects = ReferenceTable::get_instance()->referenced_objects();

    std::atomic<bool> over{false};
    std::atomic<long> reads{0};
    std::vector<std::thread> threads;
    for (int i = 0; i < kReaders; ++i)
        threads.emplace_back([&, byIndex = i % 2 == 0] {
            Reader reader(faults);
            while (!over) {
                for (auto board = manager->GetFirstBoard(); board.get() != nullptr && !byIndex;
                     board = manager->GetNextBoard(board), ++reads)
                    reader.read(*board.operator->());
                for (int at = manager->GetFirstBoardIndex(); at != 0 && byIndex;
                     at = manager->GetNextBoardIndex(at))
                    if (auto const board = manager->GetBoardByIndex(at); board.get() != nullptr) {
                        reader.read(*board.operator->());
                        ++reads;
                    }
            }
        });
    threads.emplace_back([&] {
        while (!over)
            factory->ping_boards();
    });

    for (int const first = announced(); announced() - first < kMessages;) {
        for (int blows = 0; blows < 16; ++blows)
            storm.blow();
        sim::drain(); // the chassis must not run far ahead of the messages about it
    }
    storm.calm();
    over = true;
    for (auto& thread : threads)
        thread.join();

    EXPECT_EQ(faults.first(), "");
    EXPECT_GT(reads, 0);
    for (auto const status : {BoardStatusStarted, BoardStatusStopped, BoardStatusAdded,
                              BoardStatusRemoved, BoardStatusFailed})
        EXPECT_GT(traps.heard(status), 0) << "no board went through status " << status;
    EXPECT_EQ(manager->GetNumberOfBoards(), kBoards);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), objects);
    manager = {};
}

} // namespace
