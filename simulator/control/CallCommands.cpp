// SPDX-License-Identifier: BSD-2-Clause
// The control commands for calls on ISDN channels.
#include <algorithm>
#include <cstdint>
#include <ctime>

#include "simulator/base/Text.h"
#include "simulator/control/CommandContext.h"
#include "simulator/description/ChannelsReader.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/Description.h"

namespace kvlsim {

namespace {

using Json = nlohmann::json;

ChassisObject const& trunkOf(CommandContext const& context, Chassis const& chassis) {
    ChassisObject const& object = context.arguments.object(chassis, "trunk");
    if (object.channels) return object;
    throw CommandError(std::string(nameOf(object.kind)) + ' ' + std::to_string(object.handle) +
                       " has no channels; \"kvlsim call list\" lists those that have");
}

/// A `Trunk` is the channels of one trunk; it announces every change.
class Trunk {
  public:
    Trunk(CommandContext const& context, Chassis& chassis)
        : m_context(context),
          m_object(trunkOf(context, chassis)),
          m_channels(chassis.channels(m_object.handle)) {}

    std::int32_t handle() const { return m_object.handle; }
    Channels const& channels() const { return m_channels; }
    std::string words() const { return "trunk " + std::to_string(m_object.handle); }

    /// The channel that the command names. Requires: it names one.
    std::int32_t namedChannel() const {
        return static_cast<std::int32_t>(
            m_context.arguments.number("channel", 1, m_channels.bearers()));
    }

    void setState(std::int32_t channel, ISDNBearerState state) {
        m_channels.setState(channel, state, static_cast<std::uint32_t>(std::time(nullptr)));
        announce(kISDNBearerChanged, channel, static_cast<std::int32_t>(state));
    }

    void setTerms(std::int32_t channel, CallTerms const& terms) {
        m_channels.setTerms(channel, terms);
    }

    void charge(std::int32_t channel, std::uint32_t units) {
        m_channels.charge(channel, units);
        announce(kISDNBearerChanged, channel, static_cast<std::int32_t>(m_channels.state(channel)));
    }

    void setSignalling(ISDNSignallingState state) {
        if (m_channels.signalling() == state) return;
        m_channels.setSignalling(state);
        announce(kISDNSignallingChanged, 0, static_cast<std::int32_t>(state));
    }

  private:
    void announce(std::uint32_t id, std::int32_t channel, std::int32_t state) {
        Announcement announcement;
        announcement.id = id;
        announcement.channel = ISDNChannelMsg{m_object.parent, m_object.handle, channel, state};
        m_context.platform.events().announce(announcement);
    }

    CommandContext const& m_context;
    ChassisObject const& m_object;
    Channels& m_channels;
};

/// Runs `change(trunk)` on the trunk that the command names; it returns what to reply.
template <typename Change>
Json changeTrunk(CommandContext const& context, Change change) {
    return context.platform.write([&](Chassis* maybe) {
        Trunk trunk(context, present(maybe));
        Json reply = change(trunk);
        reply["trunk"] = trunk.handle();
        return reply;
    });
}

/// How far a call goes: active unless the command says less.
ISDNBearerState lastState(CommandContext const& context) {
    if (!context.arguments.has("state")) return ISDNBearerState::active;
    std::string const name = context.arguments.text("state");
    for (auto const state :
         {ISDNBearerState::connecting, ISDNBearerState::connected, ISDNBearerState::active})
        if (nameOf(state) == name) return state;
    throw CommandError("a call cannot be set up to " + inQuotes(name) +
                       "; choose connecting, connected or active");
}

/// A text argument that a record holds; empty when it is missing.
std::string shortText(CommandContext const& context, char const* name, std::size_t most) {
    if (!context.arguments.has(name)) return {};
    std::string text = context.arguments.text(name);
    if (text.size() > most)
        throw CommandError(std::string(name) + " " + inQuotes(text) + " is too long; " +
                           std::to_string(most) + " bytes are the most");
    return text;
}

CallTerms termsOf(CommandContext const& context) {
    CallTerms terms;
    terms.incoming = context.arguments.flag("incoming");
    terms.peer = shortText(context, "peer", sizeof ISDNCallRecord::peer - 1);
    terms.peerSubAddress =
        shortText(context, "subaddress", sizeof ISDNCallRecord::peerSubAddress - 1);
    terms.multirate = context.arguments.flag("multirate");
    if (!context.arguments.has("information")) return terms;
    std::string const name = context.arguments.text("information");
    auto const* const found = std::ranges::find(kInformationNames, name);
    if (found == kInformationNames.end()) {
        std::string known;
        for (auto const& each : kInformationNames)
            appendToList(known, each);
        throw CommandError("a call cannot carry " + inQuotes(name) + "; choose one of " + known);
    }
    terms.information = static_cast<std::int32_t>(found - kInformationNames.begin()) + 1;
    return terms;
}

std::int32_t idleChannel(CommandContext const& context, Trunk const& trunk) {
    if (!context.arguments.has("channel")) {
        if (auto const idle = trunk.channels().firstIdle()) return *idle;
        throw CommandError(trunk.words() + " has no idle channel; release one");
    }
    std::int32_t const channel = trunk.namedChannel();
    ISDNBearerState const state = trunk.channels().state(channel);
    if (state == ISDNBearerState::idle) return channel;
    throw CommandError("channel " + std::to_string(channel) + " of " + trunk.words() + " is " +
                       std::string(nameOf(state)) + "; release it first");
}

} // namespace

Json listCalls(CommandContext const& context) {
    context.arguments.allow({});
    Json trunks = Json::array();
    context.platform.read([&](Chassis const* maybe) {
        Chassis const& chassis = present(maybe);
        for (std::int32_t const handle : chassis.root().children) {
            for (std::int32_t const child : chassis.find(handle)->children) {
                ChassisObject const& object = *chassis.find(child);
                if (!object.channels) continue;
                Json channels = Json::array();
                for (std::int32_t i = 1; i <= object.channels->bearers(); ++i)
                    channels.push_back(nameOf(object.channels->state(i)));
                auto const name = object.attribute("NAME");
                trunks.push_back({{"trunk", child},
                                  {"name", !name ? Json() : toJson("NAME", *name)},
                                  {"board", handle},
                                  {"signalling", nameOf(object.channels->signalling())},
                                  {"channels", channels}});
            }
        }
    });
    return {{"trunks", trunks}};
}

Json setUpCall(CommandContext const& context) {
    context.arguments.allow({"trunk", "channel", "state", "incoming", "peer", "subaddress",
                             "information", "multirate"});
    ISDNBearerState const last = lastState(context);
    CallTerms const terms = termsOf(context);
    return changeTrunk(context, [&](Trunk& trunk) -> Json {
        std::int32_t const channel = idleChannel(context, trunk);
        trunk.setTerms(channel, terms);
        for (auto const state :
             {ISDNBearerState::connecting, ISDNBearerState::connected, ISDNBearerState::active})
            if (state <= last) trunk.setState(channel, state);
        return {{"channel", channel}};
    });
}

Json releaseCall(CommandContext const& context) {
    context.arguments.allow({"trunk", "channel", "all"});
    bool const all = context.arguments.flag("all");
    if (all == context.arguments.has("channel"))
        throw CommandError("give either \"channel\" or \"all\": true");
    return changeTrunk(context, [&](Trunk& trunk) -> Json {
        std::int32_t const first = all ? 1 : trunk.namedChannel();
        std::int32_t const last = all ? trunk.channels().bearers() : first;
        if (!all && trunk.channels().state(first) == ISDNBearerState::idle)
            throw CommandError("channel " + std::to_string(first) + " of " + trunk.words() +
                               " is idle; there is no call to release");
        std::int32_t released = 0;
        for (std::int32_t channel = first; channel <= last; ++channel) {
            if (trunk.channels().state(channel) == ISDNBearerState::idle) continue;
            trunk.setState(channel, ISDNBearerState::idle);
            ++released;
        }
        return {{"released", released}};
    });
}

Json chargeCall(CommandContext const& context) {
    context.arguments.allow({"trunk", "channel", "units"});
    auto const units =
        static_cast<std::uint32_t>(context.arguments.number("units", 1, 1'000'000'000));
    return changeTrunk(context, [&](Trunk& trunk) -> Json {
        std::int32_t const channel = trunk.namedChannel();
        if (trunk.channels().state(channel) == ISDNBearerState::idle)
            throw CommandError("channel " + std::to_string(channel) + " of " + trunk.words() +
                               " is idle; there is no call to charge");
        trunk.charge(channel, units);
        return Json::object();
    });
}

Json setSignalling(CommandContext const& context) {
    context.arguments.allow({"trunk", "state"});
    ISDNSignallingState const state =
        signallingStateNamed(describeJson(context.arguments.text("state")));
    return changeTrunk(context, [&](Trunk& trunk) -> Json {
        trunk.setSignalling(state);
        return Json::object();
    });
}

} // namespace kvlsim
