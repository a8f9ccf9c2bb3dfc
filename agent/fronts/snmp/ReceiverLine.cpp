// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/ReceiverLine.h"

#include <arpa/inet.h>
#include <netdb.h>
#include <sys/socket.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <utility>

#include "agent/fronts/snmp/TransportKinds.h"

namespace kvloamd {

namespace {

constexpr std::string_view kBlanks = " \t\r\n";

/// The options of trapsess, as of the SNMP tools, that have a value.
constexpr std::string_view kOptionsWithValue = "YmMOIPDvrtcZeEnulxXaApT3LsC";

bool isPort(std::string_view text) {
    std::uint16_t port = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), port);
    return error == std::errc() && end == text.data() + text.size() && port > 0;
}

} // namespace

std::optional<std::string> ReceiverAddress::number() const {
    if (family == AF_INET) {
        in_addr address{};
        if (inet_pton(AF_INET, host.c_str(), &address) == 1) return host;
        return std::nullopt;
    }
    addrinfo hints{};
    hints.ai_family = family;
    hints.ai_socktype = SOCK_DGRAM;
    hints.ai_flags = AI_NUMERICHOST;
    addrinfo* found = nullptr;
    if (getaddrinfo(host.c_str(), nullptr, &hints, &found) != 0) return std::nullopt;
    freeaddrinfo(found);
    return host;
}

ReceiverLine::ReceiverLine(std::string directive, std::string text, bool thirdByDefault)
    : m_directive(std::move(directive)), m_text(std::move(text)) {
    if (m_directive == "trapsess")
        readSession(thirdByDefault);
    else
        readSink();
}

std::optional<ReceiverLine::Word> ReceiverLine::nextWord(std::size_t from) const {
    std::size_t const begin = m_text.find_first_not_of(kBlanks, from);
    if (begin == std::string::npos) return std::nullopt;
    char const quote = m_text[begin];
    if (quote != '"' && quote != '\'') {
        std::size_t const end = std::min(m_text.find_first_of(kBlanks, begin), m_text.size());
        return Word{begin, end, m_text.substr(begin, end - begin)};
    }
    Word word{begin, begin + 1, {}};
    for (; word.end < m_text.size() && m_text[word.end] != quote; ++word.end) {
        if (m_text[word.end] == '\\' && word.end + 1 < m_text.size()) ++word.end;
        word.text += m_text[word.end];
    }
    if (word.end == m_text.size()) throw ReceiverFault("a quoted text is not closed");
    ++word.end;
    return word;
}

ReceiverLine::Word ReceiverLine::expectWord(std::size_t from, std::string const& missing) const {
    auto word = nextWord(from);
    if (!word) throw ReceiverFault(missing);
    return *std::move(word);
}

void ReceiverLine::readSink() {
    m_isForInforms = m_directive == "informsink";
    std::string const missing =
        m_directive + " names no host; write it like " + m_directive + " 192.0.2.7:162 community";
    Word word = expectWord(0, missing);
    while (word.text.starts_with('-')) {
        std::string const option = word.text;
        if (option != "-name" && option != "-tag" && option != "-profile" && option != "-s")
            throw ReceiverFault("unknown option " + option + " of " + m_directive);
        word = expectWord(word.end, option + " has no value");
        word = expectWord(word.end, missing);
    }
    readHost(word);
    auto const community = nextWord(word.end);
    auto const port = community ? nextWord(community->end) : std::nullopt;
    if (!port) return;
    if (!isPort(port->text)) throw ReceiverFault("'" + port->text + "' is not a port");
    m_address.port = port->text;
    m_portIsApart = true;
}

void ReceiverLine::readSession(bool thirdByDefault) {
    bool third = thirdByDefault;
    bool informs = false;
    bool namesEngine = false;
    std::string const missing =
        "trapsess names no host; write it like trapsess -v 2c -c community 192.0.2.7:162";
    Word word = expectWord(0, missing);
    for (; word.text.starts_with('-'); word = expectWord(word.end, missing)) {
        if (word.text == "-name" || word.text == "-tag" || word.text == "-profile") {
            word = expectWord(word.end, word.text + " has no value");
            continue;
        }
        for (std::size_t at = 1; at < word.text.size(); ++at) {
            char const option = word.text[at];
            if (option == 'd') continue;
            if (kOptionsWithValue.find(option) == std::string_view::npos)
                throw ReceiverFault("unknown option " + word.text + " of trapsess");
            std::string value = word.text.substr(at + 1);
            if (value.empty()) {
                word = expectWord(word.end, std::string("-") + option + " has no value");
                value = word.text;
            }
            if (option == 'v') third = value == "3";
            if (option == 'e') namesEngine = true;
            if (option == 'C') informs = informs || value.find('i') != std::string::npos;
            break;
        }
    }
    readHost(word);
    m_asksEngine = third && informs && !namesEngine;
    m_isForInforms = informs;
}

void ReceiverLine::readHost(Word const& word) {
    m_hostBegin = word.begin;
    m_hostEnd = word.end;
    std::string_view rest = word.text;
    std::string const kind = transportKind(rest);
    if (isOfBlockingKind(rest))
        throw ReceiverFault("'" + word.text +
                            "': notifications are sent by udp: and udp6: only, because " + kind +
                            ": would block the agent");
    bool const isSixth = kind == "udp6" || kind == "udpv6" || kind == "udpipv6";
    m_address.family = isSixth ? AF_INET6 : AF_INET;
    if (isSixth || kind == "udp") rest.remove_prefix(kind.size() + 1);
    std::string_view port = "162";
    if (rest.starts_with('[')) {
        std::size_t const end = std::min(rest.find(']'), rest.size());
        std::string_view const after = rest.substr(std::min(end + 1, rest.size()));
        if (after.starts_with(':')) port = after.substr(1);
        rest = rest.substr(1, end - 1);
    } else if (!isSixth || std::ranges::count(rest, ':') == 1) {
        if (std::size_t const colon = rest.rfind(':'); colon != std::string_view::npos) {
            port = rest.substr(colon + 1);
            rest = rest.substr(0, colon);
        }
    }
    bool const isHost = !rest.empty() && (isSixth || rest.find(':') == std::string_view::npos);
    if (!isHost || !isPort(port))
        throw ReceiverFault("'" + word.text +
                            "' is not an address; write it like 192.0.2.7:162, "
                            "receiver.example.com:162 or udp6:[2001:db8::7]:162");
    m_address.host = rest;
    m_address.port = port;
}

std::string ReceiverLine::resolved(std::string const& number, std::string_view engine) const {
    std::string text = m_text.substr(0, m_hostBegin);
    if (!engine.empty()) {
        text += "-e ";
        for (char const octet : engine) {
            constexpr char digits[] = "0123456789abcdef";
            auto const value = static_cast<unsigned char>(octet);
            text += digits[value / 16];
            text += digits[value % 16];
        }
        text += ' ';
    }
    // The transport is named because the configuration can change the library's default.
    text += m_address.family == AF_INET6 ? "udp6:[" + number + "]" : "udp:" + number;
    if (!m_portIsApart) text += ":" + m_address.port;
    return text + m_text.substr(m_hostEnd);
}

} // namespace kvloamd
