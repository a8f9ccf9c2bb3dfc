// SPDX-License-Identifier: BSD-2-Clause
#include "ObjectAttributes.h"

#include <cstring>

#include "access/DeviceMapperIf.h"

std::optional<std::int32_t> numberAttribute(long object, char const* name) {
    std::int32_t word = 0;
    switch (bytesAttribute(object, name, &word, sizeof word)) {
    case sizeof(std::int32_t):
        return word;
    case sizeof(std::int16_t): {
        std::int16_t narrow = 0;
        std::memcpy(&narrow, &word, sizeof narrow);
        return narrow;
    }
    case sizeof(std::int8_t): {
        std::int8_t byte = 0;
        std::memcpy(&byte, &word, sizeof byte);
        return byte;
    }
    default:
        return {};
    }
}

int numberAttributeOr(long object, char const* name, int usual) {
    return numberAttribute(object, name).value_or(usual);
}

std::string textAttribute(long object, char const* name) {
    char text[127];
    std::size_t const size = bytesAttribute(object, name, text, sizeof text);
    return {text, strnlen(text, size)};
}

std::size_t bytesAttribute(long object, char const* name, void* bytes, std::size_t size) {
    DMAttribute request{name, bytes, 0, 0, static_cast<std::int32_t>(size)};
    DeviceMapperIf::get_interface()->GetDMClient()->GetAttributes(object, 1, &request);
    return request.status == 0 ? static_cast<std::size_t>(request.size) : 0;
}
