// SPDX-License-Identifier: BSD-2-Clause
// Objects and values as JSON, in the very form in which a description is written.
#include "simulator/ChassisJson.h"

#include "simulator/AttributeSchema.h"

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

} // namespace

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
    for (auto const& [name, value] : object.attributes) {
        bool const isType = name == "TYPE";
        if (!isType)
            attributes[name] = toJson(name, value);
        else if (object.kind == ObjectKind::device || object.kind == ObjectKind::subDevice)
            json["type"] = value.asNumber();
    }
    for (std::int32_t const handle : object.children) {
        ChassisObject const& child = *chassis.find(handle);
        json[listFor(child.kind)].push_back(toJson(child, chassis));
    }
    return json;
}

} // namespace kvlsim
