// SPDX-License-Identifier: BSD-2-Clause
// Objects and values as JSON, in the very form in which a description is written.
#include "simulator/description/ChassisJson.h"

#include "simulator/chassis/AttributeSchema.h"

namespace kvlsim {

namespace {

char const* listFor(ObjectKind kind) {
    switch (kind) {
    case ObjectKind::device:
        return "devices";
    case ObjectKind::subDevice:
        return "subdevices";
    default:
        return "processors";
    }
}

nlohmann::json toJson(LineRates const& rates) {
    nlohmann::json json = nlohmann::json::object();
    for (std::size_t i = 0; i < rates.size(); ++i)
        if (rates[i] != 0) json[std::string(kLineErrorNames[i])] = perSecond(rates[i]);
    return json;
}

nlohmann::json toJson(LinePast const& past) {
    nlohmann::json json = {{"seconds", past.seconds}, {"errors", toJson(past.rates)}};
    for (auto const& spell : past.spells)
        json["spells"].push_back({{"ago", spell.ago},
                                  {"seconds", spell.seconds},
                                  {"alarms", alarmNames(spell.alarms)},
                                  {"errors", toJson(spell.rates)}});
    return json;
}

/// A line with the errors and alarms that it has now.
nlohmann::json toJson(LiveLine const& line, std::optional<AttributeValue> const& type) {
    LineDraft const& draft = line.draft();
    bool const told = type && type->form() == ValueForm::number;
    auto const now = told ? static_cast<DS1LineType>(type->asNumber()) : draft.type;
    nlohmann::json json = {{"type", nameOf(now)},
                           {"errors", toJson(line.rates())},
                           {"alarms", alarmNames(line.raised())}};
    if (draft.past.seconds > 0) json["past"] = toJson(draft.past);
    return json;
}

} // namespace

nlohmann::json perSecond(std::uint64_t rate) {
    if (rate % kLineRateUnit == 0) return rate / kLineRateUnit;
    return static_cast<double>(rate) / static_cast<double>(kLineRateUnit);
}

nlohmann::json alarmNames(std::uint32_t alarms) {
    nlohmann::json names = nlohmann::json::array();
    for (std::size_t bit = 0; bit < kLineAlarmNames.size(); ++bit)
        if ((alarms >> bit & 1U) != 0) names.push_back(kLineAlarmNames[bit]);
    return names;
}

nlohmann::json toJson(std::string_view attribute, AttributeValue const& value) {
    switch (value.form()) {
    case ValueForm::text:
        return std::string(value.asText());
    case ValueForm::number:
        return value.asNumber();
    case ValueForm::shortNumber:
        return {{"short", value.asNumber()}};
    case ValueForm::byte:
        if (kindOf(attribute) == AttributeKind::byte) return value.asNumber();
        return {{"byte", value.asNumber()}};
    case ValueForm::empty:
        return {{"empty", true}};
    case ValueForm::descriptor:
        return {{"descriptor", value.asDescriptor()}};
    }
    return nullptr;
}

nlohmann::json toJson(ChassisObject const& object, Chassis const& chassis) {
    nlohmann::json json = {{"handle", object.handle}};
    nlohmann::json& attributes = json["attributes"] = nlohmann::json::object();
    object.attributes.forEach([&](std::string_view name, AttributeValue const& value) {
        bool const isType = name == "TYPE";
        if (!isType)
            attributes[std::string(name)] = toJson(name, value);
        else if (object.kind == ObjectKind::device || object.kind == ObjectKind::subDevice)
            json["type"] = value.asNumber();
    });
    if (object.ds1Line) json["line"] = toJson(*object.ds1Line, object.attribute(kDS1LineType));
    if (object.channels)
        json["channels"] = {{"bearers", object.channels->bearers()},
                            {"signalling", nameOf(object.channels->signalling())}};
    for (std::int32_t const handle : object.children) {
        ChassisObject const& child = *chassis.find(handle);
        json[listFor(child.kind)].push_back(toJson(child, chassis));
    }
    return json;
}

} // namespace kvlsim
