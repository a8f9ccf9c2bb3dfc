// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpLoop.h"

#include <sys/select.h>
#include <sys/time.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "agent/log/Log.h"

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/library/large_fd_set.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

namespace kvloamd {

namespace {

/// The library's growing set of descriptors, for a scope.
class DescriptorSet {
  public:
    DescriptorSet() {
        netsnmp_large_fd_set_init(&m_set, FD_SETSIZE);
        NETSNMP_LARGE_FD_ZERO(&m_set);
    }
    ~DescriptorSet() { netsnmp_large_fd_set_cleanup(&m_set); }
    DescriptorSet(DescriptorSet const&) = delete;
    DescriptorSet& operator=(DescriptorSet const&) = delete;

    netsnmp_large_fd_set* get() { return &m_set; }

  private:
    netsnmp_large_fd_set m_set{};
};

timeval toTimeval(Clock::duration duration) {
    auto const left = std::chrono::duration_cast<std::chrono::microseconds>(
        std::max(duration, Clock::duration::zero()));
    return {static_cast<time_t>(left.count() / 1000000),
            static_cast<suseconds_t>(left.count() % 1000000)};
}

} // namespace

void SnmpLoop::watch(int descriptor, std::function<void()> readable) {
    m_watched.push_back({descriptor, std::move(readable)});
}

void SnmpLoop::beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) {
    m_prepare = std::move(prepare);
}

std::string SnmpLoop::listen(std::string const& address) {
    errno = 0;
    netsnmp_transport* const transport = netsnmp_transport_open_server("snmp", address.c_str());
    if (transport == nullptr) {
        switch (errno) {
        case EADDRINUSE:
            return "can not listen on " + address +
                   ": the port is in use; stop who uses it, or choose another with --port or "
                   "--listen";
        case EACCES:
            return "can not listen on " + address +
                   ": permission denied; ports below 1024 need the privilege to use them, or "
                   "choose "
                   "another with --port or --listen";
        case 0:
            return "can not listen on " + address +
                   ": no such address; write it as udp:127.0.0.1:1161";
        default:
            return "can not listen on " + address + ": " + std::strerror(errno) +
                   "; check --listen, as in udp:127.0.0.1:1161";
        }
    }
    if (netsnmp_register_agent_nsap(transport) == 0)
        return "can not listen on " + address + ": the SNMP library refuses the address";
    return {};
}

void SnmpLoop::run(Clock::time_point until) {
    m_stop = false;
    while (!m_stop && Clock::now() < until)
        step(until);
}

void SnmpLoop::step(Clock::time_point until) {
    std::optional<Clock::time_point> const prepared = m_prepare ? m_prepare() : std::nullopt;
    if (m_stop) return;
    Clock::time_point const latest = std::min(until, Clock::now() + std::chrono::hours(1));
    Clock::time_point const wake = prepared ? std::min(*prepared, latest) : latest;
    DescriptorSet readable;
    int count = 0;
    // In: the longest sleep that suits us. Out: what suits the library's own timers too.
    timeval timeout = toTimeval(wake - Clock::now());
    int block = 0;
    snmp_select_info2(&count, readable.get(), &timeout, &block);
    for (Watched const& watched : m_watched) {
        NETSNMP_LARGE_FD_SET(watched.descriptor, readable.get());
        count = std::max(count, watched.descriptor + 1);
    }
    int const ready =
        netsnmp_large_fd_set_select(count, readable.get(), nullptr, nullptr, &timeout);
    if (ready < 0 && errno != EINTR) {
        log(LogLevel::Error, std::string("waiting for requests: ") + std::strerror(errno));
        m_stop = true;
        return;
    }
    if (ready > 0) {
        for (Watched const& watched : m_watched)
            if (NETSNMP_LARGE_FD_ISSET(watched.descriptor, readable.get())) watched.readable();
        snmp_read2(readable.get());
    } else {
        snmp_timeout();
    }
    run_alarms();
    netsnmp_check_outstanding_agent_requests();
}

} // namespace kvloamd
