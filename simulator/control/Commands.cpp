// SPDX-License-Identifier: BSD-2-Clause
// The control commands and their dispatcher.
#include "simulator/control/Commands.h"

#include <array>
#include <string>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/control/CommandContext.h"
#include "simulator/description/AttributeReader.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/LineReader.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

using Context = CommandContext;

/// Sets BOARD_CONDITION and, when that changes it, STATE_CHANGE_DATE.
void setCondition(Chassis& chassis, std::int32_t board, AttributeValue const& condition) {
    auto const before = chassis.find(board)->attribute("BOARD_CONDITION");
    bool const changes = !before || before->bytes() != condition.bytes();
    chassis.setAttribute(board, "BOARD_CONDITION", condition);
    if (changes)
        chassis.setAttribute(board, "STATE_CHANGE_DATE", AttributeValue::text(currentDate()));
}

void setCondition(Chassis& chassis, std::int32_t board, BoardCondition condition) {
    setCondition(chassis, board, AttributeValue::number(static_cast<std::int32_t>(condition)));
}

Json insert(Context const& context) {
    context.arguments.allow({"board"});
    auto const& description = context.arguments.value("board");
    if (!description.is_object())
        throw CommandError("\"board\" must be a board's description, an object with \"handle\" "
                           "and \"attributes\"");
    ObjectDraft board = readBoard(describeJson(description));
    std::int32_t const handle = board.handle;
    context.platform.write([&](Chassis* chassis) {
        present(chassis).insertBoard(std::move(board));
        context.announce(EventId::boardStarted, handle);
    });
    return {{"board", handle}};
}

/// Runs `change(chassis, handle)` on the board that the command names.
template <typename Change>
Json changeBoard(Context const& context, Change change) {
    std::int32_t handle = 0;
    context.platform.write([&](Chassis* maybe) {
        Chassis& chassis = present(maybe);
        handle = context.arguments.board(chassis).handle;
        change(chassis, handle);
    });
    return {{"board", handle}};
}

Json remove(Context const& context) {
    context.arguments.allow({"board"});
    return changeBoard(context, [&](Chassis& chassis, std::int32_t board) {
        chassis.removeBoard(board);
        context.announce(EventId::boardRemoved, board);
    });
}

Json replace(Context const& context) {
    context.arguments.allow({"board", "serial", "attributes"});
    std::string const serial = context.arguments.text("serial");
    if (serial.empty()) throw CommandError("\"serial\" is empty; write the new serial number");
    refuseUnfitText("\"serial\"", serial, 0);
    AttributeMap attributes;
    if (context.arguments.has("attributes"))
        attributes = readAttributes(describeJson(context.arguments.value("attributes")));
    if (attributes.contains(std::string_view("SERIAL_NUMBER")))
        throw CommandError("the serial number is given by \"serial\"; remove SERIAL_NUMBER from "
                           "the attributes");
    return changeBoard(context, [&](Chassis& chassis, std::int32_t board) {
        auto const before = chassis.find(board)->attribute("SERIAL_NUMBER");
        auto const now = AttributeValue::text(serial);
        if (before && before->bytes() == now.bytes())
            throw CommandError("board " + std::to_string(board) + " already has serial number " +
                               inQuotes(serial) + "; a replacement has another");
        chassis.setAttribute(board, "SERIAL_NUMBER", now);
        // A board that has just been plugged in runs, whatever the condition of its predecessor.
        setCondition(chassis, board, BoardCondition::started);
        chassis.setAttribute(board, "BOARD_PRESENT", AttributeValue::number(1));
        for (auto const& [name, value] : attributes)
            chassis.setAttribute(board, name, value);
        context.announce(EventId::boardStarted, board);
    });
}

Json start(Context const& context) {
    context.arguments.allow({"board"});
    return changeBoard(context, [&](Chassis& chassis, std::int32_t board) {
        context.announce(EventId::boardStartPending, board);
        setCondition(chassis, board, BoardCondition::started);
        context.announce(EventId::boardStarted, board);
    });
}

Json stop(Context const& context) {
    context.arguments.allow({"board"});
    return changeBoard(context, [&](Chassis& chassis, std::int32_t board) {
        context.announce(EventId::boardStopPending, board);
        setCondition(chassis, board, BoardCondition::stopped);
        context.announce(EventId::boardStopped, board);
    });
}

Json fail(Context const& context) {
    context.arguments.allow({"board"});
    return changeBoard(context, [&](Chassis& chassis, std::int32_t board) {
        setCondition(chassis, board, BoardCondition::failed);
        context.announce(EventId::boardFailed, board);
    });
}

Json fault(Context const& context) {
    context.arguments.allow({"board", "value", "cleared"});
    auto const value = static_cast<std::uint16_t>(context.arguments.number("value", 0, 65535));
    EventId const id =
        context.arguments.flag("cleared") ? EventId::faultCleared : EventId::faultRaised;
    return changeBoard(context,
                       [&](Chassis&, std::int32_t board) { context.announce(id, board, value); });
}

/// Runs `change(chassis, object, attribute)` on what the command names.
template <typename Change>
Json changeAttribute(Context const& context, Change change) {
    std::string const name = context.arguments.text("attribute");
    refuseUnfitName(name, 0);
    if (name == "TYPE") throw CommandError("TYPE says what an object is; it cannot be changed");
    if (isLiveAttribute(name))
        throw CommandError(name + " is answered by a line or by ISDN channels; \"line-list\" and "
                                  "\"call-list\" show what there is");
    std::int32_t handle = 0;
    context.platform.write([&](Chassis* maybe) {
        Chassis& chassis = present(maybe);
        ChassisObject const& object = context.arguments.object(chassis);
        handle = object.handle;
        change(chassis, object, name);
    });
    return {{"object", handle}};
}

/// LINE_TYPE must be a type that a description can have, because "show" prints both.
void refuseUnfitLineType(ChassisObject const& object, std::string_view name,
                         AttributeValue const& value) {
    if (!object.ds1Line || name != kDS1LineType || fitsLineType(value)) return;
    std::string known;
    for (auto const& [type, number] : kLineTypeNames)
        appendToList(known,
                     std::to_string(static_cast<int>(number)) + " (" + std::string(type) + ")");
    throw CommandError("LINE_TYPE of a line is one of " + known + ", in 4 bytes");
}

Json set(Context const& context) {
    context.arguments.allow({"object", "attribute", "value"});
    Description const written = describeJson(context.arguments.value("value"));
    return changeAttribute(
        context, [&](Chassis& chassis, ChassisObject const& object, std::string const& name) {
            AttributeValue const value = readAttribute(name, written);
            refuseUnfitLineType(object, name, value);
            if (object.kind == ObjectKind::board && name == "BOARD_CONDITION")
                setCondition(chassis, object.handle, value);
            else
                chassis.setAttribute(object.handle, name, value);
        });
}

Json unset(Context const& context) {
    context.arguments.allow({"object", "attribute"});
    return changeAttribute(
        context, [](Chassis& chassis, ChassisObject const& object, std::string const& name) {
            if (!chassis.unsetAttribute(object.handle, name))
                throw CommandError(std::string(nameOf(object.kind)) + ' ' +
                                   std::to_string(object.handle) + " has no attribute " +
                                   inQuotes(name) + "; nothing to unset");
        });
}

/// Whether messages with this identifier always concern one board.
bool needsBoard(std::uint32_t id) {
    auto const between = [id](EventId first, EventId last) {
        return id >= static_cast<std::uint32_t>(first) && id <= static_cast<std::uint32_t>(last);
    };
    return between(EventId::faultRaised, EventId::faultCleared) ||
           between(EventId::boardRemoved, EventId::boardStopPending) || id == kISDNBearerChanged ||
           id == kISDNSignallingChanged;
}

Json event(Context const& context) {
    context.arguments.allow({"id", "board", "value"});
    Announcement announcement;
    announcement.id = static_cast<std::uint32_t>(context.arguments.number("id", 0, 0xFFFFFFFF));
    if (context.arguments.has("value"))
        announcement.fault =
            static_cast<std::uint16_t>(context.arguments.number("value", 0, 65535));
    bool const named = context.arguments.has("board");
    if (!named && needsBoard(announcement.id))
        throw CommandError("this event concerns one board; name it in \"board\"");
    context.platform.write([&](Chassis* chassis) {
        if (named) announcement.board = context.arguments.boardHandle(present(chassis));
        context.platform.events().announce(announcement);
    });
    return {{"id", announcement.id}};
}

Json show(Context const& context) {
    context.arguments.allow({"board"});
    Json reply = Json::object();
    context.platform.read([&](Chassis const* maybe) {
        Chassis const& chassis = present(maybe);
        Json& boards = reply["boards"] = Json::array();
        if (context.arguments.has("board")) {
            boards.push_back(toJson(context.arguments.board(chassis), chassis));
            return;
        }
        for (std::int32_t const handle : chassis.root().children)
            boards.push_back(toJson(*chassis.find(handle), chassis));
    });
    EventService& events = context.platform.events();
    reply["events"] = {{"announced", events.announced()},
                       {"delivered", events.delivered()},
                       {"lost", events.lost()},
                       {"consumers", events.startedConsumers()}};
    return reply;
}

Json drain(Context const& context) {
    context.arguments.allow({});
    context.waitFor = context.platform.events().announced();
    return Json::object();
}

Json version(Context const& context) {
    context.arguments.allow({});
    return {{"version", KVLSIM_VERSION}};
}

Json ping(Context const& context) {
    context.arguments.allow({});
    return Json::object();
}

/// A `Command` is a name with its function.
struct Command {
    std::string_view name;
    Json (*run)(Context const&);
};

constexpr std::array<Command, 31> kCommands = {{{"insert", insert},
                                                {"remove", remove},
                                                {"replace", replace},
                                                {"start", start},
                                                {"stop", stop},
                                                {"fail", fail},
                                                {"fault", fault},
                                                {"set", set},
                                                {"unset", unset},
                                                {"event", event},
                                                {"show", show},
                                                {"store-list", listStore},
                                                {"store-add", addToStore},
                                                {"store-set", setInStore},
                                                {"store-remove", removeFromStore},
                                                {"process-list", listProcesses},
                                                {"process-add", addProcess},
                                                {"process-end", endProcess},
                                                {"line-list", listLines},
                                                {"line-errors", addLineErrors},
                                                {"line-rates", setLineRates},
                                                {"line-alarm", setLineAlarm},
                                                {"line-mend", mendLine},
                                                {"call-list", listCalls},
                                                {"call-setup", setUpCall},
                                                {"call-release", releaseCall},
                                                {"call-charge", chargeCall},
                                                {"call-signalling", setSignalling},
                                                {"drain", drain},
                                                {"version", version},
                                                {"ping", ping}}};

Command const& commandNamed(Json const& request) {
    if (!request.is_object())
        throw CommandError(R"(a command is a JSON object, such as {"command": "show"})");
    auto const name = request.find("command");
    if (name == request.end() || !name->is_string())
        throw CommandError(R"("command" is missing or no text; write one such as "show")");
    auto const& text = name->get_ref<std::string const&>();
    std::string known;
    for (auto const& command : kCommands) {
        if (command.name == text) return command;
        appendToList(known, command.name);
    }
    throw CommandError("unknown command " + inQuotes(text) + "; known: " + known);
}

/// Throws CommandError, or nlohmann::json::exception for a text that is not JSON.
Json parseCommand(std::string const& line) {
    // A board in a command has 11 levels; building thousands would keep the thread busy for
    // seconds.
    constexpr int maxDepth = 20;
    return Json::parse(line, [](int depth, Json::parse_event_t, Json const&) {
        if (depth > maxDepth)
            throw CommandError("too many nested levels; a chassis needs at most 12");
        return true;
    });
}

} // namespace

Json answerLine(Platform& platform, std::string const& line,
                std::optional<std::uint64_t>& waitFor) {
    Json command;
    try {
        command = parseCommand(line);
    } catch (CommandError const& error) {
        return errorReply(error.what());
    } catch (Json::exception const&) {
        return errorReply("the line is not JSON; write one object a line, such as "
                          "{\"command\": \"show\"}");
    }
    return dispatch(platform, command, waitFor);
}

std::string asLine(Json const& reply) {
    return reply.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n";
}

Json errorReply(std::string_view error) {
    return {{"ok", false}, {"error", std::string(error)}};
}

Json dispatch(Platform& platform, Json const& command, std::optional<std::uint64_t>& waitFor) {
    try {
        Command const& known = commandNamed(command);
        Arguments const arguments(command);
        Json reply = known.run({platform, arguments, waitFor});
        reply["ok"] = true;
        return reply;
    } catch (NoChassis const&) {
        return errorReply("there is no chassis: " + platform.failure());
    } catch (std::exception const& error) {
        return errorReply(error.what());
    }
}

} // namespace kvlsim
