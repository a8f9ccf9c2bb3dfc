// SPDX-License-Identifier: BSD-2-Clause
// The physical address of an Ethernet interface.
#pragma once

#include <array>
#include <optional>
#include <string>

/// Six octets, in the order in which they are sent.
using PhysAddress = std::array<unsigned char, 6>;

/// Reads "02:00:5e:00:00:02". Nothing for any other form.
std::optional<PhysAddress> parsePhysAddress(std::string const& text);

/// The contract of `KVL::Interface::GetPhysAddress`; not supported without an address.
int answerPhysAddress(std::optional<PhysAddress> const& address, char* buffer, int& length);
