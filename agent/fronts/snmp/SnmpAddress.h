// SPDX-License-Identifier: BSD-2-Clause
// Opens the addresses at which the stand-alone agent listens.
#pragma once

#include <string>

namespace kvloamd {

/// Listens at an address such as udp:127.0.0.1:1161. Returns the error as one line; empty when
/// there is none. Thread-bound to the SNMP thread; used while the library is started.
std::string openAddress(std::string const& address);

} // namespace kvloamd
