// SPDX-License-Identifier: BSD-2-Clause
#include "RefreshProcess.h"

#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "agent/log/Log.h"

namespace {

/// Of the calling thread. A refresh waits for nothing, and what else the machine does meanwhile
/// does not count.
double processorSeconds() {
    timespec used{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &used);
    return static_cast<double>(used.tv_sec) + static_cast<double>(used.tv_nsec) * 1e-9;
}

/// Refreshes for every message, and answers how long it took.
int refreshWhenAsked(int socket, int boards) {
    // There is no attribute store.
    kvloamd::setLogLevel(kvloamd::LogLevel::Error);
    BoardRefresh refresh(boards);
    // As in the agent, the former snapshot goes once the new one is there.
    kvloamd::Snapshot former;
    for (double seconds = 0;;) {
        Happened happened{};
        if (read(socket, &happened, 1) != 1) return 0;
        refresh.let(happened);
        double const begun = processorSeconds();
        kvloamd::Snapshot snapshot;
        refresh.read(snapshot);
        former = std::move(snapshot);
        seconds = processorSeconds() - begun;
        if (former.interfaces.lines.empty() ||
            former.boards.size() != static_cast<std::size_t>(boards))
            throw std::runtime_error("a refresh finds no lines");
        if (write(socket, &seconds, sizeof seconds) < 0) return 1;
    }
}

} // namespace

RefreshProcess::Ends RefreshProcess::connect() {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
        throw std::system_error(errno, std::generic_category(), "socketpair");
    return {ends[0], ends[1]};
}

RefreshProcess::RefreshProcess(int boards, Ends ends)
    : m_socket(ends.ours), m_process([&] {
          close(ends.ours);
          return refreshWhenAsked(ends.theirs, boards);
      }) {
    close(ends.theirs);
    refresh(Happened::Nothing);
}

RefreshProcess::~RefreshProcess() {
    close(m_socket);
}

double RefreshProcess::refresh(Happened happened) const {
    double seconds = 0;
    if (write(m_socket, &happened, 1) != 1 ||
        read(m_socket, &seconds, sizeof seconds) != sizeof seconds)
        throw std::runtime_error("the process that refreshes has ended");
    return seconds;
}
