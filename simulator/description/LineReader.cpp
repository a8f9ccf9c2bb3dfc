// SPDX-License-Identifier: BSD-2-Clause
// Reads the line of a device from its description.
#include <algorithm>
#include <array>
#include <cmath>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/chassis/LineDraft.h"
#include "simulator/description/Description.h"
#include "simulator/description/DescriptionChecks.h"
#include "simulator/description/LineReader.h"

namespace kvlsim {

namespace {

using Form = Description::Form;

constexpr std::array<std::string_view, 4> kLineKeys = {"type", "errors", "alarms", "past"};
constexpr std::array<std::string_view, 4> kPastKeys = {"hours", "seconds", "errors", "spells"};
constexpr std::array<std::string_view, 4> kSpellKeys = {"ago", "seconds", "alarms", "errors"};

std::string typeNames() {
    std::string list;
    for (auto const& [name, type] : kLineTypeNames)
        appendToList(list, name);
    return list;
}

DS1LineType readType(Description const& line, std::string const& what) {
    Description const* const type = line.find("type");
    if (type == nullptr)
        throw ChassisError(line.line, what + " has no type; give it one of " + typeNames());
    auto const* const found =
        type->isScalar() ? std::ranges::find(kLineTypeNames, type->scalar, &LineTypeName::name)
                         : kLineTypeNames.end();
    if (found == kLineTypeNames.end())
        throw ChassisError(type->line,
                           what + " cannot be of type " +
                               (type->isScalar() ? inQuotes(type->scalar) : type->words()) +
                               "; choose one of " + typeNames());
    return found->type;
}

/// The place of an error's name in LineErrors.
std::size_t errorNamed(DescriptionEntry const& entry) {
    auto const* const found = std::ranges::find(kLineErrorNames, entry.key);
    if (found != kLineErrorNames.end())
        return static_cast<std::size_t>(found - kLineErrorNames.begin());
    std::string known;
    for (auto const& name : kLineErrorNames)
        appendToList(known, name);
    throw ChassisError(entry.line, "no error of a line is called " + inQuotes(entry.key) +
                                       "; there are " + known);
}

void requireErrors(Description const& map) {
    if (map.form != Form::map)
        throw ChassisError(map.line, "errors cannot be " + map.words() +
                                         "; write one kind a line, such as slips: 2");
}

LineRates readRates(Description const& parent) {
    LineRates rates{};
    Description const* const errors = parent.find("errors");
    if (errors != nullptr && errors->form != Form::nothing) readLineRates(*errors, rates);
    return rates;
}

std::uint32_t readAlarms(Description const& parent) {
    Description const* const list = parent.find("alarms");
    if (list == nullptr || list->form == Form::nothing) return 0;
    if (list->form != Form::list)
        throw ChassisError(list->line, "alarms cannot be " + list->words() +
                                           "; write a list of names, such as [los, rai]");
    std::uint32_t alarms = 0;
    for (auto const& item : list->items) {
        if (!item.isScalar())
            throw ChassisError(item.line, "an alarm cannot be " + item.words() +
                                              "; write a name, such as los");
        std::uint32_t const alarm = lineAlarmNamed(item.scalar, item.line);
        if ((alarms & alarm) != 0)
            throw ChassisError(item.line,
                               "alarm " + inQuotes(item.scalar) + " is written twice; keep one");
        alarms |= alarm;
    }
    return alarms;
}

/// `parent`'s number of this name, which is 1 to `most` because of `why`. Requires: it is there.
std::int64_t readWhole(Description const& parent, std::string_view key, std::int64_t most,
                       std::string const& why = "") {
    Description const& value = *parent.find(key);
    auto const number = value.integer();
    if (number && *number >= 1 && *number <= most) return *number;
    throw ChassisError(value.line, std::string(key) + " cannot be " + value.words() +
                                       "; write a whole number from 1 to " + std::to_string(most) +
                                       why);
}

LineSpell readSpell(Description const& item, std::int64_t pastSeconds) {
    requireMap(item, "a spell", "ago:");
    refuseUnknownKeys(item, "a spell", kSpellKeys);
    for (char const* key : {"ago", "seconds"})
        if (item.find(key) == nullptr)
            throw ChassisError(item.line, std::string("a spell has no ") + key +
                                              "; say when it began (ago:) and how long it lasted "
                                              "(seconds:)");
    LineSpell spell;
    spell.ago = readWhole(item, "ago", pastSeconds, ", the seconds of this past");
    spell.seconds =
        readWhole(item, "seconds", spell.ago, ", for the spell ends at the latest with the past");
    spell.alarms = readAlarms(item);
    spell.rates = readRates(item);
    if (spell.alarms == 0 && spell.rates == LineRates{})
        throw ChassisError(item.line, "a spell without alarms and errors is none; give it one or "
                                      "remove it");
    return spell;
}

LinePast readPast(Description const& past) {
    requireMap(past, "the past of a line", "hours:");
    refuseUnknownKeys(past, "the past of a line", kPastKeys);
    bool const inHours = past.find("hours") != nullptr;
    if (inHours == (past.find("seconds") != nullptr))
        throw ChassisError(past.line, "the past of a line has one length; give either \"hours:\" "
                                      "or \"seconds:\"");
    LinePast read;
    read.seconds = inHours ? 3600 * readWhole(past, "hours", kMaxLinePast / 3600)
                           : readWhole(past, "seconds", kMaxLinePast);
    read.rates = readRates(past);
    Description const* const spells = past.find("spells");
    if (spells == nullptr || spells->form == Form::nothing) return read;
    if (spells->form != Form::list)
        throw ChassisError(spells->line,
                           "spells cannot be " + spells->words() +
                               "; write a list, each spell beginning with \"- ago:\"");
    if (spells->items.size() > kMaxLineSpells)
        throw ChassisError(spells->line, "a past of " + std::to_string(spells->items.size()) +
                                             " spells is too long; " +
                                             std::to_string(kMaxLineSpells) + " is the most");
    for (auto const& item : spells->items)
        read.spells.push_back(readSpell(item, read.seconds));
    return read;
}

} // namespace

bool fitsLineType(AttributeValue const& value) {
    return value.form() == ValueForm::empty ||
           (value.form() == ValueForm::number &&
            !nameOf(static_cast<DS1LineType>(value.asNumber())).empty());
}

std::uint32_t lineAlarmNamed(std::string_view name, int line) {
    auto const* const found = std::ranges::find(kLineAlarmNames, name);
    if (found != kLineAlarmNames.end()) return 1U << (found - kLineAlarmNames.begin());
    std::string known;
    for (auto const& each : kLineAlarmNames)
        appendToList(known, each);
    throw ChassisError(line, "no alarm is called " + inQuotes(name) + "; there are " + known);
}

void readLineRates(Description const& errors, LineRates& rates) {
    requireErrors(errors);
    for (auto const& entry : errors.entries) {
        auto& rate = rates[errorNamed(entry)];
        auto const number = entry.value.decimal();
        if (!number || *number < 0 || *number > static_cast<double>(kMaxLineRate))
            throw ChassisError(entry.line, "the rate of " + entry.key + " cannot be " +
                                               (number ? entry.value.scalar : entry.value.words()) +
                                               "; write a number per second from 0 to " +
                                               std::to_string(kMaxLineRate) + ", such as 0.5");
        rate =
            static_cast<std::uint64_t>(std::llround(*number * static_cast<double>(kLineRateUnit)));
    }
}

LineErrors readLineErrors(Description const& errors) {
    requireErrors(errors);
    LineErrors read{};
    for (auto const& entry : errors.entries) {
        auto& count = read[errorNamed(entry)];
        auto const number = entry.value.integer();
        if (!number || *number < 0 || *number > UINT32_MAX)
            throw ChassisError(entry.line, entry.key + " cannot be " + entry.value.words() +
                                               "; write a number from 0 to 4294967295");
        count = static_cast<std::uint32_t>(*number);
    }
    return read;
}

LineDraft readLine(Description const& line, std::string const& of) {
    std::string const what = "the line of " + of;
    requireMap(line, what, "type:");
    refuseUnknownKeys(line, what, kLineKeys);
    LineDraft draft;
    draft.type = readType(line, what);
    draft.rates = readRates(line);
    draft.alarms = readAlarms(line);
    Description const* const past = line.find("past");
    if (past != nullptr && past->form != Form::nothing) draft.past = readPast(*past);
    return draft;
}

} // namespace kvlsim
