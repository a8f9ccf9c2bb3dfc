// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/Receivers.h"

#include <algorithm>
#include <cctype>
#include <utility>

#include "agent/fronts/snmp/LibraryLog.h"
#include "agent/log/Log.h"

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
#include <net-snmp/agent/agent_trap.h>
// clang-format on

namespace kvloamd {

namespace {

/// The object that takes the library's configuration lines.
Receivers* current = nullptr;

struct Directive {
    std::string_view name;
    void (*parse)(char const*, char*); ///< the library's
};
constexpr Directive kDirectives[] = {{"trapsink", snmpd_parse_config_trapsink},
                                     {"trap2sink", snmpd_parse_config_trap2sink},
                                     {"informsink", snmpd_parse_config_informsink},
                                     {"trapsess", snmpd_parse_config_trapsess}};

/// Whether the library takes a trapsess without a version for one of SNMPv3.
bool thirdByDefault() {
    int const version = netsnmp_ds_get_int(NETSNMP_DS_LIBRARY_ID, NETSNMP_DS_LIB_SNMPVERSION);
    return version == 0 || version == SNMP_VERSION_3;
}

} // namespace

Receivers::~Receivers() {
    if (current == this) current = nullptr;
}

void Receivers::takeDirectives() {
    current = this;
    for (Directive const& directive : kDirectives)
        register_app_config_handler(directive.name.data(), takeLine, forget, nullptr);
}

// NOLINTNEXTLINE(readability-non-const-parameter): the library's type
void Receivers::takeLine(char const* directive, char* text) {
    if (current == nullptr) return;
    std::string name(directive);
    std::ranges::transform(name, name.begin(), [](unsigned char each) {
        return static_cast<char>(std::tolower(each));
    });
    try {
        current->add(ReceiverLine(std::move(name), text, thirdByDefault()));
    } catch (ReceiverFault const& fault) {
        netsnmp_config_error("%s", fault.what());
    }
}

void Receivers::forget() {
    if (current != nullptr) {
        current->m_waiting.clear();
        current->m_resolver.dropQuestions();
        current->m_informs.closeAll();
    }
    snmpd_free_trapsinks();
}

void Receivers::add(ReceiverLine line) {
    auto const number = line.address().number();
    if (number && !line.asksEngine()) return openByLibrary(line, *number, {});
    m_waiting.emplace_back(std::move(line));
}

void Receivers::begin(std::function<void()> settled) {
    m_begun = true;
    m_deadline = Clock::now() + kFirstAttempts;
    // What waits for the first attempts after the start still does.
    if (!m_whenSettled) m_whenSettled = std::move(settled);
    settleIfDue(Clock::now());
}

std::optional<Clock::time_point> Receivers::prepare(std::vector<pollfd>& polled) {
    if (!m_begun) return std::nullopt;
    polled.push_back({m_resolver.descriptor(), POLLIN, 0});
    std::optional<Clock::time_point> next;
    if (m_whenSettled) next = m_deadline;
    for (Waiting const& waiting : m_waiting) {
        if (waiting.probe) polled.push_back({waiting.probe->descriptor(), POLLIN, 0});
        if (waiting.stage == Stage::Resolving) continue;
        next = next ? std::min(*next, waiting.due) : waiting.due;
    }
    return next;
}

void Receivers::handle(std::span<pollfd const> /*polled*/) {
    if (!m_begun) return;
    auto const now = Clock::now();
    takeAnswers(now);
    for (Waiting& waiting : m_waiting)
        advance(waiting, now);
    std::erase_if(m_waiting, [](Waiting const& waiting) { return waiting.stage == Stage::Open; });
    settleIfDue(now);
}

void Receivers::takeAnswers(Clock::time_point now) {
    for (NameResolver::Answer const& answer : m_resolver.take()) {
        auto const found = std::ranges::find_if(m_waiting, [&](Waiting const& waiting) {
            return waiting.stage == Stage::Resolving && waiting.question == answer.question;
        });
        if (found == m_waiting.end()) continue; // the configuration has been read again
        if (!answer.number)
            fail(*found, "its name does not resolve (" + answer.fault + ")", now);
        else
            proceed(*found, *answer.number, now);
    }
}

void Receivers::advance(Waiting& waiting, Clock::time_point now) {
    if (waiting.stage == Stage::Paused && now >= waiting.due) {
        ReceiverAddress const& address = waiting.line.address();
        if (auto const number = address.number()) return proceed(waiting, *number, now);
        waiting.question = m_resolver.ask(address.host, address.family);
        waiting.stage = Stage::Resolving;
    } else if (waiting.stage == Stage::Probing) {
        if (auto const engine = waiting.probe->receive())
            open(waiting, *engine, now);
        else if (!waiting.probe->fault().empty())
            fail(waiting, waiting.probe->fault(), now);
        else if (now >= waiting.due)
            fail(waiting, "it does not answer with its engine ID", now);
    }
}

void Receivers::proceed(Waiting& waiting, std::string const& number, Clock::time_point now) {
    waiting.number = number;
    if (!waiting.line.asksEngine()) return open(waiting, {}, now);
    waiting.probe = std::make_unique<EngineProbe>(waiting.line.address(), number);
    waiting.stage = Stage::Probing;
    waiting.due = now + kAnswerTime;
    if (!waiting.probe->fault().empty()) fail(waiting, waiting.probe->fault(), now);
}

void Receivers::open(Waiting& waiting, std::string_view engine, Clock::time_point now) {
    waiting.probe.reset();
    LibraryFaults const faults;
    openByLibrary(waiting.line, waiting.number, engine);
    if (!faults.lines().empty()) return fail(waiting, faults.lines().front(), now);
    waiting.stage = Stage::Open;
    if (waiting.wasTried)
        log(LogLevel::Info, "the notification receiver " + waiting.line.where() + " is open");
}

void Receivers::fail(Waiting& waiting, std::string const& why, Clock::time_point now) {
    if (!waiting.wasTried)
        log(LogLevel::Warning, "the notification receiver " + waiting.line.where() +
                                   " cannot be opened: " + why +
                                   "; trying again until it can. Notifications count as dropped "
                                   "meanwhile");
    waiting.wasTried = true;
    waiting.probe.reset();
    waiting.stage = Stage::Paused;
    waiting.due = now + waiting.pause;
    waiting.pause = std::min(2 * waiting.pause, kLongestPause);
}

void Receivers::openByLibrary(ReceiverLine const& line, std::string const& number,
                              std::string_view engine) {
    std::string text = line.resolved(number, engine);
    for (Directive const& directive : kDirectives) {
        if (directive.name != line.directive()) continue;
        auto const parse = [&] { directive.parse(directive.name.data(), text.data()); };
        if (line.isForInforms())
            m_informs.takeOver(parse);
        else
            parse();
    }
}

void Receivers::settleIfDue(Clock::time_point now) {
    if (!m_whenSettled) return;
    if (now < m_deadline && !std::ranges::all_of(m_waiting, &Waiting::wasTried)) return;
    std::exchange(m_whenSettled, nullptr)();
}

} // namespace kvloamd
