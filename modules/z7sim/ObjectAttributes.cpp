// SPDX-License-Identifier: BSD-2-Clause
#include "ObjectAttributes.h"

#include <algorithm>
#include <cstring>

#include "access/DeviceMapperIf.h"

namespace {

template <class Number>
std::int32_t number(std::string const& bytes) {
    Number value = 0;
    std::memcpy(&value, bytes.data(), sizeof value);
    return value;
}

} // namespace

std::optional<std::string> readBytes(long object, char const* attribute, std::size_t capacity) {
    std::string bytes(capacity, '\0');
    DMAttribute request{attribute, bytes.data(), 0, 0, static_cast<std::int32_t>(capacity)};
    DeviceMapperIf::get_interface()->GetDMClient()->GetAttributes(object, 1, &request);
    if (request.status != 0) return std::nullopt;
    bytes.resize(std::min(capacity, static_cast<std::size_t>(std::max(request.size, 0))));
    return bytes;
}

std::optional<std::int32_t> readNumber(long object, char const* attribute) {
    auto const bytes = readBytes(object, attribute, sizeof(std::int32_t));
    if (!bytes) return std::nullopt;
    switch (bytes->size()) {
    case 1:
        return number<std::int8_t>(*bytes);
    case 2:
        return number<std::int16_t>(*bytes);
    case 4:
        return number<std::int32_t>(*bytes);
    default:
        return std::nullopt;
    }
}

std::optional<std::string> readText(long object, char const* attribute) {
    constexpr std::size_t kLongest = 128;
    auto const text = readBytes(object, attribute, kLongest);
    if (!text) return std::nullopt;
    return std::string(text->data(), strnlen(text->data(), text->size()));
}
