// SPDX-License-Identifier: BSD-2-Clause
// One attribute's value: conversion between values and the bytes of the answer.
#include "simulator/chassis/AttributeValue.h"

#include <cstring>

namespace kvlsim {

namespace {

template <typename T>
std::string bytesOf(T const& value) {
    std::string bytes(sizeof value, '\0');
    std::memcpy(bytes.data(), &value, sizeof value);
    return bytes;
}

template <typename T>
T valueOf(std::string const& bytes) {
    T value{};
    std::memcpy(&value, bytes.data(), sizeof value);
    return value;
}

} // namespace

AttributeValue AttributeValue::text(std::string_view text) {
    std::string bytes(text);
    bytes.push_back('\0');
    return {ValueForm::text, bytes};
}

AttributeValue AttributeValue::number(std::int32_t value) {
    return {ValueForm::number, bytesOf(value)};
}

AttributeValue AttributeValue::shortNumber(std::int16_t value) {
    return {ValueForm::shortNumber, bytesOf(value)};
}

AttributeValue AttributeValue::byte(std::int8_t value) {
    return {ValueForm::byte, bytesOf(value)};
}

AttributeValue AttributeValue::empty() {
    return {ValueForm::empty, ""};
}

AttributeValue AttributeValue::descriptor(DescriptorWords const& words) {
    return {ValueForm::descriptor, bytesOf(words)};
}

std::string_view AttributeValue::asText() const {
    return std::string_view(m_bytes).substr(0, m_bytes.size() - 1);
}

std::int32_t AttributeValue::asNumber() const {
    switch (m_form) {
    case ValueForm::number:
        return valueOf<std::int32_t>(m_bytes);
    case ValueForm::shortNumber:
        return valueOf<std::int16_t>(m_bytes);
    case ValueForm::byte:
        return valueOf<std::int8_t>(m_bytes);
    default:
        return 0;
    }
}

DescriptorWords AttributeValue::asDescriptor() const {
    return valueOf<DescriptorWords>(m_bytes);
}

} // namespace kvlsim
