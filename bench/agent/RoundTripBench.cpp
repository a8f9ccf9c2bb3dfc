// SPDX-License-Identifier: BSD-2-Clause
// What the machine itself needs to take a request to another process and its answer back.
#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <string>
#include <system_error>

#include <benchmark/benchmark.h>

#include "Child.h"
#include "Limit.h"
#include "ProcessorTime.h"

namespace {

// About as large as those of a GETBULK with 50 repetitions, and of one question of a master.
constexpr std::size_t kRequest = 60;
constexpr std::size_t kResponse = 1200;
constexpr std::size_t kQuestion = 100;

/// Two connected sockets.
struct Ends {
    int near = -1;
    int far = -1;
};

int loopbackSocket() {
    int const descriptor = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (descriptor < 0 ||
        bind(descriptor, reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0)
        throw std::system_error(errno, std::generic_category(), "a socket of loopback");
    return descriptor;
}

/// Connects `from` to the address of `to`.
void connectTo(int from, int to) {
    sockaddr_in address{};
    socklen_t size = sizeof address;
    getsockname(to, reinterpret_cast<sockaddr*>(&address), &size);
    if (connect(from, reinterpret_cast<sockaddr const*>(&address), size) != 0)
        throw std::system_error(errno, std::generic_category(), "a connection by loopback");
}

Ends loopbackEnds() {
    Ends const ends{loopbackSocket(), loopbackSocket()};
    connectTo(ends.near, ends.far);
    connectTo(ends.far, ends.near);
    return ends;
}

Ends localEnds() {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) != 0)
        throw std::system_error(errno, std::generic_category(), "socketpair");
    return {ends[0], ends[1]};
}

/// Asks a process that answers at once, until the benchmark has enough.
void ask(benchmark::State& state, Ends ends, std::size_t request, std::size_t response) {
    Child const process([=] {
        std::array<char, kResponse> message{};
        while (recv(ends.far, message.data(), message.size(), 0) > 0)
            if (send(ends.far, message.data(), response, 0) < 0) break;
        return 0;
    });
    std::array<char, kResponse> message{};
    ProcessorTime const time({process.process()});
    for (auto _ : state)
        if (send(ends.near, message.data(), request, 0) < 0 ||
            recv(ends.near, message.data(), message.size(), 0) != static_cast<ssize_t>(response)) {
            state.SkipWithError("no answer comes");
            break;
        }
    time.enter(state);
    close(ends.near);
    close(ends.far);
}

void loopbackRoundTrip(benchmark::State& state) {
    ask(state, loopbackEnds(), kRequest, kResponse);
}

void localRoundTrip(benchmark::State& state) {
    ask(state, localEnds(), kQuestion, kQuestion);
}

BENCHMARK(loopbackRoundTrip)->Name("floor/loopback round trip")->UseRealTime();
BENCHMARK(localRoundTrip)->Name("floor/local round trip")->UseRealTime();

} // namespace
