// SPDX-License-Identifier: BSD-2-Clause
#include "HostMulticast.h"

#include <charconv>
#include <cstddef>
#include <fstream>
#include <sstream>
#include <system_error>

namespace {

/// The octets of "01005e000001"; empty for any other form.
std::string octetsOf(std::string const& digits) {
    std::string octets;
    if (digits.size() % 2 != 0) return octets;
    for (std::size_t at = 0; at < digits.size(); at += 2) {
        char const* const begin = digits.data() + at;
        unsigned char octet = 0;
        auto const [rest, error] = std::from_chars(begin, begin + 2, octet, 16);
        if (error != std::errc() || rest != begin + 2) return {};
        octets += static_cast<char>(octet);
    }
    return octets;
}

} // namespace

bool readHostMulticast(std::string const& device, std::vector<std::string>& addresses,
                       std::string const& list) {
    std::ifstream stream(list);
    if (!stream.is_open()) return false;
    for (std::string line; std::getline(stream, line);) {
        std::istringstream words(line);
        std::string index;
        std::string name;
        std::string users;
        std::string globalUsers;
        std::string address;
        words >> index >> name >> users >> globalUsers >> address;
        if (name != device) continue;
        if (std::string octets = octetsOf(address); !octets.empty())
            addresses.push_back(std::move(octets));
    }
    return true;
}
