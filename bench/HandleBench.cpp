// SPDX-License-Identifier: BSD-2-Clause
// Handles against std::shared_ptr.
#include <algorithm>
#include <array>
#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

#include <benchmark/benchmark.h>

#include "core/ReferenceCounter.h"

namespace {

class Thing : public Object {
  public:
    Thing() : Object(false) {}
};

/// The peer's object carries a virtual destructor and the like of our object's two pointers.
class Peer : public std::enable_shared_from_this<Peer> {
  public:
    Peer() = default;
    virtual ~Peer() = default;
    Peer(Peer const&) = delete;
    Peer& operator=(Peer const&) = delete;

  protected:
    void* m_fields[2] = {};
};

using Ours = ReferenceCounter<Thing>;
using Theirs = std::shared_ptr<Peer>;

template <class Handle>
Handle make();
template <>
Ours make() {
    return {new Thing};
}
template <>
Theirs make() {
    return Theirs(new Peer); // NOLINT(modernize-make-shared): two allocations, as ours
}

template <class Handle>
void copyDrop(benchmark::State& state) {
    Handle const handle = make<Handle>();
    for (auto _ : state) {
        Handle copy(handle);
        benchmark::DoNotOptimize(copy);
    }
}

template <class Handle>
void copyDropOneObject(benchmark::State& state) {
    static Handle const handle = make<Handle>();
    for (auto _ : state) {
        Handle copy(handle);
        benchmark::DoNotOptimize(copy);
    }
}

template <class Handle>
void makeDrop(benchmark::State& state) {
    for (auto _ : state) {
        Handle handle = make<Handle>();
        benchmark::DoNotOptimize(handle);
    }
}

/// A thread that drops the handles it is given.
template <class Handle>
class Dropper {
  public:
    Dropper() : m_thread([this] { run(); }) {}
    ~Dropper() {
        post({}, true);
        m_thread.join();
    }
    Dropper(Dropper const&) = delete;
    Dropper& operator=(Dropper const&) = delete;

    void drop(std::vector<Handle> handles) {
        post(std::move(handles), false);
        std::unique_lock lock(m_mutex);
        m_changed.wait(lock, [this] { return !m_posted; });
    }

  private:
    void post(std::vector<Handle> handles, bool end) {
        std::scoped_lock const lock(m_mutex);
        m_handles = std::move(handles);
        m_posted = true;
        m_end = end;
        m_changed.notify_all();
    }
    void run() {
        std::unique_lock lock(m_mutex);
        for (;;) {
            m_changed.wait(lock, [this] { return m_posted; });
            m_handles.clear();
            m_posted = false;
            m_changed.notify_all();
            if (m_end) return;
        }
    }

    std::mutex m_mutex;
    std::condition_variable m_changed;
    std::vector<Handle> m_handles;
    bool m_posted = false;
    bool m_end = false;
    std::thread m_thread;
};

template <class Handle>
void makeHereDropThere(benchmark::State& state) {
    constexpr int kBatch = 4000;
    Dropper<Handle> dropper;
    for (auto _ : state) {
        std::vector<Handle> handles;
        handles.reserve(kBatch);
        for (int i = 0; i < kBatch; ++i)
            handles.push_back(make<Handle>());
        dropper.drop(std::move(handles));
    }
    state.counters["items"] = kBatch;
}

void secondHandleOurs(benchmark::State& state) {
    Ours const handle = make<Ours>();
    Thing* const object = handle.get();
    for (auto _ : state) {
        Ours second(object);
        benchmark::DoNotOptimize(second);
    }
}

/// Without dropping it, which takes the record's lock once more. The median of a few batches
/// counts: elapsed time is all that is fine enough, and other programs may run meanwhile.
void secondHandleMaking(benchmark::State& state) {
    using Clock = std::chrono::steady_clock;
    Ours const handle = make<Ours>();
    Thing* const object = handle.get();
    std::array<std::optional<Ours>, 64> seconds;
    std::array<std::chrono::duration<double>, 31> times;
    for (auto _ : state) {
        for (auto& time : times) {
            auto const begun = Clock::now();
            for (auto& second : seconds)
                second.emplace(object);
            time = Clock::now() - begun;
            for (auto& second : seconds)
                second.reset();
        }
        std::ranges::nth_element(times, times.begin() + times.size() / 2);
        state.SetIterationTime(times[times.size() / 2].count());
    }
    state.counters["items"] = static_cast<double>(seconds.size());
}

void secondHandlePeer(benchmark::State& state) {
    Theirs const handle = make<Theirs>();
    Peer* const object = handle.get();
    for (auto _ : state) {
        Theirs second = object->shared_from_this();
        benchmark::DoNotOptimize(second);
    }
}

BENCHMARK(copyDrop<Ours>)->Name("copy and drop/ours");
BENCHMARK(copyDrop<Theirs>)->Name("copy and drop/peer");
BENCHMARK(copyDrop<Ours>)->Name("copy and drop, own objects/ours")->Threads(2);
BENCHMARK(copyDrop<Theirs>)->Name("copy and drop, own objects/peer")->Threads(2);
BENCHMARK(copyDropOneObject<Ours>)->Name("copy and drop, one object/ours")->Threads(2);
BENCHMARK(copyDropOneObject<Theirs>)->Name("copy and drop, one object/peer")->Threads(2);
BENCHMARK(makeDrop<Ours>)->Name("new object, first handle, drop/ours");
BENCHMARK(makeDrop<Theirs>)->Name("new object, first handle, drop/peer");
BENCHMARK(makeDrop<Ours>)->Name("new object, first handle, drop, two threads/ours")->Threads(2);
BENCHMARK(makeDrop<Theirs>)->Name("new object, first handle, drop, two threads/peer")->Threads(2);
BENCHMARK(makeHereDropThere<Ours>)->Name("made here, dropped there/ours")->UseRealTime();
BENCHMARK(makeHereDropThere<Theirs>)->Name("made here, dropped there/peer")->UseRealTime();
BENCHMARK(secondHandleOurs)->Name("second handle from the pointer/ours");
BENCHMARK(secondHandleMaking)->Name("second handle, making only/ours")->UseManualTime();
BENCHMARK(secondHandlePeer)->Name("second handle from the pointer/peer");

} // namespace
