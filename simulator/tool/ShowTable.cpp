// SPDX-License-Identifier: BSD-2-Clause
// Prints what "show" replies for human eyes.
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
    if (found == attributes.end()) return "-";
    return found->is_string() ? oneLine(found->get<std::string>()) : found->dump();
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

void printAttributes(Json const& object, std::size_t indent, std::ostream& out) {
    for (auto const& [name, value] : object.at("attributes").items())
        out << std::string(indent, ' ') << std::left << std::setw(22) << oneLine(name) << "  "
            << (value.is_string() ? oneLine(value.get<std::string>()) : value.dump()) << '\n';
}

/// A line's past is left out: it may be long, and is over.
void printPart(Json const& object, char const* name, std::size_t indent, std::ostream& out) {
    if (!object.contains(name)) return;
    Json part = object.at(name);
    part.erase("past");
    out << std::string(indent, ' ') << name << ' ' << part.dump() << '\n';
}

void printObjects(Json const& parent, char const* list, char const* kind, std::size_t indent,
                  std::ostream& out) {
    if (!parent.contains(list)) return;
    for (auto const& object : parent.at(list)) {
        out << std::string(indent, ' ') << kind << ' ' << object.at("handle").dump();
        if (object.contains("type")) out << ", type " << object.at("type").dump();
        out << '\n';
        printAttributes(object, indent + 2, out);
        printPart(object, "line", indent + 2, out);
        printPart(object, "channels", indent + 2, out);
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
