// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/SnmpMessage.h"

#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

namespace kvloamd::e2e {

namespace {

constexpr char kInteger = 0x02;
constexpr char kText = 0x04;
constexpr char kName = 0x06;
constexpr char kSequence = 0x30;

std::string element(char tag, std::string const& content) {
    std::string result(1, tag);
    if (content.size() < 0x80) {
        result += static_cast<char>(content.size());
    } else {
        result += static_cast<char>(0x82);
        result += static_cast<char>(content.size() >> 8U);
        result += static_cast<char>(content.size() & 0xffU);
    }
    return result + content;
}

std::string name(Oid const& oid) {
    std::string content(1, static_cast<char>(oid[0] * 40 + oid[1]));
    for (std::size_t i = 2; i < oid.size(); ++i) {
        std::string part(1, static_cast<char>(oid[i] & 0x7fU));
        for (std::uint32_t rest = oid[i] >> 7U; rest != 0; rest >>= 7U)
            part.insert(part.begin(), static_cast<char>((rest & 0x7fU) | 0x80U));
        content += part;
    }
    return element(kName, content);
}

std::string encode(SnmpPdu const& pdu) {
    std::string variables;
    for (Variable const& variable : pdu.variables)
        variables += element(kSequence, name(variable.name) + variable.value);
    return element(static_cast<char>(pdu.kind), integerValue(1) + integerValue(pdu.errorStatus) +
                                                    integerValue(pdu.errorIndex) +
                                                    element(kSequence, variables));
}

/// Reads BER elements one after the other; throws std::out_of_range past the end.
class Reader {
  public:
    explicit Reader(std::string_view rest) : m_rest(rest) {}

    bool atEnd() const { return m_rest.empty(); }
    unsigned char tag() const { return static_cast<unsigned char>(m_rest.at(0)); }
    /// The next element's content; `whole`, if given, becomes the element.
    std::string_view take(std::string* whole = nullptr) {
        std::size_t head = 2;
        std::size_t size = static_cast<unsigned char>(m_rest.at(1));
        if (size >= 0x80) {
            std::size_t const count = size & 0x7fU;
            size = 0;
            for (std::size_t i = 0; i < count; ++i)
                size = size << 8U | static_cast<unsigned char>(m_rest.at(head + i));
            head += count;
        }
        if (m_rest.size() < head + size) throw std::out_of_range("element");
        if (whole != nullptr) *whole = m_rest.substr(0, head + size);
        std::string_view const content = m_rest.substr(head, size);
        m_rest.remove_prefix(head + size);
        return content;
    }
    int integer() {
        int value = 0;
        for (char const octet : take())
            value = value << 8 | static_cast<unsigned char>(octet);
        return value;
    }

  private:
    std::string_view m_rest;
};

Oid parseName(std::string_view content) {
    Oid oid{static_cast<unsigned char>(content.at(0)) / 40U,
            static_cast<unsigned char>(content.at(0)) % 40U};
    std::uint32_t number = 0;
    for (char const octet : content.substr(1)) {
        number = number << 7U | (static_cast<unsigned char>(octet) & 0x7fU);
        if ((static_cast<unsigned char>(octet) & 0x80U) != 0) continue;
        oid.push_back(number);
        number = 0;
    }
    return oid;
}

SnmpPdu parsePdu(Reader& reader) {
    SnmpPdu pdu;
    pdu.kind = static_cast<PduKind>(reader.tag());
    Reader fields(reader.take());
    fields.integer();
    pdu.errorStatus = fields.integer();
    pdu.errorIndex = fields.integer();
    Reader variables(fields.take());
    while (!variables.atEnd()) {
        Reader variable(variables.take());
        Variable& parsed = pdu.variables.emplace_back();
        parsed.name = parseName(variable.take());
        variable.take(&parsed.value);
    }
    return pdu;
}

} // namespace

std::string integerValue(int value) {
    std::string content;
    for (int shift = 24; shift >= 0; shift -= 8)
        content += static_cast<char>(static_cast<unsigned>(value) >> static_cast<unsigned>(shift));
    return element(kInteger, content);
}

std::string textValue(std::string const& text) {
    return element(kText, text);
}

std::string communityMessage(int version, std::string const& community, SnmpPdu const& pdu) {
    return element(kSequence, integerValue(version) + textValue(community) + encode(pdu));
}

std::string userMessage(Engine const& engine, SnmpPdu const& pdu) {
    std::string const header =
        element(kSequence, integerValue(1) + integerValue(engine.maxSize) +
                               textValue(std::string(1, '\x04')) + integerValue(3));
    std::string const security = element(
        kSequence, textValue(engine.id) + integerValue(engine.boots) + integerValue(engine.time) +
                       textValue(engine.user) + textValue("") + textValue(""));
    return element(kSequence,
                   integerValue(3) + header + textValue(security) +
                       element(kSequence, textValue(engine.id) + textValue("") + encode(pdu)));
}

std::optional<SnmpPdu> parseMessage(std::string_view message, Engine* engine) {
    try {
        Reader whole(message);
        Reader fields(whole.take());
        int const version = fields.integer();
        if (version < 3) {
            fields.take();
            return parsePdu(fields);
        }
        fields.take();
        Reader text(fields.take());
        Reader security(text.take());
        std::string_view const id = security.take();
        int const boots = security.integer();
        int const time = security.integer();
        if (engine != nullptr) {
            engine->id = id;
            engine->boots = boots;
            engine->time = time;
        }
        Reader scoped(fields.take());
        scoped.take();
        scoped.take();
        return parsePdu(scoped);
    } catch (std::out_of_range const&) {
        return std::nullopt;
    }
}

SnmpSocket::SnmpSocket(int port, bool tcp)
    : m_socket(socket(AF_INET, (tcp ? SOCK_STREAM : SOCK_DGRAM) | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (connect(m_socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0)
        throw std::runtime_error("no connection to port " + std::to_string(port));
}

SnmpSocket::~SnmpSocket() {
    close(m_socket);
}

bool SnmpSocket::send(std::string const& message) const {
    return ::send(m_socket, message.data(), message.size(), MSG_DONTWAIT | MSG_NOSIGNAL) ==
           static_cast<ssize_t>(message.size());
}

std::string SnmpSocket::receive(int milliseconds) const {
    std::string message;
    pollfd readable{m_socket, POLLIN, 0};
    while (poll(&readable, 1, milliseconds) > 0) {
        char buffer[65536];
        ssize_t const got = recv(m_socket, buffer, sizeof buffer, 0);
        if (got <= 0) return {};
        message.append(buffer, static_cast<std::size_t>(got));
        if (parseMessage(message)) return message;
    }
    return {};
}

bool SnmpSocket::isClosedWithin(int milliseconds) const {
    pollfd readable{m_socket, POLLIN, 0};
    while (poll(&readable, 1, milliseconds) > 0) {
        char buffer[65536];
        if (recv(m_socket, buffer, sizeof buffer, 0) <= 0) return true;
    }
    return false;
}

} // namespace kvloamd::e2e
