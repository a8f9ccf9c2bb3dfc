// SPDX-License-Identifier: BSD-2-Clause
// A session with a master that says what the test has it say.
#pragma once

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "agent/fronts/agentx/AgentxSession.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

inline constexpr std::chrono::seconds kTestPatience{60};

inline Oid const kRoot{1, 3, 6, 1, 4, 1, 32473, 1, 1};
inline Oid const kOtherRoot{1, 3, 6, 1, 2, 1, 10, 18};

struct Packet {
    AgentxHeader header;
    std::string payload;
};

/// A master on the test's own thread, which says only what the test has it say.
class ScriptedMaster {
  public:
    explicit ScriptedMaster(std::string const& path)
        : m_path(path), m_door(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        if (bind(m_door, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
            listen(m_door, 0) != 0)
            throw std::runtime_error("no socket at " + path);
    }
    ~ScriptedMaster() {
        hangUp();
        close(m_door);
        unlink(m_path.c_str());
    }
    ScriptedMaster(ScriptedMaster const&) = delete;
    ScriptedMaster& operator=(ScriptedMaster const&) = delete;

    /// Lets the next agent in, if one waits.
    bool accept() {
        if (m_agent < 0) m_agent = accept4(m_door, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
        return m_agent >= 0;
    }
    void hangUp() {
        if (m_agent >= 0) close(m_agent);
        m_agent = -1;
        m_in.clear();
        m_atEnd = false;
    }
    /// The next packet, if one has come.
    std::optional<Packet> receive() {
        char buffer[4096];
        ssize_t got = 0;
        while ((got = recv(m_agent, buffer, sizeof buffer, MSG_DONTWAIT)) > 0)
            m_in.append(buffer, static_cast<std::size_t>(got));
        m_atEnd = got == 0;
        if (m_in.size() < AgentxHeader::kSize) return std::nullopt;
        AgentxHeader const header = parseAgentxHeader(m_in);
        std::size_t const size = AgentxHeader::kSize + header.payload;
        if (m_in.size() < size) return std::nullopt;
        Packet packet{header, m_in.substr(AgentxHeader::kSize, header.payload)};
        m_in.erase(0, size);
        return packet;
    }
    /// Whether the agent has left, and said nothing more.
    bool isLeft() {
        receive();
        return m_atEnd;
    }
    void say(std::string const& octets) {
        EXPECT_EQ(::send(m_agent, octets.data(), octets.size(), MSG_NOSIGNAL),
                  static_cast<ssize_t>(octets.size()));
    }
    void respond(Packet const& packet, AgentxFault fault = AgentxFault::None) {
        AgentxHeader header = packet.header;
        header.session = 77;
        say(agentxResponse(header, fault));
    }

  private:
    std::string m_path;
    int m_door;
    int m_agent = -1;
    std::string m_in;
    bool m_atEnd = false;
};

class AgentxSessionFixture : public ::testing::Test {
  protected:
    AgentxSessionFixture() {
        std::string folder = ::testing::TempDir() + "agentx-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
        m_folder = folder;
    }
    ~AgentxSessionFixture() override {
        m_session.reset();
        m_master.reset();
        std::filesystem::remove_all(m_folder);
    }

    /// A session that is patient for longer than any test lasts, unless the test says otherwise.
    static AgentxPace patient() {
        return {std::chrono::milliseconds(1), kTestPatience * 100, kTestPatience * 100,
                kTestPatience * 100};
    }

    void startMaster() { m_master.emplace(path()); }
    void startSession(AgentxPace const& pace = patient()) {
        m_session.emplace(
            *parseAgentxAddress(path()), roots(), m_rows,
            [](AgentxHeader const& header, std::string_view) {
                return agentxResponse(header, AgentxFault::NotWritable);
            },
            pace, m_capabilities, [this] { return m_now; });
    }
    /// Lets the session run until `condition` holds. Each round takes a millisecond of the
    /// session's clock, however long the machine takes.
    template <class Condition>
    bool runUntil(Condition condition) {
        auto const limit = Clock::now() + kTestPatience;
        while (!condition()) {
            if (Clock::now() > limit) return false;
            pollfd polled{m_session->descriptor(), m_session->events(), 0};
            poll(&polled, 1, 1);
            m_now += std::chrono::milliseconds(1);
            m_session->advance(polled.revents);
        }
        return true;
    }
    /// The session's next packet; one of kind `Response` when none comes.
    Packet next() {
        std::optional<Packet> packet;
        EXPECT_TRUE(runUntil([&] { return m_master->accept() && (packet = m_master->receive()); }));
        return packet.value_or(Packet{{AgentxKind::Response, false, true, 0, 0, 0, 0}, {}});
    }
    /// Takes the next packet, of this kind, and grants it.
    Packet grant(AgentxKind kind) {
        Packet packet = next();
        EXPECT_EQ(packet.header.kind, kind);
        m_master->respond(packet);
        return packet;
    }
    void connectSession() {
        grant(AgentxKind::Open);
        grant(AgentxKind::Register);
        EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    }
    void notify() {
        m_session->send({{1, 3, 6, 1, 4, 1, 32473, 1, 0, 1}, {}, {}}, [this](Delivery delivery) {
            ++(delivery == Delivery::Sent ? m_taken : m_dropped);
        });
    }

    std::string path() const { return m_folder + "/master"; }

    std::vector<AgentxRoot> roots() const {
        std::vector<AgentxRoot> all{{kRoot, "KVL-OAM-MIB", true}};
        if (m_servesOther) all.push_back({kOtherRoot, "DS1-MIB", false});
        return all;
    }
    /// There are interfaces of these indices, of which ifIndex and ifDescr are known.
    void haveInterfaces(std::vector<std::uint32_t> const& indices) {
        m_snapshot.interfaces.interfaces.clear();
        for (std::uint32_t const index : indices)
            m_snapshot.interfaces.interfaces.emplace_back().ifIndex = index;
        m_rows.update({m_snapshot, m_counters}, m_now);
        if (m_session) m_session->registerRows();
    }
    /// What a Register or Unregister packet is about: "2.1000-1003" of ifTable's columns.
    static std::string rangeOf(Packet const& packet) {
        AgentxReader reader(packet.payload, true);
        reader.number16();
        std::size_t const place = reader.octet();
        reader.octet();
        Oid const name = reader.name().name;
        if (place == 0) return "no range";
        EXPECT_EQ(place, name.size());
        EXPECT_EQ(name.size(), 11U);
        EXPECT_TRUE(startsWith(name, Oid{1, 3, 6, 1, 2, 1, 2, 2, 1}));
        std::string const text = std::to_string(name[9]) + "." + std::to_string(name[10]) + "-" +
                                 std::to_string(reader.number());
        EXPECT_TRUE(reader.atEnd());
        return text;
    }
    /// Grants all that comes until nothing more is asked for; what it was about.
    std::vector<std::string> grantRanges(AgentxKind kind, std::size_t count) {
        std::vector<std::string> ranges;
        for (std::size_t i = 0; i < count; ++i)
            ranges.push_back(rangeOf(grant(kind)));
        // What comes after the last is the answer to a question.
        m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
        EXPECT_EQ(next().header.kind, AgentxKind::Response);
        return ranges;
    }

    std::string m_folder;
    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Clock::time_point m_now{std::chrono::hours(1)};
    SharedRows m_rows{
        {{m_tree,
          kStandardArc,
          {{{2, 2, 1, 1}, "ifTable", HostHas::Rows}, {{2, 2, 1, 2}, "ifTable", HostHas::Rows}}}}};
    bool m_servesOther = false;
    std::vector<Capability> m_capabilities;
    std::optional<ScriptedMaster> m_master;
    std::optional<AgentxSession> m_session;
    int m_taken = 0;
    int m_dropped = 0;
};

} // namespace kvloamd
