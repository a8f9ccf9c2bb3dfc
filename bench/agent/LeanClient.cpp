// SPDX-License-Identifier: BSD-2-Clause
#include "LeanClient.h"

#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <span>
#include <stdexcept>
#include <system_error>
#include <thread>

namespace {

using kvloamd::Oid;

constexpr char kInteger = 0x02;
constexpr char kOctets = 0x04;
constexpr char kName = 0x06;
constexpr char kSequence = 0x30;
constexpr char kBulkRequest = static_cast<char>(0xa5);

std::string encode(char type, std::string const& content) {
    std::string encoded{type};
    std::size_t const size = content.size();
    if (size < 128) {
        encoded += static_cast<char>(size);
    } else {
        encoded += static_cast<char>(0x82);
        encoded += static_cast<char>(size >> 8);
        encoded += static_cast<char>(size & 0xff);
    }
    return encoded + content;
}

/// A number from 0 to 127.
std::string encodeSmall(int number) {
    return encode(kInteger, {static_cast<char>(number)});
}

std::string encodeName(Oid const& name) {
    std::string content{static_cast<char>(name.at(0) * 40 + name.at(1))};
    for (std::uint32_t const number : std::span(name).subspan(2)) {
        int shift = 28;
        while (shift > 0 && (number >> shift) == 0)
            shift -= 7;
        for (; shift > 0; shift -= 7)
            content += static_cast<char>(0x80 | (number >> shift & 0x7f));
        content += static_cast<char>(number & 0x7f);
    }
    return encode(kName, content);
}

/// Takes one element off the front of `rest`; returns its content.
std::string_view take(std::string_view& rest) {
    std::size_t at = 1;
    auto const octet = [&] { return static_cast<unsigned char>(rest.at(at++)); };
    std::size_t size = octet();
    if (size >= 0x80) {
        std::size_t octets = size & 0x7f;
        for (size = 0; octets > 0; --octets)
            size = size << 8 | octet();
    }
    if (size > rest.size() - at) throw std::runtime_error("a response is cut");
    std::string_view const content = rest.substr(at, size);
    rest.remove_prefix(at + size);
    return content;
}

Oid decodeName(std::string_view content) {
    auto const first = static_cast<unsigned char>(content.at(0));
    Oid name{first / 40U, first % 40U};
    std::uint32_t number = 0;
    for (char const octet : content.substr(1)) {
        number = number << 7 | (static_cast<unsigned char>(octet) & 0x7fU);
        if ((octet & 0x80) != 0) continue;
        name.push_back(number);
        number = 0;
    }
    return name;
}

int boundSocket(std::uint16_t port, int (*attach)(int, sockaddr const*, socklen_t)) {
    int const descriptor = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(port);
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (descriptor < 0 ||
        attach(descriptor, reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0)
        throw std::system_error(errno, std::generic_category(), "a socket of loopback");
    return descriptor;
}

} // namespace

LeanClient::LeanClient(int port)
    : m_socket(boundSocket(static_cast<std::uint16_t>(port), connect)) {}

LeanClient::~LeanClient() {
    close(m_socket);
}

std::string LeanClient::bulkRequest(std::vector<Oid> const& names, int repetitions) {
    std::string variables;
    std::string const nothing{0x05, 0x00};
    for (Oid const& name : names)
        variables += encode(kSequence, encodeName(name) + nothing);
    return encode(kSequence, encodeSmall(1) + encode(kOctets, "public") +
                                 encode(kBulkRequest, encodeSmall(7) + encodeSmall(0) +
                                                          encodeSmall(repetitions) +
                                                          encode(kSequence, variables)));
}

std::string_view LeanClient::ask(std::string const& request) {
    if (send(m_socket, request.data(), request.size(), 0) < 0)
        throw std::system_error(errno, std::generic_category(), "a request");
    std::string_view const response = receive(-1);
    if (response.size() < request.size()) throw std::runtime_error("a response is too short");
    return response;
}

std::string_view LeanClient::receive(int milliseconds) {
    if (milliseconds >= 0) {
        pollfd polled{m_socket, POLLIN, 0};
        if (poll(&polled, 1, milliseconds) <= 0) return {};
    }
    ssize_t const size = recv(m_socket, m_response.data(), m_response.size(), 0);
    return size < 0 ? std::string_view{}
                    : std::string_view{m_response.data(), static_cast<std::size_t>(size)};
}

std::vector<Answered> LeanClient::read(std::string_view response) {
    std::string_view message = take(response);
    take(message); // version
    take(message); // community
    std::string_view pdu = take(message);
    take(pdu); // request
    if (take(pdu) != std::string_view("\0", 1)) throw std::runtime_error("a response is an error");
    take(pdu); // where the error is
    std::string_view variables = take(pdu);
    std::vector<Answered> answers;
    while (!variables.empty()) {
        std::string_view variable = take(variables);
        Oid name = decodeName(take(variable));
        answers.push_back({std::move(name), std::string(variable)});
    }
    return answers;
}

void LeanClient::waitFor(Oid const& name) {
    std::string const request = bulkRequest({name}, 1);
    for (int attempt = 0; attempt < 600; ++attempt) {
        send(m_socket, request.data(), request.size(), 0);
        if (auto const response = receive(100); !response.empty()) {
            auto const answers = read(response);
            if (!answers.empty() && kvloamd::startsWith(answers.front().name, name)) return;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
        while (!receive(0).empty()) {
            // A late response to an attempt before.
        }
    }
    throw std::runtime_error("an agent does not come up");
}

int freePort() {
    int const descriptor = boundSocket(0, bind);
    sockaddr_in address{};
    socklen_t size = sizeof address;
    getsockname(descriptor, reinterpret_cast<sockaddr*>(&address), &size);
    close(descriptor);
    return ntohs(address.sin_port);
}
