// SPDX-License-Identifier: BSD-2-Clause
// What boards offer is read from four threads while the boards stop, start, go and come, and calls
// with them.
#include <array>
#include <atomic>
#include <map>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "board/EthernetFeature.h"
#include "board/IPInterface.h"
#include "board/ISDNFeature.h"
#include "board/InterfaceFeature.h"
#include "core/ReferenceTable.h"
#include "tests/modules/z7sim/FaultLog.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/KeptForGood.h"
#include "tests/support/SimulatedPlatform.h"
#include "z7/Z7ResourceFeature.h"

namespace {

constexpr int kBoards = 4;
constexpr int kTrunks = 2;
constexpr int kBearers = 4;
constexpr int kChanges = 5000;
constexpr int kReaders = 4;

int trunkOf(int board, int number) {
    return board * 100 + number;
}

/// A board with two trunks, a voice device, and an interface of each kind.
sim::Json description(int board) {
    sim::Json devices = {
        {{"handle", board * 100 + 50}, {"type", 503}, {"attributes", {{"GAIN", 5}}}}};
    for (int number = 1; number <= kTrunks; ++number)
        devices.push_back({{"handle", trunkOf(board, number)},
                           {"type", 514},
                           {"attributes", {{"NAME", "trunk-" + std::to_string(number)}}},
                           {"channels", {{"bearers", kBearers}}}});
    return {{"handle", board},
            {"attributes",
             {{"SERIAL_NUMBER", "S" + std::to_string(board)},
              {"ETHERNET_DEVICE", "lo"},
              {"IP_ADDRESS_0", "192.0.2.1"}}},
            {"devices", devices}};
}

/// Judges every status change. Added to features and channels, it outlives them all.
class ChannelListener final : public ISDNChannelStatusListener {
  public:
    explicit ChannelListener(FaultLog& faults) : m_faults(faults) {}
    int ProcessBChannelStatusEvent(ReferenceCounter<ISDNBChannelStatusEvent> event) override {
        judge(event->GetChannelStatus() == event->GetBChannel()->GetOperStatus(), "bearer event");
        ++m_heard;
        return 0;
    }
    int ProcessDChannelStatusEvent(ReferenceCounter<ISDNDChannelStatusEvent> event) override {
        judge(event->GetChannelStatus() == event->GetDChannel()->GetOperStatus(), "D event");
        ++m_heard;
        return 0;
    }
    long heard() const { return m_heard; }

  private:
    void judge(bool good, char const* what) {
        if (!good) m_faults.add(what);
    }
    FaultLog& m_faults;
    std::atomic<long> m_heard{0};
};

/// Walks everything that a board offers and judges the answers.
class Reader {
  public:
    Reader(FaultLog& faults, ChannelListener& listener) : m_faults(faults), m_listener(listener) {}

    void read(Board& board) {
        if (auto const found = board.GetFirstFeature(ISDNFeature::iid()); found.get() != nullptr)
            channels(*static_cast<ISDNFeature*>(found.get()));
        if (auto const found = board.GetFirstFeature(Z7ResourceFeature::iid());
            found.get() != nullptr)
            devices(*static_cast<Z7ResourceFeature*>(found.get()));
        if (auto const found = board.GetFirstFeature(KVL::EthernetFeature::iid());
            found.get() != nullptr)
            ethernet(*static_cast<KVL::EthernetFeature*>(found.get()));
        if (auto const found = board.GetFirstFeature(KVL::InterfaceFeature::iid());
            found.get() != nullptr)
            addresses(*static_cast<KVL::InterfaceFeature*>(found.get()));
    }

  private:
    void channels(ISDNFeature& feature) {
        feature.AddISDNStatusListener(&m_listener);
        int count = 0;
        for (auto channel = feature.GetFirstBChannel(); channel.get() != nullptr;
             channel = feature.GetNextBChannel(channel), ++count) {
            char name[64];
            channel->GetName(name);
            judge(std::string(name) == "B" + std::to_string(count / kBearers + 1) + "." +
                                           std::to_string(channel->GetChannelNumber()),
                  name);
            int const status = channel->GetOperStatus();
            judge(status >= ISDNBChannelStatusIdle && status <= ISDNBChannelStatusActive,
                  "bearer status " + std::to_string(status));
        }
        // A board that was pulled while its features were made may lack trunks, but not bearers.
        judge(count % kBearers == 0, std::to_string(count) + " bearers");
        int const trunks = count / kBearers;
        count = 0;
        for (auto channel = feature.GetFirstDChannel(); channel.get() != nullptr;
             channel = feature.GetNextDChannel(channel), ++count) {
            int const status = channel->GetOperStatus();
            judge(status >= ISDNDChannelStatusInactive && status <= ISDNDChannelStatusL2Active,
                  "signalling status " + std::to_string(status));
            channel->AddISDNStatusListener(&m_listener);
        }
        judge(count == trunks, std::to_string(count) + " signalling channels");
    }
    void devices(Z7ResourceFeature& feature) {
        int count = 0;
        for (auto device = feature.GetFirstDevice(); device.get() != nullptr;
             device = feature.GetNextDevice(device), ++count) {
            if (device->interfaces()->is_element(Z7VoiceDevice::iid()))
                judge(static_cast<Z7VoiceDevice*>(device.get())->GetGain() == 5, "gain");
            if (device->interfaces()->is_element(Z7ISDNDevice::iid())) {
                auto* const trunk = static_cast<Z7ISDNDevice*>(device.get());
                judge(trunk->GetBChannelCount() == kBearers, "bearer count");
                judge(trunk->GetDChannelStatus() >= ISDNDChannelStatusInactive, "trunk's status");
            }
        }
        judge(count == kTrunks + 1, std::to_string(count) + " devices");
    }
    void ethernet(KVL::EthernetFeature& feature) {
        judge(feature.GetFirstEthernet()->GetType() == 24, "Ethernet type");
    }
    void addresses(KVL::InterfaceFeature& feature) {
        auto const interface = feature.GetFirstInterface();
        auto* const ip = static_cast<KVL::IPInterface*>(interface.get());
        judge(ip->GetFirstIPAddressConfig()->GetAddress().octet(0) == 192, "address");
    }
    void judge(bool good, std::string const& what) {
        if (!good) m_faults.add(what);
    }

    FaultLog& m_faults;
    ChannelListener& m_listener;
};

/// Changes boards and calls in a fixed sequence. Only the reading threads are not deterministic.
class Storm {
  public:
    Storm() {
        sim::Json boards = sim::Json::array();
        for (int board = 1; board <= kBoards; ++board)
            boards.push_back(description(board));
        kvlsim::loadChassis(sim::Json{{"boards", boards}}.dump());
    }

    void blow() {
        int const board = pick(kBoards) + 1;
        bool& present = m_present.at(static_cast<std::size_t>(board));
        if (!present) {
            sim::command({{"command", "insert"}, {"board", description(board)}});
            present = true;
            return;
        }
        switch (pick(16)) {
        case 0:
            sim::command({{"command", "stop"}, {"board", board}});
            break;
        case 1:
        case 2:
            sim::command({{"command", "start"}, {"board", board}});
            break;
        case 3:
            sim::command({{"command", "fail"}, {"board", board}});
            break;
        case 4:
            sim::command({{"command", "remove"}, {"board", board}});
            present = false;
            break;
        case 5: // silent, or answering again: what the pings are to notice
            sim::set(board, "BOARD_PRESENT", pick(2));
            break;
        case 6:
            sim::command({{"command", "call-signalling"},
                          {"trunk", anyTrunk(board)},
                          {"state", std::array{"inactive", "l1", "l2"}.at(any(3))}});
            break;
        case 7:
            sim::command({{"command", "call-release"}, {"trunk", anyTrunk(board)}, {"all", true}});
            break;
        default: // refused when the channel is not idle
            kvlsim::execute({{"command", "call-setup"},
                             {"trunk", anyTrunk(board)},
                             {"channel", pick(kBearers) + 1}});
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
    std::size_t any(std::size_t choices) { return m_random() % choices; }
    int pick(int choices) { return static_cast<int>(any(static_cast<std::size_t>(choices))); }
    int anyTrunk(int board) { return trunkOf(board, pick(kTrunks) + 1); }

    std::minstd_rand m_random{20240302};
    std::array<bool, kBoards + 1> m_present = [] {
        std::array<bool, kBoards + 1> all{};
        all.fill(true);
        return all;
    }();
};

/// The states of all channels, per trunk, as the platform has them: "active idle idle idle l2".
std::map<int, std::string> statesOfThePlatform() {
    std::map<int, std::string> states;
    sim::Json const reply = sim::command({{"command", "call-list"}});
    for (auto const& trunk : reply["trunks"]) {
        std::string& text = states[trunk["trunk"].get<int>()];
        for (auto const& channel : trunk["channels"])
            text += channel.get<std::string>() + " ";
        text += trunk["signalling"].get<std::string>();
    }
    return states;
}

/// The same as the boards have them.
std::map<int, std::string> statesOfTheBoards(BoardManager& manager) {
    constexpr std::array kBearer = {"?", "idle", "connecting", "connected", "active"};
    constexpr std::array kSignalling = {"?", "inactive", "l1", "l2"};
    std::map<int, std::string> states;
    for (auto board = manager.GetFirstBoard(); board.get() != nullptr;
         board = manager.GetNextBoard(board)) {
        auto const found = board->GetFirstFeature(ISDNFeature::iid());
        if (found.get() == nullptr) continue;
        auto* const feature = static_cast<ISDNFeature*>(found.get());
        int bearers = 0;
        for (auto channel = feature->GetFirstBChannel(); channel.get() != nullptr;
             channel = feature->GetNextBChannel(channel), ++bearers)
            states[trunkOf(channel->GetBoardIndex(), bearers / kBearers + 1)] +=
                std::string(kBearer.at(static_cast<std::size_t>(channel->GetOperStatus()))) + " ";
        int trunks = 0;
        for (auto channel = feature->GetFirstDChannel(); channel.get() != nullptr;
             channel = feature->GetNextDChannel(channel))
            states[trunkOf(channel->GetBoardIndex(), ++trunks)] +=
                kSignalling.at(static_cast<std::size_t>(channel->GetOperStatus()));
    }
    return states;
}

TEST(FeatureStormTest, ChannelsAndDevicesAreWholeFromFourThreads) {
    auto& faults = keptForGood<FaultLog>();
    auto& listener = keptForGood<ChannelListener>(faults);
    Storm storm;
    auto* const factory = new OpenFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    ReferenceCounter<BoardManager> manager(new BoardManager);
    factory->SetPingInterval(0);
    manager->Attach(handle);
    storm.calm(); // other factories of this program find the boards as well
    int const objects = ReferenceTable::get_instance()->referenced_objects();

    std::atomic<bool> over{false};
    std::atomic<long> reads{0};
    std::vector<std::thread> threads;
    for (int i = 0; i < kReaders; ++i)
        threads.emplace_back([&] {
            Reader reader(faults, listener);
            while (!over)
                for (auto board = manager->GetFirstBoard(); board.get() != nullptr;
                     board = manager->GetNextBoard(board), ++reads)
                    reader.read(*board.operator->());
        });
    threads.emplace_back([&] {
        while (!over)
            factory->ping_boards();
    });

    for (int change = 0; change < kChanges; ++change) {
        storm.blow();
        if (change % 16 == 0) sim::drain(); // the chassis must not run far ahead of its messages
    }
    storm.calm();
    over = true;
    for (auto& thread : threads)
        thread.join();

    EXPECT_EQ(faults.first(), "");
    EXPECT_GT(reads, 0);
    EXPECT_GT(listener.heard(), 0);
    EXPECT_EQ(statesOfTheBoards(*manager.get()), statesOfThePlatform());
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), objects);
    manager = {};
}

} // namespace
