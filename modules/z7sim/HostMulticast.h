// SPDX-License-Identifier: BSD-2-Clause
// The multicast addresses that a network device of this host listens to.
#pragma once

#include <string>
#include <vector>

/// Appends the octets of each address. `list`: the file in which the kernel lists them. Returns
/// whether it could be read.
bool readHostMulticast(std::string const& device, std::vector<std::string>& addresses,
                       std::string const& list = "/proc/net/dev_mcast");
