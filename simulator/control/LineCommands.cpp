// SPDX-License-Identifier: BSD-2-Clause
// The control commands for DS1 lines.
#include <cstdint>

#include "simulator/control/CommandContext.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/Description.h"
#include "simulator/description/LineReader.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

/// A line's alarm as a fault of its board: this and the number of the alarm's bit.
constexpr std::uint16_t kFirstAlarmFault = 0x0100;

ChassisObject const& lineOf(CommandContext const& context, Chassis const& chassis) {
    ChassisObject const& object = context.arguments.object(chassis, "line");
    if (object.ds1Line) return object;
    throw CommandError(std::string(nameOf(object.kind)) + ' ' + std::to_string(object.handle) +
                       " has no line; \"kvlsim line list\" lists those that have");
}

/// Runs `change(line, now, board)` on the line that the command names.
template <typename Change>
Json changeLine(CommandContext const& context, Change change) {
    std::int32_t handle = 0;
    context.platform.write([&](Chassis* maybe) {
        Chassis& chassis = present(maybe);
        ChassisObject const& object = lineOf(context, chassis);
        handle = object.handle;
        chassis.changeLine(
            handle, [&](LiveLine& line) { change(line, chassis.lineTime(), object.parent); });
    });
    return {{"line", handle}};
}

/// Raises these alarms, clears all others, and announces every change.
void setRaised(CommandContext const& context, LiveLine& line, LiveLine::Time now,
               std::int32_t board, std::uint32_t alarms) {
    std::uint32_t const changed = line.raised() ^ alarms;
    line.setRaised(alarms, now);
    for (std::size_t bit = 0; bit < kLineAlarmNames.size(); ++bit) {
        if ((changed >> bit & 1U) == 0) continue;
        context.announce((alarms >> bit & 1U) != 0 ? EventId::faultRaised : EventId::faultCleared,
                         board, static_cast<std::uint16_t>(kFirstAlarmFault + bit));
    }
}

Description describedArgument(CommandContext const& context, char const* name) {
    Description described = describeJson(context.arguments.value(name));
    if (described.form == Description::Form::map && described.entries.empty())
        throw CommandError('"' + std::string(name) +
                           "\" is empty; write for example {\"code-violations\": 5}");
    return described;
}

Json described(ChassisObject const& object, ChassisObject const& board, LiveLine::Time now) {
    auto const attribute = [](ChassisObject const& of, char const* name) {
        auto const value = of.attribute(name);
        return !value ? Json() : toJson(name, *value);
    };
    LiveLine const& line = *object.ds1Line;
    DS1LineCounters const counters = line.counters(now);
    Json rates = Json::object();
    for (std::size_t i = 0; i < kLineErrorNames.size(); ++i)
        rates[std::string(kLineErrorNames[i])] = perSecond(line.rates()[i]);
    return {{"line", object.handle},
            {"name", attribute(object, "NAME")},
            {"board", board.handle},
            {"board-name", attribute(board, "NAME")},
            {"type", attribute(object, kDS1LineType)},
            {"seconds", counters.seconds},
            {"errors",
             {{"code-violations", counters.lineCodeViolations},
              {"path-violations", counters.pathCodeViolations},
              {"framing-errors", counters.framingErrors},
              {"slips", counters.controlledSlips}}},
            {"los-seconds", counters.lossOfSignalSeconds},
            {"out-of-frame-seconds", counters.outOfFrameSeconds},
            {"ais-seconds", counters.alarmIndicationSeconds},
            {"alarms", alarmNames(counters.alarms)},
            {"rates", rates},
            {"past-seconds", line.draft().past.seconds}};
}

} // namespace

Json listLines(CommandContext const& context) {
    context.arguments.allow({});
    Json lines = Json::array();
    context.platform.read([&](Chassis const* maybe) {
        Chassis const& chassis = present(maybe);
        LiveLine::Time const now = chassis.lineTime();
        for (std::int32_t const handle : chassis.root().children) {
            ChassisObject const& board = *chassis.find(handle);
            for (std::int32_t const child : board.children)
                if (ChassisObject const& object = *chassis.find(child); object.ds1Line)
                    lines.push_back(described(object, board, now));
        }
    });
    return {{"lines", lines}};
}

Json addLineErrors(CommandContext const& context) {
    context.arguments.allow({"line", "errors"});
    LineErrors const errors = readLineErrors(describedArgument(context, "errors"));
    return changeLine(context,
                      [&](LiveLine& line, LiveLine::Time, std::int32_t) { line.add(errors); });
}

Json setLineRates(CommandContext const& context) {
    context.arguments.allow({"line", "rates"});
    Description const written = describedArgument(context, "rates");
    return changeLine(context, [&](LiveLine& line, LiveLine::Time now, std::int32_t) {
        LineRates rates = line.rates();
        readLineRates(written, rates);
        line.setRates(rates, now);
    });
}

Json setLineAlarm(CommandContext const& context) {
    context.arguments.allow({"line", "alarm", "clear"});
    std::uint32_t const alarm = lineAlarmNamed(context.arguments.text("alarm"), 0);
    bool const clear = context.arguments.flag("clear");
    return changeLine(context, [&](LiveLine& line, LiveLine::Time now, std::int32_t board) {
        std::uint32_t const alarms = clear ? line.raised() & ~alarm : line.raised() | alarm;
        setRaised(context, line, now, board, alarms);
    });
}

Json mendLine(CommandContext const& context) {
    context.arguments.allow({"line"});
    return changeLine(context, [&](LiveLine& line, LiveLine::Time now, std::int32_t board) {
        line.setRates({}, now);
        setRaised(context, line, now, board, 0);
    });
}

} // namespace kvlsim
