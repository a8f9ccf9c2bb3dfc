// SPDX-License-Identifier: BSD-2-Clause
// The sources of the addresses of an IP interface.
#pragma once

#include <optional>
#include <string>

#include "Z7SimIPInterface.h"

/// A number whose bytes, from the most significant down, are the four octets of a dotted decimal
/// text. Nothing for any other text.
std::optional<int> parseIPAddress(std::string const& text);

/// The addresses IP_ADDRESS_0, IP_ADDRESS_1 ... of a board, up to the first that is missing; those
/// that are not addresses are skipped. A missing or invalid mask or broadcast address is 0.0.0.0.
/// Nothing when the board describes no addresses.
std::optional<Z7SimIPInterface::Addresses> readBoardAddresses(long board);

/// The IPv4 addresses that a network device of this host has now.
Z7SimIPInterface::Addresses readHostAddresses(std::string const& device);
