// SPDX-License-Identifier: BSD-2-Clause
#include "HostPause.h"

#include <linux/ethtool.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <unistd.h>

std::optional<HostPause> readHostPause(std::string const& device) {
    int const asking = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (asking < 0) return std::nullopt;
    ethtool_pauseparam answer{};
    answer.cmd = ETHTOOL_GPAUSEPARAM;
    ifreq request{};
    device.copy(request.ifr_name, sizeof request.ifr_name - 1);
    request.ifr_data = reinterpret_cast<char*>(&answer);
    int const result = ioctl(asking, SIOCETHTOOL, &request);
    close(asking);
    if (result != 0) return std::nullopt;
    return HostPause{answer.autoneg != 0, answer.rx_pause != 0, answer.tx_pause != 0};
}
