// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmPolicies.h"

#include <charconv>

namespace kvloamd {

namespace {

std::string quoted(std::string_view text) {
    return "'" + std::string(text) + "'";
}

/// Takes what is before `separator` from `text`; all of it if there is no separator.
std::string_view takeUntil(std::string_view& text, char separator) {
    auto const end = text.find(separator);
    std::string_view const taken = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    return taken;
}

std::optional<std::uint32_t> numberIn(std::string_view text, std::uint32_t highest) {
    std::uint32_t number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size() || number > highest)
        return std::nullopt;
    return number;
}

/// Applies one word of an entry, such as "major" or "raise=2". Returns whether it is right.
bool applyWord(AlarmPolicy& policy, std::string_view word) {
    if (word == "off") {
        policy.enabled = false;
        return true;
    }
    if (auto const severity = findSeverity(word)) {
        policy.severity = *severity;
        return true;
    }
    std::string_view const key = takeUntil(word, '=');
    auto const held =
        numberIn(word, static_cast<std::uint32_t>(AlarmPolicies::kLongestHold.count()));
    if (!held || (key != "raise" && key != "clear")) return false;
    (key == "raise" ? policy.raiseHold : policy.clearHold) = std::chrono::seconds(*held);
    return true;
}

} // namespace

std::string AlarmPolicies::configure(std::string_view entry) {
    std::string_view rest = entry;
    std::string_view const name = takeUntil(rest, '=');
    std::string_view number = name;
    AlarmKindInfo const* const kind = findAlarmKind(takeUntil(number, '.'));
    if (kind == nullptr)
        return quoted(name) + " is no kind of alarm; see the list of kinds in docs/operating.md";
    std::optional<std::uint32_t> value;
    if (name.find('.') != std::string_view::npos) {
        constexpr std::uint32_t kHighestFault = 65535;
        value = numberIn(number, kHighestFault);
        if (kind->kind != AlarmKind::PlatformFault || !value)
            return quoted(name) + " has no such number; only platformFault takes one, a fault "
                                  "value from 0 to 65535, as in platformFault.17";
    }
    std::pair const key(kind->kind, value);
    if (m_configured.contains(key)) return quoted(name) + " is configured twice";
    AlarmPolicy policy{kind->severity, defaultRaiseHold(*kind, value.value_or(0)), kind->clearHold};
    if (rest.empty())
        return quoted(entry) + " configures nothing; write it like " + kind->name + "=major";
    while (!rest.empty()) {
        std::string_view const word = takeUntil(rest, ',');
        if (!applyWord(policy, word))
            return quoted(word) + " in " + quoted(entry) +
                   " is neither off, nor a severity (critical, major, minor, warning, "
                   "indeterminate), nor raise= or clear= with seconds from 0 to 3600";
    }
    m_configured.emplace(key, policy);
    return {};
}

AlarmPolicy AlarmPolicies::of(AlarmKind kind, std::uint32_t number) const {
    if (kind == AlarmKind::PlatformFault)
        if (auto const found = m_configured.find({kind, number}); found != m_configured.end())
            return found->second;
    if (auto const found = m_configured.find({kind, std::nullopt}); found != m_configured.end())
        return found->second;
    AlarmKindInfo const& info = alarmKind(kind);
    return {info.severity, defaultRaiseHold(info, number), info.clearHold};
}

} // namespace kvloamd
