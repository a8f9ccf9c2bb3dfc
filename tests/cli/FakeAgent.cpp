// SPDX-License-Identifier: BSD-2-Clause
#include "tests/cli/FakeAgent.h"

#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <sstream>
#include <stdexcept>

namespace {

void require(bool holds, char const* what) {
    if (!holds) throw std::runtime_error(what);
}

} // namespace

FakeAgent::FakeAgent(std::string const& path, std::map<std::string, std::string> const& answers)
    : m_path(path) {
    for (auto const& [target, body] : answers)
        answerApi(target, body);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    require(path.size() < sizeof address.sun_path, "the path is too long");
    path.copy(address.sun_path, path.size());
    m_listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    require(bind(m_listener, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0, "bind");
    start();
}

FakeAgent::FakeAgent() {
    sockaddr_in address{};
    socklen_t size = sizeof address;
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    m_listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    require(bind(m_listener, reinterpret_cast<sockaddr*>(&address), size) == 0, "bind");
    require(getsockname(m_listener, reinterpret_cast<sockaddr*>(&address), &size) == 0, "port");
    m_port = ntohs(address.sin_port);
    start();
}

// NOLINTNEXTLINE(bugprone-exception-escape): a test whose agent cannot be stopped may end
FakeAgent::~FakeAgent() {
    require(write(m_stop[1], "x", 1) == 1, "stop");
    m_thread.join();
    for (int const fd : {m_listener, m_stop[0], m_stop[1]})
        close(fd);
    if (!m_path.empty()) unlink(m_path.c_str());
}

void FakeAgent::answer(std::string const& target, FakeAnswer answer) {
    std::lock_guard const lock(m_mutex);
    m_answers.insert_or_assign(target, std::move(answer));
}

std::vector<std::string> FakeAgent::requests() const {
    std::lock_guard const lock(m_mutex);
    return m_requests;
}

void FakeAgent::start() {
    require(listen(m_listener, 16) == 0, "listen");
    require(pipe(m_stop) == 0, "pipe");
    m_thread = std::thread([this] { serve(); });
}

void FakeAgent::serve() {
    for (;;) {
        pollfd waiting[2] = {{m_listener, POLLIN, 0}, {m_stop[0], POLLIN, 0}};
        if (poll(waiting, 2, -1) < 0) continue;
        if (waiting[1].revents != 0) return;
        int const connection = accept4(m_listener, nullptr, nullptr, SOCK_CLOEXEC);
        if (connection < 0) continue;
        converse(connection);
        close(connection);
    }
}

void FakeAgent::converse(int connection) {
    // The next octets of the client; false at its end, or at the test's.
    auto const receive = [&](std::string& into) {
        pollfd waiting[2] = {{connection, POLLIN, 0}, {m_stop[0], POLLIN, 0}};
        if (poll(waiting, 2, -1) < 0 || waiting[1].revents != 0) return false;
        char octets[4096];
        ssize_t const count = read(connection, octets, sizeof octets);
        if (count > 0) into.append(octets, static_cast<std::size_t>(count));
        return count > 0;
    };
    std::string head;
    while (head.find("\r\n\r\n") == std::string::npos)
        if (!receive(head)) return;
    std::string method;
    std::string target;
    std::istringstream(head) >> method >> target;

    FakeAnswer answer{R"({"error":{"status":404,"message":"there is no such thing"}})", 404};
    {
        std::lock_guard const lock(m_mutex);
        m_requests.push_back(head);
        if (auto const found = m_answers.find(target); found != m_answers.end())
            answer = found->second;
    }
    if (answer.isNone) {
        while (receive(head)) {
        }
        return;
    }
    std::string const sent =
        answer.isBare
            ? answer.body
            : "HTTP/1.1 " + std::to_string(answer.status) +
                  " Status\r\nContent-Type: application/json\r\nConnection: close\r\n" +
                  answer.headers + "Content-Length: " + std::to_string(answer.body.size()) +
                  "\r\n\r\n" + answer.body;
    for (std::size_t done = 0; done < sent.size();) {
        ssize_t const count =
            send(connection, sent.data() + done, sent.size() - done, MSG_NOSIGNAL);
        if (count <= 0) return;
        done += static_cast<std::size_t>(count);
    }
}
