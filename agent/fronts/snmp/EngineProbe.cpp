// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/EngineProbe.h"

#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <random>

namespace kvloamd {

namespace {

constexpr char kInteger = 0x02;
constexpr char kOctets = 0x04;
constexpr char kSequence = 0x30;
constexpr char kGet = '\xa0';

/// An engine ID has 5 to 32 octets (RFC 3411).
constexpr std::size_t kShortestEngine = 5;
constexpr std::size_t kLongestEngine = 32;

/// Encodes a value of less than 128 octets.
std::string encoded(char tag, std::string const& content) {
    return std::string{tag, static_cast<char>(content.size())} + content;
}

std::string encodedNumber(std::uint32_t number) {
    return encoded(kInteger, {static_cast<char>(number >> 24), static_cast<char>(number >> 16),
                              static_cast<char>(number >> 8), static_cast<char>(number)});
}

/// Takes a value off the front of `octets`. Returns its content; nothing if it has another tag or
/// does not end within `octets`.
std::optional<std::string_view> take(std::string_view& octets, char tag) {
    if (octets.size() < 2 || octets[0] != tag) return std::nullopt;
    std::size_t length = static_cast<unsigned char>(octets[1]);
    octets.remove_prefix(2);
    if (length >= 0x80) {
        std::size_t const size = length - 0x80;
        if (size > 2 || octets.size() < size) return std::nullopt;
        length = 0;
        for (std::size_t i = 0; i < size; ++i)
            length = length * 256 + static_cast<unsigned char>(octets[i]);
        octets.remove_prefix(size);
    }
    if (octets.size() < length) return std::nullopt;
    std::string_view const content = octets.substr(0, length);
    octets.remove_prefix(length);
    return content;
}

} // namespace

std::string discoveryMessage(std::uint32_t messageId) {
    std::string const none = encoded(kOctets, {});
    std::string const zero = encoded(kInteger, std::string(1, '\0'));
    std::string const version = encoded(kInteger, "\x03");
    std::string const longest = encoded(kInteger, std::string("\x00\xff\xe3", 3));
    std::string const reportable = encoded(kOctets, "\x04");
    std::string const userModel = encoded(kInteger, "\x03");
    std::string const header =
        encoded(kSequence, encodedNumber(messageId) + longest + reportable + userModel);
    std::string const security =
        encoded(kOctets, encoded(kSequence, none + zero + zero + none + none + none));
    std::string const request =
        encoded(kGet, encodedNumber(messageId) + zero + zero + encoded(kSequence, {}));
    return encoded(kSequence,
                   version + header + security + encoded(kSequence, none + none + request));
}

std::optional<std::string> engineIn(std::string_view message, std::uint32_t messageId) {
    auto content = take(message, kSequence);
    if (!content || !take(*content, kInteger)) return std::nullopt;
    auto header = take(*content, kSequence);
    auto security = take(*content, kOctets);
    if (!header || !security) return std::nullopt;
    auto const id = take(*header, kInteger);
    auto parameters = take(*security, kSequence);
    if (!id || !parameters) return std::nullopt;
    std::uint32_t answered = 0;
    for (char const octet : *id)
        answered = answered * 256 + static_cast<unsigned char>(octet);
    auto const engine = take(*parameters, kOctets);
    if (answered != messageId || !engine || engine->size() < kShortestEngine ||
        engine->size() > kLongestEngine)
        return std::nullopt;
    return std::string(*engine);
}

EngineProbe::EngineProbe(ReceiverAddress const& address, std::string const& number) {
    addrinfo hints{};
    hints.ai_family = address.family;
    hints.ai_socktype = SOCK_DGRAM;
    hints.ai_flags = AI_NUMERICHOST | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    if (int const error = getaddrinfo(number.c_str(), address.port.c_str(), &hints, &found);
        error != 0) {
        m_fault = gai_strerror(error);
        return;
    }
    // Positive, as message IDs are.
    m_messageId = (std::random_device()() & 0x3fffffffU) | 0x40000000U;
    std::string const message = discoveryMessage(m_messageId);
    m_socket = socket(found->ai_family, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    bool const sent = m_socket >= 0 && connect(m_socket, found->ai_addr, found->ai_addrlen) == 0 &&
                      send(m_socket, message.data(), message.size(), 0) >= 0;
    if (!sent) fail();
    freeaddrinfo(found);
}

EngineProbe::~EngineProbe() {
    if (m_socket >= 0) close(m_socket);
}

void EngineProbe::fail() {
    m_fault = errno == ECONNREFUSED ? "nobody receives there" : std::strerror(errno);
}

std::optional<std::string> EngineProbe::receive() {
    char buffer[2048];
    for (;;) {
        ssize_t const got = recv(m_socket, buffer, sizeof buffer, MSG_DONTWAIT);
        if (got < 0) {
            if (errno == EINTR) continue;
            if (errno != EAGAIN) fail();
            return std::nullopt;
        }
        if (auto engine =
                engineIn(std::string_view(buffer, static_cast<std::size_t>(got)), m_messageId))
            return engine;
    }
}

} // namespace kvloamd
