// SPDX-License-Identifier: BSD-2-Clause
// kvlsim store: lists and changes the records of the attribute store.
#include "simulator/tool/StoreTool.h"

#include <iomanip>
#include <iostream>

#include "simulator/base/Text.h"
#include "simulator/chassis/StoreSchema.h"
#include "simulator/tool/BoardDescriptions.h"
#include "simulator/tool/CommandGroup.h"
#include "simulator/tool/TextTable.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// `StoreOptions` are the options of all commands of `kvlsim store`.
struct StoreOptions {
    std::string serial;
    std::vector<std::string> serials;
    std::string family;
    std::vector<std::string> fields; ///< NAME=VALUE
    bool json = false;
};

constexpr char const* kFieldHelp = "Field as NAME=VALUE, such as IRQ=11";

/// Texts stay texts, even if they look like numbers.
Json fieldsFrom(std::vector<std::string> const& words) {
    Json fields = Json::object();
    for (auto const& word : words) {
        auto const equals = word.find('=');
        if (equals == std::string::npos || equals == 0)
            throw ToolError(inQuotes(word) + " is no NAME=VALUE; write for example IRQ=11");
        std::string const name = word.substr(0, equals);
        RecordField const* const field = boardFieldNamed(name);
        bool const isText = field != nullptr && field->kind == FieldKind::text;
        fields[name] = attributeValue(name, word.substr(equals + 1), isText ? "text" : "");
    }
    return fields;
}

void printStore(Json const& reply, std::ostream& out) {
    out << "file      " << cellText(reply.at("file")) << "\nfamilies ";
    for (auto const& family : reply.at("families"))
        out << ' ' << cellText(family.at("name"));
    out << "\n\n";
    std::vector<TextRow> rows = {
        {"INSTANCE", "FAMILY", "SERIAL", "MODEL", "TYPE", "BOARD", "SLOT", "FIRMWARE", "VERSION"}};
    for (auto const& board : reply.at("boards")) {
        Json const& fields = board.at("fields");
        rows.push_back({board.at("instance").dump(), cellText(board.at("family")),
                        cellText(board.at("serial")), cellText(fields.at("Model")),
                        cellText(fields.at("Type")), cellText(fields.at("BoardID")),
                        cellText(fields.at("PCISlotNumber")), cellText(fields.at("FirmwareName")),
                        cellText(fields.at("FirmwareVersion"))});
    }
    printColumns(rows, out);
}

void printRecords(Json const& reply, std::ostream& out) {
    for (auto const& board : reply.at("boards")) {
        out << "record " << board.at("instance").dump() << ", family "
            << cellText(board.at("family")) << ", serial number " << cellText(board.at("serial"))
            << '\n';
        for (auto const& [name, value] : board.at("fields").items())
            out << "  " << std::left << std::setw(24) << name << cellText(value) << '\n';
    }
}

void listRecords(StoreOptions const& options, Connect const& connect) {
    Json command = {{"command", "store-list"}};
    if (!options.serial.empty()) command["serial"] = options.serial;
    Json const reply = connect().request(command);
    if (options.json)
        std::cout << reply.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
    else if (options.serial.empty())
        printStore(reply, std::cout);
    else
        printRecords(reply, std::cout);
}

void addRecord(StoreOptions const& options, Connect const& connect) {
    Json command = {{"command", "store-add"}};
    if (!options.serial.empty()) command["serial"] = options.serial;
    if (!options.family.empty()) command["family"] = options.family;
    if (!options.fields.empty()) command["fields"] = fieldsFrom(options.fields);
    connect().request(command);
}

void setRecord(StoreOptions const& options, Connect const& connect) {
    connect().request({{"command", "store-set"},
                       {"serial", options.serial},
                       {"fields", fieldsFrom(options.fields)}});
}

void removeRecord(StoreOptions const& options, Connect const& connect) {
    ControlClient client = connect();
    // All are looked up before the first is removed: a wrong one removes nothing.
    for (auto const& serial : options.serials)
        client.request({{"command", "store-list"}, {"serial", serial}});
    for (auto const& serial : options.serials)
        client.request({{"command", "store-remove"}, {"serial", serial}});
    if (!options.family.empty())
        client.request({{"command", "store-remove"}, {"family", options.family}});
}

} // namespace

void addStoreCommands(CLI::App& app, Connect connect, std::function<void()>& chosen) {
    CommandGroup<StoreOptions> group(app, "store", "Records of the attribute store", connect,
                                     chosen);
    auto const& options = group.options();
    constexpr char const* serialHelp = "Serial number of the board";

    auto* command = group.add("list", "List the records, or show one", listRecords);
    command->add_option("serial", options->serial, serialHelp);
    command->add_flag("--json", options->json, "Print the reply as JSON");

    command = group.add("add", "Add a board's record, or a family", addRecord);
    auto* const serial = command->add_option("serial", options->serial, serialHelp);
    auto* const family =
        command->add_option("--family", options->family,
                            "Family (default: that of the chassis's board); alone: add it");
    command->add_option("--field", options->fields, std::string(kFieldHelp) + "; repeat for more")
        ->allow_extra_args(false)
        ->needs(serial);
    command->callback([&chosen, options, connect, serial, family] {
        if (serial->count() + family->count() == 0)
            throw CLI::RequiredError("a serial number or --family");
        chosen = [options, connect] { addRecord(*options, connect); };
    });

    command = group.add("set", "Set fields of a record", setRecord);
    command->add_option("serial", options->serial, serialHelp)->required();
    command->add_option("fields", options->fields, kFieldHelp)->required();

    command = group.add("remove", "Remove records", removeRecord);
    auto* const serials = command->add_option("serials", options->serials, serialHelp);
    auto* const whole =
        command->add_option("--family", options->family, "A family, removed with all its boards");
    command->callback([&chosen, options, connect, serials, whole] {
        if (serials->count() + whole->count() == 0)
            throw CLI::RequiredError("a serial number or --family");
        chosen = [options, connect] { removeRecord(*options, connect); };
    });
}

} // namespace kvlsim
