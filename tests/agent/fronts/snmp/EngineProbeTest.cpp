// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/EngineProbe.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <stdexcept>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr int kPatience = 60000; // milliseconds

/// A UDP socket that says only what the test says.
class ScriptedReceiver {
  public:
    ScriptedReceiver() : m_socket(socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        socklen_t size = sizeof address;
        if (bind(m_socket, reinterpret_cast<sockaddr*>(&address), size) != 0 ||
            getsockname(m_socket, reinterpret_cast<sockaddr*>(&address), &size) != 0)
            throw std::runtime_error("no port on loopback");
        m_port = ntohs(address.sin_port);
    }
    ~ScriptedReceiver() { hangUp(); }
    ScriptedReceiver(ScriptedReceiver const&) = delete;
    ScriptedReceiver& operator=(ScriptedReceiver const&) = delete;

    ReceiverAddress address() const { return {AF_INET, "127.0.0.1", std::to_string(m_port)}; }
    std::string receive() {
        pollfd polled{m_socket, POLLIN, 0};
        if (poll(&polled, 1, kPatience) != 1) return {};
        char buffer[2048];
        socklen_t size = sizeof m_asker;
        ssize_t const got = recvfrom(m_socket, buffer, sizeof buffer, 0,
                                     reinterpret_cast<sockaddr*>(&m_asker), &size);
        return {buffer, static_cast<std::size_t>(got)};
    }
    void say(std::string const& octets) const {
        sendto(m_socket, octets.data(), octets.size(), 0,
               reinterpret_cast<sockaddr const*>(&m_asker), sizeof m_asker);
    }
    void hangUp() {
        if (m_socket >= 0) close(m_socket);
        m_socket = -1;
    }

  private:
    int m_socket;
    int m_port = 0;
    sockaddr_in m_asker{};
};

/// The answer of an engine to a discovery: a report that differs from it in the engine ID.
std::string reportOf(std::string const& discovery, std::string const& engine) {
    // The security parameters begin behind the version and the header.
    std::size_t const at = 2 + 3 + 19;
    std::string report = discovery;
    auto const grown = static_cast<char>(engine.size());
    report.replace(at + 4, 2, std::string("\x04") + grown + engine);
    for (std::size_t const length : {std::size_t{1}, at + 1, at + 3})
        report[length] = static_cast<char>(report[length] + grown);
    return report;
}

std::optional<std::string> resultOf(EngineProbe& probe) {
    pollfd polled{probe.descriptor(), POLLIN, 0};
    poll(&polled, 1, kPatience);
    return probe.receive();
}

std::string const kEngine("\x80\x00\x00\x00\x01\x02\x03\x04", 8);

TEST(EngineProbeTest, EngineIdOfTheAnswerIsFound) {
    EXPECT_EQ(engineIn(reportOf(discoveryMessage(0x40000007), kEngine), 0x40000007), kEngine);
}

TEST(EngineProbeTest, AnswerToAnotherDiscoveryIsNoAnswer) {
    EXPECT_EQ(engineIn(reportOf(discoveryMessage(0x40000007), kEngine), 0x40000008), std::nullopt);
}

TEST(EngineProbeTest, AnswerWithoutAnEngineIdIsNoAnswer) {
    EXPECT_EQ(engineIn(discoveryMessage(0x40000007), 0x40000007), std::nullopt);
}

TEST(EngineProbeTest, DamagedAnswersAreNoAnswers) {
    std::string const report = reportOf(discoveryMessage(0x40000007), kEngine);
    // What follows the engine ID is not looked at.
    std::size_t const looked = report.find(kEngine) + kEngine.size();
    for (std::size_t size = 0; size < report.size(); ++size)
        EXPECT_EQ(engineIn(report.substr(0, size), 0x40000007), std::nullopt) << size;
    for (std::size_t at = 0; at < looked; ++at) {
        for (int octet = 0; octet < 256; ++octet) {
            std::string damaged = report;
            damaged[at] = static_cast<char>(octet);
            auto const engine = engineIn(damaged, 0x40000007);
            EXPECT_TRUE(!engine || (engine->size() >= 5 && engine->size() <= 32)) << at;
        }
    }
}

TEST(EngineProbeTest, ReceiverIsAskedAndItsAnswerRead) {
    ScriptedReceiver receiver;
    EngineProbe probe(receiver.address(), "127.0.0.1");
    std::string const asked = receiver.receive();
    EXPECT_EQ(probe.receive(), std::nullopt);
    receiver.say("something else");
    receiver.say(reportOf(asked, kEngine));
    std::optional<std::string> engine;
    while (!engine && probe.fault().empty())
        engine = resultOf(probe);
    EXPECT_EQ(engine, kEngine);
}

TEST(EngineProbeTest, ReceiverThatIsDownIsAFault) {
    ScriptedReceiver receiver;
    ReceiverAddress const address = receiver.address();
    receiver.hangUp();
    EngineProbe probe(address, "127.0.0.1");
    // The fault is known at once, or with the next receive.
    auto const engine = probe.fault().empty() ? resultOf(probe) : std::nullopt;
    EXPECT_EQ(engine, std::nullopt);
    EXPECT_EQ(probe.fault(), "nobody receives there");
}

} // namespace
} // namespace kvloamd
