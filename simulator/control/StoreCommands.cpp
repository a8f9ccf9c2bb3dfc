// SPDX-License-Identifier: BSD-2-Clause
// The control commands for the attribute store.
#include "simulator/base/Text.h"
#include "simulator/control/CommandContext.h"
#include "simulator/description/Description.h"
#include "simulator/description/StoreReader.h"
#include "simulator/store/StoreContents.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

Json toJson(BoardRecord const& record) {
    Json fields = Json::object();
    for (auto const& field : boardFields()) {
        if (field.name == "SerialNumber") continue;
        FieldValue const value = record.get(field);
        Json& json = fields[std::string(field.name)];
        if (auto const* number = std::get_if<std::int32_t>(&value))
            json = *number;
        else
            json = std::get<std::string>(value);
    }
    return fields;
}

std::string serialOf(CommandContext const& context) {
    std::string serial = context.arguments.text("serial");
    refuseUnfitSerial(serial, 0);
    return serial;
}

std::string familyOf(CommandContext const& context) {
    std::string family = context.arguments.text("family");
    refuseUnfitFamily(family, 0);
    return family;
}

FieldValues fieldsOf(CommandContext const& context) {
    return readFields(describeJson(context.arguments.value("fields")));
}

} // namespace

Json listStore(CommandContext const& context) {
    context.arguments.allow({"serial"});
    bool const one = context.arguments.has("serial");
    std::string const serial = one ? serialOf(context) : "";
    StoreListing const listing = context.platform.store().list();
    Json reply = {{"file", listing.path}, {"families", Json::array()}, {"boards", Json::array()}};
    for (auto const& [instance, name] : listing.families)
        reply["families"].push_back({{"instance", instance}, {"name", name}});
    for (auto const& board : listing.boards) {
        if (one && board.record.serialNumber() != serial) continue;
        reply["boards"].push_back({{"instance", board.instance},
                                   {"family", board.family},
                                   {"serial", board.record.serialNumber()},
                                   {"fields", toJson(board.record)}});
    }
    if (one && reply["boards"].empty())
        throw CommandError("no record with serial number " + inQuotes(serial) +
                           " in the store; \"kvlsim store list\" lists what is there");
    return reply;
}

Json addToStore(CommandContext const& context) {
    context.arguments.allow({"serial", "family", "fields"});
    if (!context.arguments.has("serial")) {
        std::string const family = familyOf(context);
        context.platform.store().addFamily(family);
        return {{"family", family}};
    }
    StoreBoardDraft draft;
    draft.serial = serialOf(context);
    if (context.arguments.has("family")) draft.family = familyOf(context);
    if (context.arguments.has("fields")) draft.fields = fieldsOf(context);
    StoreBoard const board = context.platform.read([&](Chassis const* chassis) {
        return makeRecord(draft, present(chassis).boardWithSerial(draft.serial));
    });
    if (board.family.empty())
        throw CommandError("no board of the chassis has serial number " + inQuotes(draft.serial) +
                           " and a FAMILY; give \"family\"");
    refuseUnfitFamily(board.family, 0);
    context.platform.store().add(board);
    return {{"serial", draft.serial}, {"family", board.family}};
}

Json setInStore(CommandContext const& context) {
    context.arguments.allow({"serial", "fields"});
    std::string const serial = serialOf(context);
    context.platform.store().set(serial, fieldsOf(context));
    return {{"serial", serial}};
}

Json removeFromStore(CommandContext const& context) {
    context.arguments.allow({"serial", "family"});
    if (context.arguments.has("serial") == context.arguments.has("family"))
        throw CommandError("give either \"serial\", to remove a board's record, or \"family\", to "
                           "remove a family with all its boards");
    if (context.arguments.has("family")) {
        std::string const family = familyOf(context);
        context.platform.store().removeFamily(family);
        return {{"family", family}};
    }
    std::string const serial = serialOf(context);
    context.platform.store().remove(serial);
    return {{"serial", serial}};
}

} // namespace kvlsim
