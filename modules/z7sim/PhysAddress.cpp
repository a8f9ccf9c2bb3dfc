// SPDX-License-Identifier: BSD-2-Clause
#include "PhysAddress.h"

#include <cstring>

#include <charconv>

#include "board/Interface.h"

std::optional<PhysAddress> parsePhysAddress(std::string const& text) {
    constexpr std::size_t kOctetLength = 3; // two digits and what follows them
    PhysAddress address{};
    if (text.size() != address.size() * kOctetLength - 1) return std::nullopt;
    for (std::size_t i = 0; i < address.size(); ++i) {
        char const* const digits = text.data() + i * kOctetLength;
        auto const [end, error] = std::from_chars(digits, digits + 2, address[i], 16);
        if (error != std::errc() || end != digits + 2) return std::nullopt;
        if (i + 1 < address.size() && *end != ':') return std::nullopt;
    }
    return address;
}

int answerPhysAddress(std::optional<PhysAddress> const& address, char* buffer, int& length) {
    if (!address) return KVL::kNotSupported;
    std::memcpy(buffer, address->data(), address->size());
    length = static_cast<int>(address->size());
    return 0;
}
