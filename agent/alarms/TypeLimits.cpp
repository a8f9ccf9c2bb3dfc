// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/TypeLimits.h"

#include <algorithm>
#include <charconv>
#include <iterator>

namespace kvloamd {

namespace {

constexpr std::array<char const*, 3> kTypeNames{"t1", "e1", "j1"};

constexpr std::array<char const*, kThresholds> kNames{
    "es15m", "es24h", "ses15m", "ses24h", "uas15m", "uas24h", "css15m", "css24h", "cv15m", "cv24h"};

/// The place in `kTypeNames` of a line of this dsx1LineType.
std::optional<std::size_t> typeOf(std::optional<int> lineType) {
    switch (lineType.value_or(0)) {
    case 2: // dsx1ESF
    case 3: // dsx1D4
    case 8: // dsx1Unframed
        return 0;
    case 4:  // dsx1E1
    case 5:  // dsx1E1CRC
    case 6:  // dsx1E1MF
    case 7:  // dsx1E1CRCMF
    case 9:  // dsx1E1Unframed
    case 12: // dsx1E1Q50
    case 13: // dsx1E1Q50CRC
        return 1;
    case 14: // dsx1J1ESF
    case 16: // dsx1J1Unframed
        return 2;
    default:
        return std::nullopt;
    }
}

std::string quoted(std::string_view text) {
    return "'" + std::string(text) + "'";
}

/// The place of `name` in `names`; their number if it is none of them.
template <class Names>
std::size_t placeOf(Names const& names, std::string_view name) {
    return static_cast<std::size_t>(
        std::distance(names.begin(), std::find(names.begin(), names.end(), name)));
}

/// Applies "es15m=65". Returns whether it is right.
bool applyLimit(LineLimits& limits, std::string_view word) {
    auto const equals = std::min(word.find('='), word.size());
    std::size_t const threshold = placeOf(kNames, word.substr(0, equals));
    if (threshold == kThresholds || equals == word.size()) return false;
    std::string_view const number = word.substr(equals + 1);
    int limit = 0;
    auto const [end, error] = std::from_chars(number.data(), number.data() + number.size(), limit);
    if (error != std::errc() || end != number.data() + number.size() || limit < 0) return false;
    limits[threshold] = limit;
    return true;
}

} // namespace

AlarmKind thresholdKind(std::size_t threshold) {
    return static_cast<AlarmKind>(static_cast<int>(AlarmKind::ThresholdES15m) +
                                  static_cast<int>(threshold));
}

char const* thresholdName(std::size_t threshold) {
    return kNames.at(threshold);
}

std::string TypeLimits::configure(std::string_view entry) {
    auto const equals = std::min(entry.find('='), entry.size());
    std::string_view const name = entry.substr(0, equals);
    std::size_t const type = placeOf(kTypeNames, name);
    if (type == kTypes) return quoted(name) + " is no type of line; write t1, e1 or j1";
    if (m_limits.at(type)) return quoted(name) + " is configured twice";
    std::string_view rest = entry.substr(std::min(equals + 1, entry.size()));
    if (rest.empty())
        return quoted(entry) + " sets no limit; write it like " + std::string(name) +
               "=es15m=65,ses15m=10";
    LineLimits limits{};
    while (!rest.empty()) {
        auto const end = std::min(rest.find(','), rest.size());
        std::string_view const word = rest.substr(0, end);
        if (!applyLimit(limits, word))
            return quoted(word) + " in " + quoted(entry) +
                   " is no limit; write es, ses, uas, css or cv, then 15m or 24h, then a number, "
                   "as in es15m=65";
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    m_limits.at(type) = limits;
    return {};
}

LineLimits TypeLimits::of(std::optional<int> lineType) const {
    auto const type = typeOf(lineType);
    return type && m_limits.at(*type) ? *m_limits.at(*type) : LineLimits{};
}

} // namespace kvloamd
