// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes a whole AgentX session: a master that says and does whatever the input says.
//
// The first octet says whether the master is polite until the session serves. Steps follow, each an
// octet and its arguments.
#include "agent/fronts/agentx/AgentxSession.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <deque>
#include <optional>
#include <stdexcept>
#include <string>

#include "agent/fronts/agentx/AgentxAnswers.h"
#include "agent/log/Log.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"
#include "tests/fuzz/SampleRows.h"

namespace kvloamd {
namespace {

constexpr int kMaxSteps = 64;
constexpr std::uint32_t kSession = 77;

/// Where the master listens, for all sessions of the process.
class Door {
  public:
    Door() : m_socket(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path().copy(address.sun_path, sizeof address.sun_path - 1);
        if (bind(m_socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
            listen(m_socket, 8) != 0)
            throw std::runtime_error("no socket at " + path());
    }
    ~Door() { close(m_socket); }
    Door(Door const&) = delete;
    Door& operator=(Door const&) = delete;

    std::string path() const { return m_folder.file("master"); }
    int accept() const { return accept4(m_socket, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC); }
    /// Lets go of connections that a former session has left.
    void clear() const {
        for (int left = accept(); left >= 0; left = accept())
            close(left);
    }

  private:
    fuzz::Folder m_folder;
    int m_socket;
};

/// One session and its master.
class Encounter {
  public:
    explicit Encounter(Door const& door)
        : m_door(door),
          m_rows(sharedTrees()),
          m_answers(
              trees(), m_counters, [] { return snapshot(); }, m_settings) {
        door.clear();
        m_rows.update({*snapshot(), m_counters}, Clock::now());
        std::vector<AgentxRoot> const roots{{joined(kSampleEnterprise, kObjectsPlace), "own", true},
                                            {joined(kStandardArc, Oid{10, 18}), "DS1-MIB", false}};
        m_session.emplace(
            *parseAgentxAddress(door.path()), roots, m_rows,
            [this](AgentxHeader const& header, std::string_view payload) {
                return m_answers.answer(header, payload);
            },
            AgentxPace{std::chrono::milliseconds(0), std::chrono::hours(1), std::chrono::hours(1),
                       std::chrono::hours(1)});
    }
    ~Encounter() { hangUp(); }
    Encounter(Encounter const&) = delete;
    Encounter& operator=(Encounter const&) = delete;

    /// Grants all that the agent asks for until it serves.
    void bePolite() {
        for (int i = 0; i < 100 && !m_session->isConnected(); ++i) {
            turn();
            respond(AgentxFault::None);
        }
        fuzz::require(m_session->isConnected(), "a polite master gets a session");
    }

    void step(fuzz::FuzzInput& input) {
        switch (input.choice(8)) {
        case 0: // whatever it is
            say(input.text());
            break;
        case 1:
        case 2:
        case 3: { // a packet of the right length
            auto const kind = static_cast<AgentxKind>(input.octet() % 20);
            AgentxWriter packet(kind, input.octet() == 0 ? input.number<std::uint32_t>() : kSession,
                                input.octet(), input.octet());
            for (char const octet : input.text())
                packet.octet(static_cast<std::uint8_t>(octet));
            say(packet.take());
            break;
        }
        case 4:
            respond(static_cast<AgentxFault>(input.number<std::uint16_t>()));
            break;
        case 5:
            hangUp();
            break;
        case 6:
            if (m_session->ready())
                m_session->send({joined(kSampleEnterprise, kFaultRaisedPlace), {}, {}},
                                [](Delivery) {});
            break;
        default: // other interfaces than before
            Snapshot changed;
            changed.interfaces.interfaces.resize(input.choice(16));
            std::uint32_t index = 0;
            changed.interfaces.interfaces.editAll(
                [&](InterfaceRow& row) { row.ifIndex = index += 1U + input.octet(); });
            m_rows.update({changed, m_counters}, Clock::now());
            m_session->registerRows();
        }
        turn();
    }

  private:
    static std::shared_ptr<Snapshot const> const& snapshot() {
        static auto const made = sampleSnapshot();
        return made;
    }

    static std::vector<ServedTree> const& trees() {
        static SampleTrees const objects;
        static std::vector<ServedTree> const served = objects.served();
        return served;
    }

    /// Of the tables that the host has, too, one: more would only be slower.
    static std::vector<ServedTree> const& sharedTrees() {
        static std::vector<Table const*> const tables{&ifTable()};
        static ObjectTree const tree({}, tables);
        static std::vector<ServedTree> const served{
            {tree, kStandardArc, {{{2, 2}, "ifTable", HostHas::Rows}}}};
        return served;
    }

    /// Lets the agent and then the master receive.
    void turn() {
        pollfd polled{m_session->descriptor(), m_session->events(), 0};
        if (polled.fd >= 0) poll(&polled, 1, 0);
        m_session->advance(polled.revents);
        if (m_master < 0) m_master = m_door.accept();
        char buffer[16384];
        for (ssize_t got = 0; (got = recv(m_master, buffer, sizeof buffer, 0)) > 0;)
            m_in.append(buffer, static_cast<std::size_t>(got));
        while (m_in.size() >= AgentxHeader::kSize) {
            // Throws, and so is a finding, if the agent sends rubbish.
            AgentxHeader const header = parseAgentxHeader(m_in);
            if (m_in.size() < AgentxHeader::kSize + header.payload) break;
            m_in.erase(0, AgentxHeader::kSize + header.payload);
            if (header.kind != AgentxKind::Response) m_asked.push_back(header);
        }
    }
    void say(std::string const& octets) const {
        send(m_master, octets.data(), octets.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
    }
    /// Responds to the agent's oldest request.
    void respond(AgentxFault fault) {
        if (m_asked.empty()) return;
        AgentxHeader header = m_asked.front();
        m_asked.pop_front();
        header.session = kSession;
        say(agentxResponse(header, fault));
    }
    void hangUp() {
        if (m_master >= 0) close(m_master);
        m_master = -1;
        m_in.clear();
        m_asked.clear();
    }

    Door const& m_door;
    Counters m_counters;
    Settings m_settings;
    SharedRows m_rows;
    AgentxAnswers m_answers;
    std::optional<AgentxSession> m_session;
    int m_master = -1;
    std::deque<AgentxHeader> m_asked; ///< the agent's requests without a response
    std::string m_in;
};

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static kvloamd::Door const door;
    kvloamd::setLogLevel(kvloamd::LogLevel::Error);
    fuzz::FuzzInput input(octets, size);
    kvloamd::Encounter encounter(door);
    if (input.choice(2) == 1) encounter.bePolite();
    for (int steps = 0; steps < kvloamd::kMaxSteps && !input.atEnd(); ++steps)
        encounter.step(input);
    return 0;
}
