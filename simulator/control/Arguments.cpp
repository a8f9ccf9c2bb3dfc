// SPDX-License-Identifier: BSD-2-Clause
// The arguments of one control command, checked as they are taken.
#include "simulator/control/Arguments.h"

#include <algorithm>

#include "simulator/base/Text.h"
#include "simulator/description/Description.h"

namespace kvlsim {

namespace {

std::string wordsFor(nlohmann::json const& json) {
    if (json.is_object()) return "an object";
    if (json.is_array()) return "a list";
    if (json.is_string()) return inQuotes(json.get_ref<std::string const&>());
    return json.dump();
}

std::string argument(char const* name) {
    return "\"" + std::string(name) + "\"";
}

} // namespace

void Arguments::allow(std::initializer_list<std::string_view> names) const {
    for (auto const& [key, value] : m_command.items()) {
        if (key == "command" || std::ranges::find(names, key) != names.end()) continue;
        std::string known;
        for (auto const& name : names)
            appendToList(known, name);
        throw CommandError("unknown argument " + inQuotes(key) +
                           (known.empty() ? "; this command takes none" : "; known: " + known));
    }
}

nlohmann::json const& Arguments::value(char const* name) const {
    auto const found = m_command.find(name);
    if (found == m_command.end())
        throw CommandError("argument " + argument(name) + " is missing; give it");
    return *found;
}

std::string Arguments::text(char const* name) const {
    auto const& json = value(name);
    if (!json.is_string())
        throw CommandError(argument(name) + " cannot be " + wordsFor(json) + "; write a text");
    return json.get<std::string>();
}

bool Arguments::flag(char const* name) const {
    if (!has(name)) return false;
    auto const& json = value(name);
    if (!json.is_boolean())
        throw CommandError(argument(name) + " cannot be " + wordsFor(json) +
                           "; write true or false");
    return json.get<bool>();
}

std::optional<std::int64_t> Arguments::readNumber(char const* name) const {
    auto const& json = value(name);
    Description written;
    written.form = Description::Form::plain;
    if (json.is_number_integer())
        written.scalar = json.dump();
    else if (json.is_string())
        written.scalar = json.get<std::string>();
    return written.integer();
}

std::int64_t Arguments::number(char const* name, std::int64_t least, std::int64_t most) const {
    auto const number = readNumber(name);
    if (!number || *number < least || *number > most)
        throw CommandError(argument(name) + " cannot be " + wordsFor(value(name)) +
                           "; write a whole number from " + std::to_string(least) + " to " +
                           std::to_string(most));
    return *number;
}

ChassisObject const* Arguments::look(char const* name, Chassis const& chassis,
                                     bool boardsOnly) const {
    auto const& json = value(name);
    if (!json.is_number_integer() && !json.is_string())
        throw CommandError(argument(name) + " cannot be " + wordsFor(json) +
                           "; write a handle, a serial number or a NAME");
    auto const fits = [boardsOnly](ChassisObject const* object) {
        return object != nullptr &&
               (boardsOnly ? object->kind == ObjectKind::board : object->kind != ObjectKind::root);
    };
    if (auto const handle = readNumber(name);
        handle && *handle > 0 && *handle < Chassis::kRootHandle)
        if (auto const* object = chassis.find(static_cast<long>(*handle)); fits(object))
            return object;
    if (!json.is_string()) return nullptr;
    auto const& text = json.get_ref<std::string const&>();
    if (auto const* board = chassis.boardWithSerial(text)) return board;
    auto named = chassis.named(text);
    std::erase_if(named, [&](auto const* object) { return !fits(object); });
    if (named.size() > 1)
        throw CommandError(std::to_string(named.size()) + (boardsOnly ? " boards" : " objects") +
                           " are called " + inQuotes(text) + "; write the handle" +
                           (boardsOnly ? " or the serial number" : ""));
    return named.empty() ? nullptr : named.front();
}

ChassisObject const& Arguments::found(char const* name, Chassis const& chassis,
                                      bool boardsOnly) const {
    ChassisObject const* const object = look(name, chassis, boardsOnly);
    if (object == nullptr && boardsOnly) {
        // The handle of a device or processor: name the board that owns it.
        auto const handle = readNumber(name);
        auto const* part = handle && *handle > 0 && *handle < Chassis::kRootHandle
                               ? chassis.find(static_cast<long>(*handle))
                               : nullptr;
        if (part != nullptr) {
            auto const* owner = part;
            while (owner->kind != ObjectKind::board)
                owner = chassis.find(owner->parent);
            throw CommandError(std::to_string(part->handle) + " is a " + nameOf(part->kind) +
                               " of board " + std::to_string(owner->handle) +
                               ", not a board; name board " + std::to_string(owner->handle));
        }
    }
    if (object == nullptr)
        throw CommandError(std::string("no ") + (boardsOnly ? "board" : "object") + " " +
                           wordsFor(value(name)) +
                           " in the chassis; \"kvlsim show\" lists what is there");
    return *object;
}

ChassisObject const& Arguments::board(Chassis const& chassis) const {
    return found("board", chassis, true);
}

ChassisObject const& Arguments::object(Chassis const& chassis, char const* name) const {
    return found(name, chassis, false);
}

std::int32_t Arguments::boardHandle(Chassis const& chassis) const {
    if (ChassisObject const* const board = look("board", chassis, true)) return board->handle;
    auto const handle = readNumber("board");
    if (handle && *handle >= INT32_MIN && *handle <= INT32_MAX)
        return static_cast<std::int32_t>(*handle);
    return board(chassis).handle; // reports what is wrong
}

} // namespace kvlsim
