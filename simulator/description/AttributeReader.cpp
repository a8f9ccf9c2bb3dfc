// SPDX-License-Identifier: BSD-2-Clause
// Reads attributes from their description: forms, ranges, kinds of known attributes.
#include <algorithm>
#include <array>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/chassis/Chassis.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/AttributeReader.h"
#include "simulator/description/Description.h"

namespace kvlsim {

namespace {

constexpr std::size_t kMaxNameLength = 127;

struct FormName {
    std::string_view word;
    ValueForm form;
};

constexpr std::array<FormName, 6> kForms = {{{"text", ValueForm::text},
                                             {"number", ValueForm::number},
                                             {"short", ValueForm::shortNumber},
                                             {"byte", ValueForm::byte},
                                             {"empty", ValueForm::empty},
                                             {"descriptor", ValueForm::descriptor}}};

constexpr std::string_view kDescriptorExample = "{descriptor: [1, 2, 3, 4]}";

/// What to write for an attribute of this kind.
std::string advice(AttributeKind kind) {
    switch (kind) {
    case AttributeKind::text:
        return "it is a text, write it in quotes";
    case AttributeKind::number:
        return "it is a number, write a decimal or 0x number";
    case AttributeKind::byte:
        return "it is a one-byte number, write one from -128 to 255";
    case AttributeKind::descriptor:
        return "it is a descriptor, write " + std::string(kDescriptorExample);
    case AttributeKind::any:
        break;
    }
    return "write a text, a whole number, or one of {short: 1}, {byte: 1}, {empty: true}, " +
           std::string(kDescriptorExample);
}

[[noreturn]] void refuse(std::string_view name, Description const& value, AttributeKind kind) {
    throw ChassisError(value.line,
                       std::string(name) + " cannot be " + value.words() + "; " + advice(kind));
}

bool allowed(AttributeKind kind, ValueForm form) {
    if (kind == AttributeKind::any || form == ValueForm::empty) return true;
    switch (form) {
    case ValueForm::text:
        return kind == AttributeKind::text;
    case ValueForm::number:
    case ValueForm::shortNumber:
        return kind == AttributeKind::number;
    case ValueForm::byte:
        return kind == AttributeKind::number || kind == AttributeKind::byte;
    default:
        return kind == AttributeKind::descriptor;
    }
}

/// A number of `bytes` bytes, written signed or unsigned, as its two's complement.
std::int64_t readNumber(std::string_view name, Description const& value, int bytes) {
    std::int64_t const least = -(std::int64_t(1) << (8 * bytes - 1));
    std::int64_t const most = (std::int64_t(1) << (8 * bytes)) - 1;
    if (!value.readsAsInteger())
        throw ChassisError(value.line, std::string(name) + " cannot be " + value.words() +
                                           "; write a decimal or 0x number");
    auto const number = value.integer();
    if (!number || *number < least || *number > most)
        throw ChassisError(value.line, std::string(name) + ": " + value.words() +
                                           " is out of range; a number of " +
                                           std::to_string(bytes) + " byte" +
                                           (bytes == 1 ? "" : "s") + " goes from " +
                                           std::to_string(least) + " to " + std::to_string(most));
    return *number;
}

AttributeValue readDescriptor(std::string_view name, Description const& value) {
    DescriptorWords words{};
    if (value.form != Description::Form::list || value.items.size() != words.size())
        throw ChassisError(value.line, std::string(name) +
                                           ": a descriptor is a list of four numbers; write " +
                                           std::string(kDescriptorExample));
    for (std::size_t i = 0; i < words.size(); ++i)
        words[i] = static_cast<std::uint16_t>(readNumber(name, value.items[i], 2));
    return AttributeValue::descriptor(words);
}

AttributeValue readEmpty(std::string_view name, Description const& value) {
    bool const yes =
        (value.form == Description::Form::plain || value.form == Description::Form::other) &&
        value.scalar == "true";
    if (!yes)
        throw ChassisError(value.line, std::string(name) + ": an answer without bytes is written " +
                                           "{empty: true}");
    return AttributeValue::empty();
}

AttributeValue readForm(std::string_view name, ValueForm form, Description const& value) {
    switch (form) {
    case ValueForm::number:
        return AttributeValue::number(static_cast<std::int32_t>(readNumber(name, value, 4)));
    case ValueForm::shortNumber:
        return AttributeValue::shortNumber(static_cast<std::int16_t>(readNumber(name, value, 2)));
    case ValueForm::byte:
        return AttributeValue::byte(static_cast<std::int8_t>(readNumber(name, value, 1)));
    case ValueForm::empty:
        return readEmpty(name, value);
    case ValueForm::descriptor:
        return readDescriptor(name, value);
    case ValueForm::text:
        break;
    }
    if (!value.isScalar())
        throw ChassisError(value.line, std::string(name) + " cannot be " + value.words() +
                                           "; write a text in quotes");
    refuseUnfitText(name, value.scalar, value.line);
    return AttributeValue::text(value.scalar);
}

AttributeValue readExplicit(std::string_view name, AttributeKind kind, Description const& value) {
    if (value.entries.size() != 1) refuse(name, value, kind);
    DescriptionEntry const& entry = value.entries.front();
    for (auto const& [word, form] : kForms) {
        if (word != entry.key) continue;
        if (!allowed(kind, form))
            throw ChassisError(entry.line, std::string(name) + " cannot be {" + entry.key +
                                               ": ...}; " + advice(kind));
        return readForm(name, form, entry.value);
    }
    throw ChassisError(entry.line, std::string(name) + ": no form of value is called " +
                                       inQuotes(entry.key) +
                                       "; there are text, number, short, byte, empty, descriptor");
}

/// Attributes that cannot be written.
void refuseUnfitAttribute(DescriptionEntry const& entry) {
    refuseUnfitName(entry.key, entry.line);
    if (entry.key == "TYPE")
        throw ChassisError(entry.line, "TYPE follows from what the object is; remove it "
                                       "(a device's is written as type:)");
    if (isLiveAttribute(entry.key))
        throw ChassisError(entry.line, entry.key + " follows from the device's line: or "
                                                   "channels:; remove it");
}

} // namespace

void refuseUnfitName(std::string_view name, int line) {
    bool const fits = !name.empty() && name.size() <= kMaxNameLength &&
                      std::ranges::none_of(name, [](char c) { return isControl(c); });
    if (!fits)
        throw ChassisError(line, inQuotes(name) + " cannot be an attribute's name; it has 1 to " +
                                     std::to_string(kMaxNameLength) + " printable characters");
}

void refuseUnfitText(std::string_view name, std::string_view text, int line) {
    if (text.size() > kMaxTextLength)
        throw ChassisError(line, std::string(name) + ": a text of " + std::to_string(text.size()) +
                                     " bytes is too long; " + std::to_string(kMaxTextLength) +
                                     " is the most");
    if (text.find('\0') != std::string_view::npos)
        throw ChassisError(line, std::string(name) + ": a text cannot contain a NUL; remove it");
}

AttributeValue readAttribute(std::string_view name, Description const& value) {
    AttributeKind const kind = kindOf(name);
    if (value.form == Description::Form::nothing)
        throw ChassisError(value.line,
                           std::string(name) + " has no value; write one or remove the attribute");
    if (value.form == Description::Form::map) return readExplicit(name, kind, value);
    if (!value.isScalar()) refuse(name, value, kind);
    ValueForm form = ValueForm::text;
    if (value.readsAsInteger())
        form = kind == AttributeKind::byte ? ValueForm::byte : ValueForm::number;
    if (!allowed(kind, form)) refuse(name, value, kind);
    return readForm(name, form, value);
}

AttributeMap readAttributes(Description const& attributes) {
    Findings findings;
    return readAttributes(attributes, findings);
}

AttributeMap readAttributes(Description const& attributes, Findings& findings) {
    if (attributes.form != Description::Form::map)
        throw ChassisError(attributes.line,
                           "attributes cannot be " + attributes.words() +
                               "; write one attribute a line, such as NAME: NX5-T1");
    if (attributes.entries.size() > Chassis::kMaxAttributes)
        throw ChassisError(attributes.line, std::to_string(attributes.entries.size()) +
                                                " attributes are too many; an object has at most " +
                                                std::to_string(Chassis::kMaxAttributes));
    AttributeMap map;
    for (auto const& entry : attributes.entries) {
        findings.part([&] {
            refuseUnfitAttribute(entry);
            auto const [place, added] =
                map.emplace(entry.key, readAttribute(entry.key, entry.value));
            findings.checkName(entry.key, entry.line);
            findings.checkNumber(entry.key, place->second, entry.line);
        });
    }
    return map;
}

} // namespace kvlsim
