// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/LibrarySource.h"

#include <sys/select.h>
#include <sys/time.h>

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

} // namespace

std::optional<Clock::time_point> LibrarySource::prepare(std::vector<pollfd>& polled) {
    DescriptorSet asked;
    int count = 0;
    timeval timeout{};
    int block = 1; // set to 0 by the library when one of its timers runs
    snmp_select_info2(&count, asked.get(), &timeout, &block);
    for (int descriptor = 0; descriptor < count; ++descriptor)
        if (NETSNMP_LARGE_FD_ISSET(descriptor, asked.get()))
            polled.push_back({descriptor, POLLIN, 0});
    if (block != 0) return std::nullopt;
    return Clock::now() + std::chrono::seconds(timeout.tv_sec) +
           std::chrono::microseconds(timeout.tv_usec);
}

void LibrarySource::handle(std::span<pollfd const> polled) {
    DescriptorSet readable;
    bool any = false;
    for (pollfd const& each : polled) {
        if (each.revents == 0) continue;
        NETSNMP_LARGE_FD_SET(each.fd, readable.get());
        any = true;
    }
    if (any)
        snmp_read2(readable.get());
    else
        snmp_timeout();
    run_alarms();
    netsnmp_check_outstanding_agent_requests();
}

} // namespace kvloamd
