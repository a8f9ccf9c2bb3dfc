// SPDX-License-Identifier: BSD-2-Clause
#include "HostDevice.h"

#include <net/if.h>

#include <charconv>
#include <fstream>
#include <utility>

namespace {

/// The number that begins at `start` and ends with `text`; nothing for any other text.
template <class Number>
std::optional<Number> parse(std::string const& text, std::size_t start, int base) {
    if (text.size() < start) return std::nullopt;
    Number value = 0;
    char const* const end = text.data() + text.size();
    auto const [rest, error] = std::from_chars(text.data() + start, end, value, base);
    if (error != std::errc() || rest != end) return std::nullopt;
    return value;
}

} // namespace

bool HostDevice::isName(std::string const& name) {
    return !name.empty() && name.size() < IFNAMSIZ && name.find('/') == std::string::npos &&
           name != "." && name != "..";
}

HostDevice::HostDevice(std::string name, std::string const& directory)
    : m_name(std::move(name)), m_path(directory + "/" + m_name + "/") {}

std::optional<std::string> HostDevice::text(char const* file) const {
    std::ifstream stream(m_path + file);
    std::string line;
    if (!std::getline(stream, line)) return std::nullopt;
    return line;
}

std::optional<std::int64_t> HostDevice::number(char const* file) const {
    auto const line = text(file);
    if (!line) return std::nullopt;
    return parse<std::int64_t>(*line, 0, 10);
}

std::optional<unsigned> HostDevice::flags() const {
    auto const line = text("flags");
    if (!line || !line->starts_with("0x")) return std::nullopt;
    return parse<unsigned>(*line, 2, 16);
}
