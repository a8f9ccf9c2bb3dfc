// SPDX-License-Identifier: BSD-2-Clause
// Prints the reply to "show" for people.
#include "simulator/tool/ShowTable.h"

#include <iomanip>
#include <string>
#include <vector>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/tool/TextTable.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// "-" when missing.
std::string words(Json const& board, char const* attribute) {
    auto const& attributes = board.at("attributes");
    auto const found = attributes.find(attribute);
    return found == attributes.end() ? "-" : cellText(*found);
}

std::string condition(Json const& board) {
    auto const& attributes = board.at("attributes");
    auto const found = attributes.find("BOARD_CONDITION");
    if (found == attributes.end() || !found->is_number_integer())
        return words(board, "BOARD_CONDITION");
    switch (static_cast<BoardCondition>(found->get<std::int32_t>())) {
    case BoardCondition::started:
        return "started";
    case BoardCondition::stopped:
        return "stopped";
    case BoardCondition::startPending:
        return "start pending";
    case BoardCondition::stopPending:
        return "stop pending";
    case BoardCondition::failed:
        return "failed";
    }
    return found->dump();
}

std::string count(Json const& board, char const* list) {
    return std::to_string(board.contains(list) ? board.at(list).size() : 0);
}

/// A value as people read it: 11, a text, "7 (2 bytes)", "1, 1, 16, 1".
std::string readable(Json const& value) {
    if (value.is_string()) return oneLine(value.get<std::string>());
    if (!value.is_object()) return value.dump();
    if (value.contains("short")) return value.at("short").dump() + " (2 bytes)";
    if (value.contains("byte")) return value.at("byte").dump() + " (1 byte)";
    if (value.contains("empty")) return "(no bytes)";
    if (!value.contains("descriptor")) return value.dump();
    std::string words;
    for (auto const& word : value.at("descriptor"))
        appendToList(words, word.dump());
    return words;
}

void printAttributes(Json const& object, std::size_t indent, std::ostream& out) {
    for (auto const& [name, value] : object.at("attributes").items())
        out << std::string(indent, ' ') << std::left << std::setw(22) << oneLine(name) << "  "
            << readable(value) << '\n';
}

/// "line: e1-crc, alarms rai, errors per second code-violations 0.5". Its past is left out.
void printLine(Json const& object, std::size_t indent, std::ostream& out) {
    if (!object.contains("line")) return;
    Json const& line = object.at("line");
    std::string alarms;
    for (auto const& alarm : line.at("alarms"))
        appendToList(alarms, alarm.get<std::string>());
    std::string errors;
    for (auto const& [name, rate] : line.at("errors").items())
        appendToList(errors, name + ' ' + rate.dump());
    out << std::string(indent, ' ') << "line: " << readable(line.at("type"))
        << (alarms.empty() ? ", no alarms" : ", alarms " + alarms)
        << (errors.empty() ? ", no steady errors" : ", errors per second " + errors) << '\n';
}

void printChannels(Json const& object, std::size_t indent, std::ostream& out) {
    if (!object.contains("channels")) return;
    Json const& channels = object.at("channels");
    out << std::string(indent, ' ') << "channels: " << channels.at("bearers").dump()
        << " bearers, signalling " << readable(channels.at("signalling")) << '\n';
}

void printObjects(Json const& parent, char const* list, char const* kind, std::size_t indent,
                  std::ostream& out) {
    if (!parent.contains(list)) return;
    for (auto const& object : parent.at(list)) {
        out << std::string(indent, ' ') << kind << ' ' << object.at("handle").dump();
        if (object.contains("type")) out << ", type " << object.at("type").dump();
        out << '\n';
        printAttributes(object, indent + 2, out);
        printLine(object, indent + 2, out);
        printChannels(object, indent + 2, out);
        printObjects(object, "subdevices", "sub-device", indent + 2, out);
    }
}

} // namespace

void printBoards(Json const& reply, std::ostream& out) {
    std::vector<TextRow> rows = {{"HANDLE", "NAME", "SERIAL", "FAMILY", "CONDITION", "PRESENT",
                                  "DEVICES", "PROCESSORS", "CHANGED"}};
    for (auto const& board : reply.at("boards"))
        rows.push_back({board.at("handle").dump(), words(board, "NAME"),
                        words(board, "SERIAL_NUMBER"), words(board, "FAMILY"), condition(board),
                        words(board, "BOARD_PRESENT") == "1" ? "yes" : "no",
                        count(board, "devices"), count(board, "processors"),
                        words(board, "STATE_CHANGE_DATE")});
    printColumns(rows, out);
}

void printDetails(Json const& reply, std::ostream& out) {
    for (auto const& board : reply.at("boards")) {
        out << "board " << board.at("handle").dump() << ", " << condition(board) << '\n';
        printAttributes(board, 2, out);
        printObjects(board, "devices", "device", 2, out);
        printObjects(board, "processors", "processor", 2, out);
    }
}

} // namespace kvlsim
