// SPDX-License-Identifier: BSD-2-Clause
// Boards: walks, and the road of an administrative event.
#include <algorithm>
#include <map>
#include <memory>

#include <benchmark/benchmark.h>

#include "BenchBoards.h"
#include "PeerModel.h"
#include "board/BoardManager.h"

namespace {

constexpr int kBoards = 10000;
/// What a full chassis holds.
constexpr int kFewBoards = 16;

/// The agent's end of the road.
class CountingListener final : public BoardStatusListener {
  public:
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        m_sum += event->GetBoardStatus();
        return 0;
    }
    long sum() const { return m_sum; }

  private:
    long m_sum = 0;
};

class PeerListener final : public peer::StatusListener {
  public:
    void process(std::shared_ptr<peer::StatusEvent> event) override { m_sum += event->status; }
    long sum() const { return m_sum; }

  private:
    long m_sum = 0;
};

/// A manager with one factory of `boards` boards. Kept for the whole run, as a factory is.
struct Chassis {
    Chassis(int boards, bool listens) : factory(new BenchFactory(boards, listens)) {
        manager.Attach(ReferenceCounter<BoardFactory>(factory.get()));
        manager.AddBoardStatusListener(&listener);
    }

    ReferenceCounter<BenchFactory> factory;
    CountingListener listener;
    BoardManager manager;
};

struct PeerChassis {
    explicit PeerChassis(int boards) : factory(boards), manager(factory) {
        adaptor.add(&factory);
        manager.listeners().add(&listener);
    }

    peer::Factory factory;
    PeerListener listener;
    peer::Manager manager;
    peer::Adaptor adaptor;
};

Chassis& largeChassis() {
    static auto* const one = new Chassis(kBoards, false);
    return *one;
}

PeerChassis& largePeerChassis() {
    static auto* const one = new PeerChassis(kBoards);
    return *one;
}

void walkByIndexOurs(benchmark::State& state) {
    BoardManager& manager = largeChassis().manager;
    for (auto _ : state)
        for (int i = manager.GetFirstBoardIndex(); i != 0; i = manager.GetNextBoardIndex(i)) {
            ReferenceCounter<Board> const board = manager.GetBoardByIndex(i);
            benchmark::DoNotOptimize(&board);
        }
}

/// One pass over a map of our own handles, with a handle copied at each step.
void walkByIndexPeer(benchmark::State& state) {
    std::map<int, ReferenceCounter<Board>> boards;
    BoardManager& manager = largeChassis().manager;
    for (int i = manager.GetFirstBoardIndex(); i != 0; i = manager.GetNextBoardIndex(i))
        boards.emplace(i, manager.GetBoardByIndex(i));
    for (auto _ : state)
        for (auto const& [index, entry] : boards) {
            ReferenceCounter<Board> const board = entry;
            benchmark::DoNotOptimize(&board);
        }
}

/// The same pass over shared pointers, for comparison.
void walkSharedPeer(benchmark::State& state) {
    auto const& boards = largePeerChassis().factory.boards();
    for (auto _ : state)
        for (auto const& [index, entry] : boards) {
            std::shared_ptr<peer::Board> const board = entry;
            benchmark::DoNotOptimize(&board);
        }
}

/// The search for the last of the boards.
void indexOfLastOurs(benchmark::State& state) {
    BoardManager& manager = largeChassis().manager;
    ReferenceCounter<Board> const last = manager.GetBoardByIndex(kBoards);
    for (auto _ : state)
        benchmark::DoNotOptimize(manager.GetIndexByBoard(last));
}

void indexOfLastPeer(benchmark::State& state) {
    auto const& boards = largePeerChassis().factory.boards();
    auto const last = boards.rbegin()->second;
    for (auto _ : state)
        benchmark::DoNotOptimize(std::find_if(
            boards.begin(), boards.end(), [&](auto const& entry) { return entry.second == last; }));
}

/// A walk by `GetNextBoard(int)` over the first `range` boards: grows as n log n.
void walkByNextBoard(benchmark::State& state) {
    auto const boards = static_cast<int>(state.range(0));
    BoardManager manager;
    ReferenceCounter<BenchFactory> const factory(new BenchFactory(boards, false));
    manager.Attach(ReferenceCounter<BoardFactory>(factory.get()));
    for (auto _ : state)
        for (int i = manager.GetFirstBoardIndex(); i != 0; ++i) {
            ReferenceCounter<Board> const board = manager.GetNextBoard(i);
            if (board.get() == nullptr) break;
        }
    state.SetComplexityN(boards);
}

void oneEventOurs(benchmark::State& state) {
    // The adaptor lives as long as the process, so its listeners must, too.
    static auto* const chassis = new Chassis(kFewBoards, true);
    auto const adaptor = ExternalEventAdaptor::get_instance();
    std::int32_t board = 0;
    AdminCallbackMsg message{AdminBoardStopped, {}, &board};
    for (auto _ : state) {
        board = board % kFewBoards + 1;
        adaptor->HandleEvent(&message, nullptr);
    }
    benchmark::DoNotOptimize(chassis->listener.sum());
}

void oneEventPeer(benchmark::State& state) {
    static auto* const chassis = new PeerChassis(kFewBoards);
    int board = 0;
    for (auto _ : state) {
        board = board % kFewBoards + 1;
        chassis->adaptor.handle(AdminBoardStopped, board);
    }
    benchmark::DoNotOptimize(chassis->listener.sum());
}

void notifyAllOurs(benchmark::State& state) {
    BenchFactory* const factory = largeChassis().factory.get();
    for (auto _ : state)
        factory->notify_all_boards(BoardStatusStopped);
    benchmark::DoNotOptimize(largeChassis().listener.sum());
}

void notifyAllPeer(benchmark::State& state) {
    PeerChassis& chassis = largePeerChassis();
    for (auto _ : state)
        chassis.factory.notifyAll(4);
    benchmark::DoNotOptimize(chassis.listener.sum());
}

BENCHMARK(walkByIndexOurs)->Name("walk of 10,000 boards by index/ours");
BENCHMARK(walkByIndexPeer)->Name("walk of 10,000 boards by index/peer");
BENCHMARK(walkByIndexOurs)->Name("the same walk, peer of shared pointers/ours");
BENCHMARK(walkSharedPeer)->Name("the same walk, peer of shared pointers/peer");
BENCHMARK(indexOfLastOurs)->Name("index of the last of 10,000 boards/ours");
BENCHMARK(indexOfLastPeer)->Name("index of the last of 10,000 boards/peer");
BENCHMARK(oneEventOurs)->Name("one administrative event to the agent's listener/ours");
BENCHMARK(oneEventPeer)->Name("one administrative event to the agent's listener/peer");
BENCHMARK(notifyAllOurs)->Name("one status to all of 10,000 boards/ours");
BENCHMARK(notifyAllPeer)->Name("one status to all of 10,000 boards/peer");
BENCHMARK(walkByNextBoard)
    ->Name("walk by GetNextBoard(int)")
    ->RangeMultiplier(10)
    ->Range(100, 10000)
    ->Complexity(benchmark::oNLogN);

} // namespace
