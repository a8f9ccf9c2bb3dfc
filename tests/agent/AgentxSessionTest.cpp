// SPDX-License-Identifier: BSD-2-Clause
#include "agent/AgentxSession.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <optional>
#include <stdexcept>

#include <gmock/gmock.h>

#include "agent/StandardObjects.h"

namespace kvloamd {
namespace {

using std::chrono::milliseconds;

constexpr std::chrono::seconds kTestPatience{60};

Oid const kRoot{1, 3, 6, 1, 4, 1, 32473, 1, 1};
Oid const kOtherRoot{1, 3, 6, 1, 2, 1, 10, 18};

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

class AgentxSessionTest : public ::testing::Test {
  protected:
    AgentxSessionTest() {
        std::string folder = ::testing::TempDir() + "agentx-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
        m_folder = folder;
    }
    ~AgentxSessionTest() override {
        m_session.reset();
        m_master.reset();
        std::filesystem::remove_all(m_folder);
    }

    /// A session that is patient for longer than any test runs, unless the test says otherwise.
    static AgentxPace patient() {
        return {milliseconds(1), kTestPatience * 10, kTestPatience * 10, kTestPatience * 10};
    }

    void startMaster() { m_master.emplace(path()); }
    void startSession(AgentxPace const& pace = patient()) {
        m_session.emplace(
            *parseAgentxAddress(path()), roots(), m_rows,
            [](AgentxHeader const& header, std::string_view) {
                return agentxResponse(header, AgentxFault::NotWritable);
            },
            pace);
    }
    /// Lets the session run until `condition` holds.
    template <class Condition>
    bool runUntil(Condition condition) {
        auto const limit = Clock::now() + kTestPatience;
        while (!condition()) {
            if (Clock::now() > limit) return false;
            pollfd polled{m_session->descriptor(), m_session->events(), 0};
            poll(&polled, 1, 1);
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
        m_session->send({{1, 3, 6, 1, 4, 1, 32473, 1, 0, 1}, {}, {}}, [this] { ++m_taken; });
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
    Clock::time_point m_now = Clock::now();
    SharedRows m_rows{{{m_tree, kStandardArc, {{{2, 2}, "ifTable", HostHas::Rows}}}}};
    bool m_servesOther = false;
    std::optional<ScriptedMaster> m_master;
    std::optional<AgentxSession> m_session;
    int m_taken = 0;
};

TEST_F(AgentxSessionTest, OpensThenRegistersInTheSessionThatTheMasterNames) {
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    Packet const packet = grant(AgentxKind::Register);
    EXPECT_EQ(packet.header.session, 77U);
    AgentxReader reader(packet.payload, true);
    reader.number();
    EXPECT_EQ(reader.name().name, kRoot);
    EXPECT_TRUE(reader.atEnd());
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
}

TEST_F(AgentxSessionTest, ConnectsOnceAMasterIsThere) {
    startSession();
    EXPECT_FALSE(m_session->isConnected());
    startMaster();
    connectSession();
}

TEST_F(AgentxSessionTest, ConnectsAgainWhenTheMasterHasHungUp) {
    startMaster();
    startSession();
    connectSession();
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    connectSession();
}

TEST_F(AgentxSessionTest, ConnectsAgainWhenTheMasterEndsTheSession) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(AgentxWriter(AgentxKind::Close, 77, 0, 1).take());
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, TriesAgainWhenItsNamesAreRefused) {
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    EXPECT_FALSE(m_session->isConnected());
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, NamesThatCanBeDoneWithoutMayBeRefused) {
    m_servesOther = true;
    startMaster();
    startSession();
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    ::testing::internal::CaptureStderr();
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    std::string const told = ::testing::internal::GetCapturedStderr();
    EXPECT_THAT(told, ::testing::HasSubstr("the SNMP master refuses DS1-MIB: another agent serves "
                                           "them already; stop it"));
    // The next master refuses them too, which is no news.
    m_master->hangUp();
    ::testing::internal::CaptureStderr();
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    EXPECT_THAT(::testing::internal::GetCapturedStderr(),
                ::testing::Not(::testing::HasSubstr("refuses")));
}

TEST_F(AgentxSessionTest, IsConnectedBeforeTheRowsAreRegistered) {
    startMaster();
    haveInterfaces({1000});
    startSession();
    connectSession();
    EXPECT_EQ(rangeOf(next()), "2.1000-1000");
}

TEST_F(AgentxSessionTest, RowsAreRegisteredOneRangeAfterTheOther) {
    startMaster();
    haveInterfaces({1000, 1001, 1016});
    startSession();
    connectSession();
    Packet const first = next();
    EXPECT_EQ(first.header.kind, AgentxKind::Register);
    EXPECT_EQ(first.header.session, 77U);
    // Nothing more comes before the answer, but answers.
    m_master->say(AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take());
    EXPECT_EQ(next().header.kind, AgentxKind::Response);
    EXPECT_FALSE(m_master->receive().has_value());
    m_master->respond(first);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 3),
                ::testing::ElementsAre("2.1000-1001", "1.1016-1016", "1.1000-1001"));
}

TEST_F(AgentxSessionTest, RowsThatComeLaterAreRegistered) {
    startMaster();
    startSession();
    connectSession();
    haveInterfaces({1000});
    EXPECT_THAT(grantRanges(AgentxKind::Register, 2),
                ::testing::ElementsAre("2.1000-1000", "1.1000-1000"));
}

TEST_F(AgentxSessionTest, RowsThatHaveLongBeenGoneAreUnregistered) {
    startMaster();
    haveInterfaces({1000, 1001});
    startSession();
    connectSession();
    grantRanges(AgentxKind::Register, 2);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    haveInterfaces({});
    EXPECT_THAT(grantRanges(AgentxKind::Unregister, 2),
                ::testing::ElementsAre("2.1000-1001", "1.1000-1001"));
}

TEST_F(AgentxSessionTest, RefusedRowsLeaveTheRestServed) {
    startMaster();
    haveInterfaces({1000, 1016});
    startSession();
    connectSession();
    m_master->respond(next(), AgentxFault::DuplicateRegistration);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 3),
                ::testing::ElementsAre("2.1000-1000", "1.1016-1016", "1.1000-1000"));
    EXPECT_TRUE(m_session->isConnected());
}

TEST_F(AgentxSessionTest, MasterThatDiesAmidTheRowsIsToldAllAgain) {
    startMaster();
    haveInterfaces({1000, 1016});
    startSession();
    connectSession();
    EXPECT_EQ(rangeOf(grant(AgentxKind::Register)), "2.1016-1016");
    EXPECT_EQ(rangeOf(next()), "2.1000-1000");
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    connectSession();
    EXPECT_THAT(grantRanges(AgentxKind::Register, 4),
                ::testing::ElementsAre("2.1016-1016", "2.1000-1000", "1.1016-1016", "1.1000-1000"));
}

TEST_F(AgentxSessionTest, MasterThatHangsAmidTheRowsGoesOnWithThem) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = milliseconds(20);
    haveInterfaces({1000});
    startSession(pace);
    connectSession();
    Packet const packet = next();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
    EXPECT_THAT(grantRanges(AgentxKind::Register, 1), ::testing::ElementsAre("1.1000-1000"));
}

TEST_F(AgentxSessionTest, NotificationGoesOutAmidTheRows) {
    startMaster();
    haveInterfaces({1000});
    startSession();
    connectSession();
    Packet const range = next();
    ASSERT_TRUE(m_session->ready());
    notify();
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Notify);
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    m_master->respond(range);
    EXPECT_THAT(grantRanges(AgentxKind::Register, 1), ::testing::ElementsAre("1.1000-1000"));
}

TEST_F(AgentxSessionTest, RequestIsAnsweredWhateverPiecesItComesIn) {
    startMaster();
    startSession();
    connectSession();
    for (char const octet : AgentxWriter(AgentxKind::TestSet, 77, 5, 6).take()) {
        m_master->say(std::string(1, octet));
        m_session->advance(POLLIN);
    }
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Response);
    EXPECT_EQ(packet.header.transaction, 5U);
    EXPECT_EQ(packet.header.packet, 6U);
}

TEST_F(AgentxSessionTest, GarbageEndsTheConnection) {
    startMaster();
    startSession();
    connectSession();
    m_master->say(std::string(40, 'x'));
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, NotificationIsTakenWhenTheMasterSaysSo) {
    startMaster();
    startSession();
    connectSession();
    ASSERT_TRUE(m_session->ready());
    notify();
    EXPECT_FALSE(m_session->ready());
    Packet const packet = next();
    EXPECT_EQ(packet.header.kind, AgentxKind::Notify);
    EXPECT_EQ(m_taken, 0);
    m_master->respond(packet);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    EXPECT_TRUE(m_session->ready());
}

TEST_F(AgentxSessionTest, NotificationCarriesValuesOfEveryType) {
    startMaster();
    startSession();
    connectSession();
    Oid const name{1, 3, 6, 1, 4, 1, 32473, 9};
    std::string const bits("\xa0\x00", 2);
    m_session->send({joined(kRoot, Oid{0, 1}),
                     {{name, ValueType::Integer, std::int64_t{-5}},
                      {name, ValueType::TimeTicks, std::int64_t{4294967295}},
                      {name, ValueType::Counter64, std::int64_t{1} << 40},
                      {name, ValueType::Text, std::string("text")},
                      {name, ValueType::Octets, bits},
                      {name, ValueType::ObjectId, kOtherRoot}},
                     Clock::now()},
                    [] {});
    Packet const packet = next();
    AgentxReader reader(packet.payload, true);
    auto const head = [&](unsigned type, Oid const& of) {
        EXPECT_EQ(reader.number16(), type);
        reader.number16();
        EXPECT_EQ(reader.name().name, of);
    };
    auto const octets = [&] {
        std::string text(reader.number(), '\0');
        for (std::size_t i = 0; i < (text.size() + 3) / 4 * 4; ++i) {
            auto const octet = static_cast<char>(reader.octet());
            if (i < text.size()) text[i] = octet;
        }
        return text;
    };
    head(6, {1, 3, 6, 1, 6, 3, 1, 1, 4, 1, 0});
    EXPECT_EQ(reader.name().name, joined(kRoot, Oid{0, 1}));
    head(2, name);
    EXPECT_EQ(reader.number(), 0xfffffffb);
    head(67, name);
    EXPECT_EQ(reader.number(), 0xffffffff);
    head(70, name);
    EXPECT_EQ(reader.number(), 256U);
    EXPECT_EQ(reader.number(), 0U);
    head(4, name);
    EXPECT_EQ(octets(), "text");
    head(4, name);
    EXPECT_EQ(octets(), bits);
    head(6, name);
    EXPECT_EQ(reader.name().name, kOtherRoot);
    EXPECT_TRUE(reader.atEnd());
}

TEST_F(AgentxSessionTest, NotificationOfALostConnectionIsNotTaken) {
    startMaster();
    startSession();
    connectSession();
    notify();
    EXPECT_EQ(next().header.kind, AgentxKind::Notify);
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_FALSE(m_session->ready());
    connectSession();
    EXPECT_TRUE(m_session->ready());
    EXPECT_EQ(m_taken, 0);
}

TEST_F(AgentxSessionTest, LossesOfAMasterThatWasConnectedAreCounted) {
    startMaster();
    startSession();
    connectSession();
    EXPECT_EQ(m_session->timesLost(), 0U);
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_EQ(m_session->timesLost(), 1U);
}

TEST_F(AgentxSessionTest, MasterThatWasNeverConnectedIsNotLost) {
    startMaster();
    startSession();
    EXPECT_EQ(next().header.kind, AgentxKind::Open);
    m_master->hangUp();
    EXPECT_TRUE(runUntil([this] { return m_session->descriptor() < 0; }));
    EXPECT_EQ(m_session->timesLost(), 0U);
}

TEST_F(AgentxSessionTest, RefusedNotificationIsNotSentAgain) {
    startMaster();
    startSession();
    connectSession();
    notify();
    m_master->respond(next(), AgentxFault::ParseError);
    EXPECT_TRUE(runUntil([this] { return m_taken == 1; }));
    EXPECT_TRUE(m_session->isConnected());
}

TEST_F(AgentxSessionTest, MasterThatHasForgottenTheSessionIsConnectedAnew) {
    startMaster();
    startSession();
    connectSession();
    notify();
    m_master->respond(next(), AgentxFault::NotOpen);
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    EXPECT_EQ(m_taken, 0);
    m_master->hangUp();
    connectSession();
}

TEST_F(AgentxSessionTest, SilentMasterIsAskedAndLostUntilItAnswers) {
    startMaster();
    AgentxPace pace = patient();
    pace.ping = pace.patience = milliseconds(20);
    startSession(pace);
    grant(AgentxKind::Open);
    grant(AgentxKind::Register);
    Packet const ping = next();
    EXPECT_EQ(ping.header.kind, AgentxKind::Ping);
    EXPECT_TRUE(runUntil([this] { return !m_session->isConnected(); }));
    m_master->respond(ping);
    EXPECT_TRUE(runUntil([this] { return m_session->isConnected(); }));
}

TEST_F(AgentxSessionTest, MasterThatNeverAnswersIsConnectedAnew) {
    startMaster();
    AgentxPace pace = patient();
    pace.patience = pace.surrender = milliseconds(20);
    startSession(pace);
    EXPECT_EQ(next().header.kind, AgentxKind::Open);
    EXPECT_TRUE(runUntil([this] { return m_master->isLeft(); }));
}

TEST_F(AgentxSessionTest, MasterThatLetsNobodyInIsWaitedForWithoutBlocking) {
    startMaster();
    // Those who wait already fill the place before the door.
    auto const address = *parseAgentxAddress(path());
    std::vector<int> waiting;
    int result = 0;
    while (result == 0) {
        waiting.push_back(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
        result = connect(waiting.back(), reinterpret_cast<sockaddr const*>(&address.socket),
                         address.size);
    }
    ASSERT_EQ(errno, EAGAIN);
    startSession();
    EXPECT_LT(m_session->descriptor(), 0);
    for (int const descriptor : waiting)
        close(descriptor);
    // The master lets in those who waited, and finds that they have left.
    for (std::size_t i = 0; i + 1 < waiting.size(); ++i) {
        ASSERT_TRUE(m_master->accept());
        m_master->hangUp();
    }
    connectSession();
}

TEST_F(AgentxSessionTest, RefusedConnectionOfTheNetworkIsTriedAgain) {
    // A bound port where nobody listens.
    int const bound = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    ASSERT_EQ(bind(bound, reinterpret_cast<sockaddr*>(&address), size), 0);
    ASSERT_EQ(getsockname(bound, reinterpret_cast<sockaddr*>(&address), &size), 0);
    m_session.emplace(
        *parseAgentxAddress("tcp:" + std::to_string(ntohs(address.sin_port))), roots(), m_rows,
        [](AgentxHeader const&, std::string_view) { return ""; }, patient());
    EXPECT_TRUE(runUntil([this] { return m_session->descriptor() < 0; }));
    ASSERT_EQ(listen(bound, 1), 0);
    int accepted = -1;
    EXPECT_TRUE(runUntil([&] {
        pollfd door{bound, POLLIN, 0};
        if (poll(&door, 1, 0) > 0) accepted = accept4(bound, nullptr, nullptr, SOCK_CLOEXEC);
        return accepted >= 0;
    }));
    close(accepted);
    close(bound);
}

TEST_F(AgentxSessionTest, LeaveIsTaken) {
    startMaster();
    startSession();
    connectSession();
    m_session.reset();
    auto const packet = m_master->receive();
    ASSERT_TRUE(packet.has_value());
    EXPECT_EQ(packet->header.kind, AgentxKind::Close);
    EXPECT_EQ(packet->header.session, 77U);
    EXPECT_TRUE(m_master->isLeft());
}

} // namespace
} // namespace kvloamd
