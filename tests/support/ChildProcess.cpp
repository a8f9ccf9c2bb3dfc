// SPDX-License-Identifier: BSD-2-Clause
// A program that a test runs and talks to; every wait is bounded.
#include "tests/support/ChildProcess.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <stdexcept>
#include <string_view>

extern char** environ;

namespace support {

namespace {

constexpr int kPatience = 120000; // milliseconds; generous, because sanitizers are slow

struct Pipe {
    std::array<int, 2> ends{};
    Pipe() {
        if (pipe2(ends.data(), O_CLOEXEC) != 0) throw std::runtime_error("no pipe");
    }
};

std::vector<char*> pointers(std::vector<std::string>& texts) {
    std::vector<char*> result;
    for (auto& text : texts)
        result.push_back(text.data());
    result.push_back(nullptr);
    return result;
}

/// These variables and the test's own, without those of the simulated platform.
std::vector<std::string> withOwn(std::vector<std::string> variables) {
    for (char** variable = environ; *variable != nullptr; ++variable)
        if (!std::string_view(*variable).starts_with("KVLSIM_")) variables.emplace_back(*variable);
    return variables;
}

void closeEnd(int& fd) {
    if (fd >= 0) close(fd);
    fd = -1;
}

} // namespace

ChildProcess::ChildProcess(std::vector<std::string> const& command,
                           std::vector<std::string> const& environment)
    : ChildProcess(Program{command.front()}, command, withOwn(environment)) {}

ChildProcess::ChildProcess(Program const& program, std::vector<std::string> command,
                           std::vector<std::string> environment) {
    Pipe in;
    Pipe out;
    Pipe err;
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, in.ends[0], 0);
    posix_spawn_file_actions_adddup2(&actions, out.ends[1], 1);
    posix_spawn_file_actions_adddup2(&actions, err.ends[1], 2);
    int const error = posix_spawn(&m_pid, program.path.c_str(), &actions, nullptr,
                                  pointers(command).data(), pointers(environment).data());
    posix_spawn_file_actions_destroy(&actions);
    for (int fd : {in.ends[0], out.ends[1], err.ends[1]})
        close(fd);
    m_in = in.ends[1];
    m_out = out.ends[0];
    m_err = err.ends[0];
    if (error != 0) throw std::runtime_error("cannot run " + program.path);
}

ChildProcess::~ChildProcess() {
    if (m_pid > 0) {
        kill();
        finish();
    }
    for (int* fd : {&m_in, &m_out, &m_err})
        closeEnd(*fd);
}

void ChildProcess::signal(int number) const {
    ::kill(m_pid, number);
}

void ChildProcess::killAndLeave() const {
    signal(SIGKILL);
    siginfo_t info{};
    while (waitid(P_PID, static_cast<id_t>(m_pid), &info, WEXITED | WNOWAIT) < 0 &&
           errno == EINTR) {
    }
}

void ChildProcess::writeLine(std::string const& line) {
    std::string const text = line + "\n";
    if (write(m_in, text.data(), text.size()) != static_cast<ssize_t>(text.size()))
        throw std::runtime_error("the program reads no more");
}

bool ChildProcess::readMore() {
    std::array<pollfd, 2> polled = {{{m_out, POLLIN, 0}, {m_err, POLLIN, 0}}};
    if (m_out < 0 && m_err < 0) return false;
    if (poll(polled.data(), polled.size(), kPatience) <= 0) return false;
    auto const take = [](int& fd, pollfd const& ready, std::string& text) {
        if ((ready.revents & (POLLIN | POLLHUP | POLLERR)) == 0) return;
        std::array<char, 4096> block{};
        ssize_t const size = read(fd, block.data(), block.size());
        if (size > 0)
            text.append(block.data(), static_cast<std::size_t>(size));
        else
            closeEnd(fd);
    };
    take(m_out, polled[0], m_outText);
    take(m_err, polled[1], m_errText);
    return true;
}

std::string ChildProcess::readLine() {
    while (m_outText.find('\n') == std::string::npos)
        if (m_out < 0 || !readMore()) return "(end)";
    auto const end = m_outText.find('\n');
    std::string line = m_outText.substr(0, end);
    m_outText.erase(0, end + 1);
    return line;
}

Finished ChildProcess::finish() {
    closeEnd(m_in);
    while (readMore()) {
    }
    // Both outputs at their end, or no patience left: then the program is stuck.
    if (m_out >= 0 || m_err >= 0) kill();
    int status = 0;
    while (waitpid(m_pid, &status, 0) < 0 && errno == EINTR) {
    }
    m_pid = -1;
    Finished finished;
    finished.status = WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
    finished.out = m_outText;
    finished.err = m_errText;
    return finished;
}

Finished run(std::vector<std::string> const& command, std::vector<std::string> const& environment) {
    return ChildProcess(command, environment).finish();
}

} // namespace support
