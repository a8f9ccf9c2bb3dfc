// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxSession.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <optional>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr std::uint8_t kReasonShutdown = 5;
constexpr std::uint8_t kPriority = 127;

/// The connection is dropped when the master leaves this many octets unread.
constexpr std::size_t kMaxUnread = std::size_t{4} * 1024 * 1024;

std::string nameOf(AgentxFault fault) {
    switch (fault) {
    case AgentxFault::DuplicateRegistration:
        return "another agent serves them already";
    case AgentxFault::RequestDenied:
        return "it does not allow it";
    default:
        return "fault " + std::to_string(static_cast<int>(fault));
    }
}

/// `nameOf`, and what the operator should do.
std::string adviceOn(AgentxFault fault) {
    return nameOf(fault) + (fault == AgentxFault::DuplicateRegistration
                                ? "; stop it, then restart the master or this agent"
                                : "; see the master's configuration");
}

/// Writes the payload of a Register or Unregister packet. `last`: the last number of a range whose
/// first one is the last number of `name`.
void writeRegion(AgentxWriter& packet, OidView name, std::optional<std::uint32_t> last) {
    packet.octet(0); // the session's timeout
    packet.octet(kPriority);
    packet.octet(last ? static_cast<std::uint8_t>(name.size()) : 0);
    packet.octet(0);
    packet.name(name);
    if (last) packet.number(*last);
}

} // namespace

AgentxSession::AgentxSession(AgentxAddress address, std::vector<AgentxRoot> roots, SharedRows& rows,
                             Answer answer, AgentxPace pace, std::vector<Capability> capabilities,
                             Now now)
    : m_address(std::move(address)),
      m_roots(std::move(roots)),
      m_rows(rows),
      m_answer(std::move(answer)),
      m_pace(pace),
      m_capabilities(std::move(capabilities)),
      m_now(std::move(now)),
      m_pause(pace.retry) {
    connectNow();
}

AgentxSession::~AgentxSession() {
    if (m_stage == Stage::Registering || m_stage == Stage::Serving) {
        AgentxWriter close = request(AgentxKind::Close);
        close.octet(kReasonShutdown);
        for (int i = 0; i < 3; ++i)
            close.octet(0);
        queue(close.take());
    }
    disconnect();
}

short AgentxSession::events() const {
    bool const writes = m_stage == Stage::Connecting || !m_out.empty();
    return static_cast<short>(writes ? POLLIN | POLLOUT : POLLIN);
}

Clock::time_point AgentxSession::deadline() const {
    if (m_stage == Stage::Away) return m_retryAt;
    if (m_stage == Stage::Serving && m_awaited.empty()) return m_heard + m_pace.ping;
    auto first = m_heard + (m_told == Told::Lost ? m_pace.surrender : m_pace.patience);
    for (Awaited const& awaited : m_awaited)
        if (m_stage == Stage::Serving && m_heard > awaited.sent)
            first = std::min(first, awaited.sent + m_pace.patience);
    return first;
}

void AgentxSession::advance(short happened) {
    if (m_socket >= 0 && m_stage == Stage::Connecting && happened != 0) {
        int fault = 0;
        socklen_t size = sizeof fault;
        getsockopt(m_socket, SOL_SOCKET, SO_ERROR, &fault, &size);
        if (fault == 0)
            connected();
        else
            drop(std::strerror(fault));
    } else if (m_socket >= 0) {
        if ((happened & POLLOUT) != 0) flush();
        if (m_socket >= 0 && (happened & (POLLIN | POLLHUP | POLLERR)) != 0) receive();
    }
    checkTime();
}

bool AgentxSession::isOverdue(Awaited const& awaited, Clock::time_point now) const {
    return m_stage == Stage::Serving && m_heard > awaited.sent &&
           now >= awaited.sent + m_pace.patience;
}

void AgentxSession::expireRequests() {
    auto const now = m_now();
    for (auto at = m_awaited.begin(); at != m_awaited.end();) {
        if (!isOverdue(*at, now)) {
            ++at;
            continue;
        }
        AgentxKind const kind = at->kind;
        at = m_awaited.erase(at);
        if (kind == AgentxKind::Notify) {
            std::string const line = "the SNMP master does not answer a notification; continuing "
                                     "with the next one";
            if (m_repeats.passes(line, now)) log(LogLevel::Warning, line);
            std::exchange(m_delivered, nullptr)(Delivery::Dropped);
        } else if (kind == AgentxKind::Register || kind == AgentxKind::Unregister) {
            m_rows.refused("it does not answer");
        }
    }
}

void AgentxSession::checkTime() {
    expireRequests();
    auto const now = m_now();
    if (now < deadline()) return;
    if (m_stage == Stage::Away) {
        connectNow();
    } else if (m_stage == Stage::Serving && m_awaited.empty()) {
        queue(request(AgentxKind::Ping).take());
    } else if (m_told != Told::Lost) {
        tellLost("it does not answer");
    } else {
        drop("it does not answer");
    }
}

void AgentxSession::connectNow() {
    m_socket = socket(m_address.socket.ss_family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (m_socket < 0) return drop(std::strerror(errno));
    m_stage = Stage::Connecting;
    m_heard = m_now();
    if (connect(m_socket, reinterpret_cast<sockaddr const*>(&m_address.socket), m_address.size) ==
        0)
        connected();
    else if (errno == EAGAIN)
        drop("it does not answer"); // its queue of new connections is full
    else if (errno != EINPROGRESS)
        drop(std::strerror(errno));
}

void AgentxSession::connected() {
    m_stage = Stage::Opening;
    AgentxWriter packet = request(AgentxKind::Open);
    for (int i = 0; i < 4; ++i)
        packet.octet(0); // the master's own timeout
    packet.name({});
    packet.text("kvloamd");
    queue(packet.take());
}

void AgentxSession::registerRoots() {
    m_stage = Stage::Registering;
    m_rows.restart();
    for (std::size_t root = 0; root < m_roots.size(); ++root) {
        AgentxWriter packet = request(AgentxKind::Register);
        m_awaited.back().root = root;
        writeRegion(packet, m_roots[root].name, std::nullopt);
        queue(packet.take());
        if (m_socket < 0) return;
    }
}

void AgentxSession::registerRows() {
    if (m_stage != Stage::Serving) return;
    auto const step = m_rows.next();
    if (!step) return;
    AgentxWriter packet = request(step->enters ? AgentxKind::Register : AgentxKind::Unregister);
    Oid name = step->range.column;
    name.push_back(step->range.first);
    writeRegion(packet, name, step->range.last);
    queue(packet.take());
}

void AgentxSession::takeRegistered(std::size_t root, AgentxFault fault) {
    if (m_stage == Stage::Serving) {
        if (fault == AgentxFault::None)
            m_rows.done();
        else
            m_rows.refused(adviceOn(fault));
        return registerRows();
    }
    std::string const& what = m_roots[root].what;
    auto const told = std::ranges::find(m_refused, what);
    if (fault == AgentxFault::None) {
        if (told != m_refused.end()) m_refused.erase(told);
    } else if (m_roots[root].needed) {
        return drop("it refuses the agent's names: " + nameOf(fault));
    } else if (told == m_refused.end()) {
        m_refused.push_back(what);
        log(LogLevel::Warning,
            "the SNMP master refuses " + what + ": " + adviceOn(fault) + "; the rest is served");
    }
    if (!m_awaited.empty()) return;
    m_stage = Stage::Serving;
    addCapabilities();
    registerRows();
}

void AgentxSession::addCapabilities() {
    // The master removes them with the session.
    for (Capability const& capability : m_capabilities) {
        if (m_stage != Stage::Serving) return;
        AgentxWriter packet = request(AgentxKind::AddAgentCaps);
        packet.name(capability.id);
        packet.text(capability.description);
        queue(packet.take());
    }
}

void AgentxSession::send(Notification const& notification, Delivered delivered) {
    AgentxWriter packet = request(AgentxKind::Notify);
    if (notification.sysUpTime)
        packet.variable(kSysUpTime, ValueType::TimeTicks, std::int64_t{*notification.sysUpTime});
    packet.variable(kSnmpTrapOid, ValueType::ObjectId, NameView{notification.name});
    for (NotifiedObject const& object : notification.objects)
        packet.variable(object.name, object.type, object.view());
    m_delivered = std::move(delivered);
    queue(packet.take());
}

AgentxWriter AgentxSession::request(AgentxKind kind) {
    if (m_awaited.empty()) m_heard = m_now();
    m_awaited.push_back({++m_lastPacket, kind, 0, m_now()});
    return {kind, m_session, 0, m_lastPacket};
}

void AgentxSession::queue(std::string packet) {
    m_out += packet;
    flush();
}

void AgentxSession::flush() {
    while (!m_out.empty()) {
        ssize_t const sent =
            ::send(m_socket, m_out.data(), m_out.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
        if (sent < 0) {
            if (errno == EINTR) continue;
            if (errno != EAGAIN) return drop(std::strerror(errno));
            if (m_out.size() > kMaxUnread) dropMisbehaving("it does not read our answers");
            return;
        }
        m_out.erase(0, static_cast<std::size_t>(sent));
    }
}

void AgentxSession::receive() {
    char buffer[16384];
    ssize_t const got = recv(m_socket, buffer, sizeof buffer, MSG_DONTWAIT);
    if (got == 0) return drop("it has closed the connection");
    if (got < 0) {
        if (errno != EAGAIN && errno != EINTR) drop(std::strerror(errno));
        return;
    }
    m_in.append(buffer, static_cast<std::size_t>(got));
    try {
        while (m_in.size() >= AgentxHeader::kSize) {
            AgentxHeader const header = parseAgentxHeader(m_in);
            std::size_t const size = AgentxHeader::kSize + header.payload;
            if (m_in.size() < size) break;
            std::string const packet = m_in.substr(0, size);
            m_in.erase(0, size);
            takePacket(header, std::string_view(packet).substr(AgentxHeader::kSize));
            if (m_socket < 0) return;
        }
    } catch (AgentxError const& error) {
        dropMisbehaving(std::string("it has sent ") + error.what());
    }
}

void AgentxSession::takePacket(AgentxHeader const& header, std::string_view payload) {
    m_heard = m_now();
    if (header.kind == AgentxKind::Response) {
        takeResponse(header, payload);
    } else if (header.kind == AgentxKind::Close) {
        drop("it has closed the session");
    } else if (header.session != m_session) {
        dropMisbehaving("it has sent a packet of another session");
    } else if (std::string answer = m_answer(header, payload); !answer.empty()) {
        queue(std::move(answer));
    }
    // The master may have been silent before.
    if (m_stage == Stage::Serving) tellConnected();
}

void AgentxSession::takeResponse(AgentxHeader const& header, std::string_view payload) {
    auto const awaited = std::ranges::find(m_awaited, header.packet, &Awaited::packet);
    if (awaited == m_awaited.end()) return;
    AgentxKind const kind = awaited->kind;
    std::size_t const root = awaited->root;
    m_awaited.erase(awaited);
    AgentxReader reader(payload, header.networkOrder);
    m_masterTime = {reader.number(), m_now()};
    auto const fault = static_cast<AgentxFault>(reader.number16());
    if (fault == AgentxFault::NotOpen) return drop("it has forgotten the session");
    switch (kind) {
    case AgentxKind::Open:
        if (fault != AgentxFault::None) return drop("it refuses the session: " + nameOf(fault));
        m_session = header.session;
        registerRoots();
        break;
    case AgentxKind::Register:
    case AgentxKind::Unregister:
        takeRegistered(root, fault);
        break;
    case AgentxKind::AddAgentCaps:
        if (fault != AgentxFault::None) {
            std::string const line =
                "the SNMP master does not list the agent in sysORTable: " + nameOf(fault);
            if (m_repeats.passes(line, m_now())) log(LogLevel::Warning, line);
        }
        break;
    case AgentxKind::Notify:
        // The master would refuse a refused one again.
        if (fault != AgentxFault::None) {
            std::string const line = "the SNMP master refuses a notification: " + nameOf(fault);
            if (m_repeats.passes(line, m_now())) log(LogLevel::Warning, line);
        }
        // An expired one has been given up.
        if (!m_delivered) break;
        std::exchange(m_delivered,
                      nullptr)(fault == AgentxFault::None ? Delivery::Sent : Delivery::Dropped);
        break;
    default:
        break;
    }
}

void AgentxSession::drop(std::string const& why) {
    m_retryAt = m_now() + nextPause(false);
    disconnect();
    tellLost(why);
}

void AgentxSession::dropMisbehaving(std::string const& why) {
    m_retryAt = m_now() + nextPause(true);
    disconnect();
    tellLost(why);
}

std::chrono::milliseconds AgentxSession::nextPause(bool misbehaves) {
    bool const wasSteady = isConnected() && m_now() >= m_connectedAt + m_pace.steady;
    if (wasSteady) m_pause = m_pace.retry;
    // One that is away, or refuses, is asked at the usual pace.
    if (!misbehaves && (!isConnected() || wasSteady)) return m_pace.retry;
    return std::exchange(m_pause, std::min(2 * m_pause, m_pace.longestRetry));
}

void AgentxSession::disconnect() {
    if (m_socket >= 0) close(m_socket);
    m_socket = -1;
    m_stage = Stage::Away;
    m_session = 0;
    m_awaited.clear();
    m_delivered = nullptr;
    m_in.clear();
    m_out.clear();
}

void AgentxSession::tellConnected() {
    if (m_told == Told::Connected) return;
    m_told = Told::Connected;
    m_connectedAt = m_now();
    log(LogLevel::Info, "connected to the SNMP master at " + m_address.text);
}

void AgentxSession::tellLost(std::string const& why) {
    if (m_told == Told::Lost) {
        log(LogLevel::Debug, "the SNMP master at " + m_address.text + ": " + why);
        return;
    }
    bool const had = m_told == Told::Connected;
    m_told = Told::Lost;
    if (had) ++m_timesLost;
    log(LogLevel::Warning,
        (had ? "lost the SNMP master at " : "no connection to the SNMP master at ") +
            m_address.text + ": " + why + "; trying again until " +
            (had ? "it is back" : "there is one"));
}

} // namespace kvloamd
