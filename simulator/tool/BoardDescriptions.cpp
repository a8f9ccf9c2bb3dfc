// SPDX-License-Identifier: BSD-2-Clause
// Boards from files or options, and attribute values from words, as the tool sends them.
#include "simulator/tool/BoardDescriptions.h"

#include <algorithm>
#include <set>
#include <sstream>
#include <utility>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/Generator.h"
#include "simulator/tool/ControlClient.h"

namespace kvlsim {

namespace {

nlohmann::json numberOrText(std::string const& words) {
    Description written;
    written.form = Description::Form::plain;
    written.scalar = words;
    if (auto const number = written.integer()) return *number;
    return words;
}

void collectHandles(nlohmann::json const& object, std::set<std::int64_t>& handles) {
    if (object.contains("handle")) handles.insert(object.at("handle").get<std::int64_t>());
    for (char const* list : {"boards", "devices", "subdevices", "processors"})
        if (object.contains(list))
            for (auto const& child : object.at(list))
                collectHandles(child, handles);
}

/// The first free handle behind those of the boards.
std::int64_t freeBoardHandle(nlohmann::json const& reply, std::set<std::int64_t> const& handles) {
    std::int64_t handle = 1;
    for (auto const& board : reply.at("boards"))
        handle = std::max(handle, board.at("handle").get<std::int64_t>() + 1);
    while (handles.contains(handle))
        ++handle;
    return handle;
}

Description describeText(std::string const& text, Findings& findings) {
    auto const first = text.find_first_not_of(" \t\r\n");
    if (first != std::string::npos && text[first] == '{')
        if (auto json = nlohmann::json::parse(text, nullptr, false); json.is_object()) {
            // "show --json" prints more than a chassis.
            for (char const* const more : {"ok", "events"})
                json.erase(more);
            return describeJson(json);
        }
    return describeYaml(text, findings);
}

} // namespace

ToolError errorsOf(Findings const& findings, std::string const& path) {
    std::string errors; // every line begins like the first
    for (auto const& error : findings.errors(path))
        errors += (errors.empty() ? "" : "\nkvlsim: ") + error;
    return ToolError(errors);
}

std::vector<nlohmann::json> readBoardFile(std::string const& path) {
    Findings findings(Findings::OnError::collect);
    Chassis chassis;
    findings.part([&] {
        Description const description = describeText(readChassisFile(path), findings);
        if (description.find("boards") != nullptr) {
            chassis = readChassis(description, findings);
        } else if (auto board = readBoard(description, findings)) {
            chassis.insertBoard(*std::move(board));
        }
    });
    if (findings.hasErrors()) throw errorsOf(findings, path);
    std::vector<nlohmann::json> boards;
    for (std::int32_t const handle : chassis.root().children)
        boards.push_back(toJson(*chassis.find(handle), chassis));
    return boards;
}

nlohmann::json makeBoard(BoardOptions const& options, nlohmann::json const& reply) {
    std::set<std::int64_t> handles;
    collectHandles(reply, handles);
    std::int64_t const handle =
        options.handle != 0 ? options.handle : freeBoardHandle(reply, handles);
    handles.insert(handle);
    auto next = static_cast<std::int32_t>(*handles.rbegin() + 1);
    GeneratorOptions generated;
    generated.devices = options.devices;
    generated.seed = static_cast<std::uint32_t>(handle);
    generated.family = options.family;
    nlohmann::json board = Generator(generated).board(static_cast<std::int32_t>(handle), next);
    nlohmann::json& attributes = board["attributes"];
    attributes["SERIAL_NUMBER"] =
        options.serial.empty() ? "SIM" + std::to_string(handle) : options.serial;
    if (!options.family.empty() && attributes["FAMILY"] != options.family) // one of their own
        attributes["FAMILY"] = attributes["CTPLATFORM"] = attributes["NAME"] = options.family;
    if (!options.platform.empty()) attributes["CTPLATFORM"] = options.platform;
    if (!options.name.empty()) attributes["NAME"] = options.name;
    if (!options.description.empty()) attributes["DESCRIPTION"] = options.description;
    attributes.update(attributesFrom(options.attributes));
    return board;
}

nlohmann::json attributeValue(std::string_view name, std::string const& words,
                              std::string const& form) {
    if (form == "empty") return {{"empty", true}};
    if (form == "text") return words;
    if (form == "descriptor") {
        std::string numbers = words;
        std::ranges::replace(numbers, ',', ' ');
        std::istringstream stream(numbers);
        nlohmann::json list = nlohmann::json::array();
        for (std::string number; stream >> number;)
            list.push_back(numberOrText(number));
        return {{"descriptor", list}};
    }
    if (!form.empty()) return {{form, numberOrText(words)}};
    if (kindOf(name) == AttributeKind::descriptor) return attributeValue(name, words, "descriptor");
    if (kindOf(name) == AttributeKind::text) return words;
    return numberOrText(words);
}

nlohmann::json attributesFrom(std::vector<std::string> const& words) {
    nlohmann::json attributes = nlohmann::json::object();
    for (auto const& word : words) {
        auto const equals = word.find('=');
        if (equals == std::string::npos || equals == 0)
            throw ToolError("--attribute " + inQuotes(word) + " is no NAME=VALUE; write for " +
                            "example --attribute IRQ=11");
        std::string const name = word.substr(0, equals);
        attributes[name] = attributeValue(name, word.substr(equals + 1), "");
    }
    return attributes;
}

} // namespace kvlsim
