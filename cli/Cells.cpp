// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Cells.h"

#include <algorithm>
#include <array>
#include <cctype>

namespace kvloam {

namespace {

constexpr char const* kUnknown = "-";
constexpr std::string_view kSecondsSuffix = "Seconds";

std::string realText(double number) {
    char text[32];
    std::snprintf(text, sizeof text, "%.6g", number);
    return text;
}

} // namespace

std::string valueText(Json const& value) {
    switch (value.type()) {
    case Json::value_t::string: {
        auto text = value.get<std::string>();
        return text.empty() ? kUnknown : text;
    }
    case Json::value_t::boolean:
        return value.get<bool>() ? "yes" : "no";
    case Json::value_t::number_float:
        return realText(value.get<double>());
    case Json::value_t::number_integer:
    case Json::value_t::number_unsigned:
        return value.dump();
    case Json::value_t::array: {
        std::string all;
        for (Json const& one : value)
            all += (all.empty() ? "" : ", ") +
                   (one.is_string() ? shortName(one.get<std::string>()) : valueText(one));
        return all.empty() ? kUnknown : all;
    }
    default:
        return kUnknown;
    }
}

std::string fieldText(Json const& row, std::string const& key, Date now) {
    Json const& value = field(row, key.c_str());
    if (value.is_number() && key.ends_with(kSecondsSuffix)) {
        // Whatever the agent sends, a span is some whole number of seconds.
        constexpr double kMost = 1e12;
        double const seconds = std::clamp(value.get<double>(), 0.0, kMost);
        return spanText(Seconds(static_cast<std::int64_t>(seconds)));
    }
    if (auto const date = dateIn(row, key.c_str())) return dateWithAge(*date, now);
    if (value.is_string()) return valueText(Json(shortName(value.get<std::string>())));
    return valueText(value);
}

std::string keyWords(std::string const& key) {
    std::string words = key;
    if (words.ends_with(kSecondsSuffix) && words.size() > kSecondsSuffix.size())
        words.resize(words.size() - kSecondsSuffix.size());
    std::string result;
    for (std::size_t i = 0; i < words.size(); ++i) {
        auto const at = [&](std::size_t place) {
            return place < words.size() ? static_cast<unsigned char>(words[place]) : '\0';
        };
        bool const isUpper = std::isupper(at(i)) != 0;
        bool const startsWord =
            isUpper && i > 0 && (std::isupper(at(i - 1)) == 0 || std::islower(at(i + 1)) != 0);
        if (startsWord) result += ' ';
        // What consists of capitals is an abbreviation.
        bool const isAbbreviation =
            isUpper && (std::isupper(at(i + 1)) != 0 || (i > 0 && std::isupper(at(i - 1)) != 0));
        result += startsWord && !isAbbreviation ? static_cast<char>(std::tolower(at(i))) : words[i];
    }
    return result;
}

std::string shortName(std::string const& name) {
    constexpr std::string_view kPrefix = "dsx1";
    bool const hasPrefix = name.starts_with(kPrefix) && name.size() > kPrefix.size() &&
                           std::isupper(static_cast<unsigned char>(name[kPrefix.size()])) != 0;
    return hasPrefix ? name.substr(kPrefix.size()) : name;
}

Cell boardState(Json const& board) {
    if (textIn(board, "secondaryStatus") == "failed") return {"failed", Paint::Bad};
    std::string const status = textIn(board, "status");
    if (status.empty()) return {kUnknown, Paint::Warning};
    return {status, status == "started"  ? Paint::Good
                    : status == "failed" ? Paint::Bad
                                         : Paint::Warning};
}

bool isGoodBoard(Json const& board) {
    return boardState(board).paint == Paint::Good;
}

Cell lineStatus(Json const& line) {
    if (!field(line, "lineStatus").is_array()) return {kUnknown, Paint::Warning};
    Cell cell{valueText(field(line, "lineStatus")), Paint::Bad};
    // Loopbacks and test codes are made by operators.
    constexpr std::array<std::string_view, 3> kNoFailures = {"dsx1NoAlarm", "dsx1LoopbackState",
                                                             "dsx1RcvTestCode"};
    auto const bits = textsIn(line, "lineStatus");
    if (bits.empty() || (bits.size() == 1 && bits.front() == kNoFailures.front()))
        cell.paint = Paint::Good;
    else if (std::ranges::all_of(bits, [&](std::string const& bit) {
                 return std::ranges::find(kNoFailures, bit) != kNoFailures.end();
             }))
        cell.paint = Paint::Warning;
    return cell;
}

bool isGoodLine(Json const& line) {
    return lineStatus(line).paint == Paint::Good;
}

Cell operStatus(Json const& interface) {
    std::string const status = textIn(interface, "operStatus");
    bool const isDown = status == "down" || status == "lowerLayerDown";
    return {valueText(field(interface, "operStatus")), status == "up" ? Paint::Good
                                                       : isDown       ? Paint::Bad
                                                                      : Paint::Plain};
}

int gravity(std::string const& severity) {
    static constexpr std::array<std::string_view, 6> kAscending = {
        "cleared", "indeterminate", "warning", "minor", "major", "critical"};
    auto const* const found = std::ranges::find(kAscending, severity);
    return found == kAscending.end() ? 0 : static_cast<int>(found - kAscending.begin());
}

Cell severity(Json const& row) {
    int const grave = gravity(textIn(row, "severity"));
    return {valueText(field(row, "severity")), grave >= gravity("major") ? Paint::Bad
                                               : grave > 0               ? Paint::Warning
                                                                         : Paint::Plain};
}

} // namespace kvloam
