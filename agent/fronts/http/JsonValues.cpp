// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/JsonValues.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>

namespace kvloamd {

namespace {

char const* nameOf(Names names, std::int64_t number) {
    auto const found = std::ranges::find(
        names, number, [](NamedNumber const& named) { return std::int64_t{named.number}; });
    return found == names.end() ? nullptr : found->name;
}

bool isTruth(Names names) {
    return names.size() == 2 && std::string_view(names[0].name) == "true" &&
           std::string_view(names[1].name) == "false";
}

void writeSum(JsonWriter& json, Names bits, std::int64_t sum) {
    json.beginArray();
    for (unsigned shift = 0; shift < 32; ++shift) {
        std::int64_t const bit = std::int64_t{1} << shift;
        if ((sum & bit) == 0) continue;
        if (char const* const name = nameOf(bits, bit); name != nullptr)
            json.text(name);
        else
            json.number(bit);
    }
    json.endArray();
}

/// A set as SNMP writes it: bit 0 is the highest of the first octet.
void writeSet(JsonWriter& json, Names names, std::string_view octets) {
    json.beginArray();
    for (std::size_t bit = 0; bit < octets.size() * 8; ++bit) {
        auto const octet = static_cast<unsigned char>(octets[bit / 8]);
        if ((octet & (0x80U >> bit % 8)) == 0) continue;
        auto const number = static_cast<std::int64_t>(bit);
        if (char const* const name = nameOf(names, number); name != nullptr)
            json.text(name);
        else
            json.number(number);
    }
    json.endArray();
}

std::string hexadecimal(std::string_view octets) {
    constexpr char kDigits[] = "0123456789abcdef";
    std::string text;
    for (char const character : octets) {
        auto const octet = static_cast<unsigned char>(character);
        if (!text.empty()) text += ':';
        text += kDigits[octet >> 4U];
        text += kDigits[octet & 0x0fU];
    }
    return text;
}

void writeOctets(JsonWriter& json, ValueType type, Details const& details,
                 std::string_view octets) {
    if (type == ValueType::Date) {
        auto const date = rfc3339(octets);
        if (date)
            json.text(*date);
        else
            json.null();
    } else if (type == ValueType::Octets && !details.names.empty()) {
        writeSet(json, details.names, octets);
    } else if (type == ValueType::Octets && !details.writable) {
        json.text(hexadecimal(octets));
    } else {
        // What operators can set is a text, whatever its type.
        json.text(octets);
    }
}

void writeNumber(JsonWriter& json, ValueType type, Details const& details, std::int64_t number,
                 Counters const& counters, Manner manner) {
    switch (type) {
    case ValueType::Counter64:
        json.number(static_cast<std::uint64_t>(number));
        return;
    case ValueType::TimeTicks:
    case ValueType::TimeStamp:
    case ValueType::BeginStamp: {
        if (manner == Manner::People) {
            json.decimal(number, 2);
            return;
        }
        auto const ticks = static_cast<std::uint32_t>(number);
        json.number(std::int64_t{type == ValueType::TimeStamp    ? counters.sysUpTime(ticks)
                                 : type == ValueType::BeginStamp ? counters.sysUpTimeSince(ticks)
                                                                 : ticks});
        return;
    }
    default:
        break;
    }
    if (!details.bits.empty())
        writeSum(json, details.bits, number);
    else if (isTruth(details.names))
        json.boolean(number == details.names[0].number);
    else if (char const* const name = nameOf(details.names, number); name != nullptr)
        json.text(name);
    else
        json.number(number);
}

} // namespace

std::string keyOf(std::string_view name, std::string_view prefix, ValueType type) {
    std::string key(name.substr(name.starts_with(prefix) ? prefix.size() : 0));
    auto const isCapital = [](char letter) { return letter >= 'A' && letter <= 'Z'; };
    auto const isSmall = [](char letter) { return letter >= 'a' && letter <= 'z'; };
    auto const capitals =
        static_cast<std::size_t>(std::ranges::find_if_not(key, isCapital) - key.begin());
    std::size_t lowered = capitals;
    if (capitals > 1 && key.substr(capitals) == "s")
        key.resize(capitals);
    else if (capitals > 1 && capitals < key.size() && isSmall(key[capitals]))
        --lowered; // the last capital begins the next word
    for (std::size_t i = 0; i < lowered; ++i)
        key[i] = static_cast<char>(key[i] - 'A' + 'a');
    if (type == ValueType::TimeTicks || type == ValueType::TimeStamp ||
        type == ValueType::BeginStamp)
        key += "Seconds";
    return key;
}

void writeValue(JsonWriter& json, ValueType type, Details const& details, Value const& value,
                Counters const& counters, Manner manner) {
    if (auto const octets = octetsOf(value))
        writeOctets(json, type, details, *octets);
    else if (auto const* const number = std::get_if<std::int64_t>(&value))
        writeNumber(json, type, details, *number, counters, manner);
    else if (auto const* const name = std::get_if<NameView>(&value))
        json.text(dotted(name->name));
    else
        json.null();
}

std::string dotted(OidView name) {
    std::string text;
    for (std::uint32_t const number : name)
        text += (text.empty() ? "" : ".") + std::to_string(number);
    return text;
}

std::optional<std::string> rfc3339(std::string_view octets) {
    constexpr std::size_t kLocal = 8;
    constexpr std::size_t kWithOffset = 11;
    if (octets.size() != kLocal && octets.size() != kWithOffset) return std::nullopt;
    auto const at = [&](std::size_t i) {
        return static_cast<int>(static_cast<unsigned char>(octets[i]));
    };
    using namespace std::chrono;
    year_month_day const day{year(at(0) * 256 + at(1)), month(static_cast<unsigned>(at(2))),
                             std::chrono::day(static_cast<unsigned>(at(3)))};
    if (!day.ok() || at(4) > 23 || at(5) > 59 || at(6) > 60 || at(7) > 9) return std::nullopt;
    milliseconds time = sys_days(day).time_since_epoch();
    time += hours(at(4)) + minutes(at(5)) + seconds(at(6)) + milliseconds(100 * at(7));
    if (octets.size() == kWithOffset) {
        if ((octets[8] != '+' && octets[8] != '-') || at(9) > 14 || at(10) > 59)
            return std::nullopt;
        minutes const offset = hours(at(9)) + minutes(at(10));
        time += octets[8] == '+' ? -offset : offset;
    }
    return rfc3339(time.count());
}

std::string rfc3339(std::int64_t milliseconds) {
    using namespace std::chrono;
    sys_time<std::chrono::milliseconds> const time{std::chrono::milliseconds(milliseconds)};
    auto const midnight = floor<days>(time);
    year_month_day const day(midnight);
    hh_mm_ss const clock(time - midnight);
    std::array<char, 64> text{};
    std::snprintf(text.data(), text.size(), "%04d-%02u-%02uT%02d:%02d:%02d",
                  static_cast<int>(day.year()), static_cast<unsigned>(day.month()),
                  static_cast<unsigned>(day.day()), static_cast<int>(clock.hours().count()),
                  static_cast<int>(clock.minutes().count()),
                  static_cast<int>(clock.seconds().count()));
    std::string result = text.data();
    if (auto const fraction = clock.subseconds().count(); fraction != 0) {
        std::string digits = std::to_string(1000 + fraction).substr(1);
        digits.erase(digits.find_last_not_of('0') + 1);
        result += '.' + digits;
    }
    return result + 'Z';
}

} // namespace kvloamd
