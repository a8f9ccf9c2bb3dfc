// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/Process.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <sstream>
#include <system_error>

namespace kvloamd::e2e {

namespace {

std::vector<char*> pointers(std::vector<std::string>& texts) {
    std::vector<char*> result;
    for (std::string& text : texts)
        result.push_back(text.data());
    result.push_back(nullptr);
    return result;
}

} // namespace

Process::Process(std::vector<std::string> const& command, Environment const& environment) {
    std::vector<std::string> arguments = command;
    std::vector<std::string> variables;
    for (auto const& [name, value] : environment)
        variables.push_back(name + "=" + value);
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0)
        throw std::system_error(errno, std::generic_category(), "pipe");
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, ends[1], STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&actions, ends[1], STDERR_FILENO);
    int const result = posix_spawnp(&m_pid, arguments.front().c_str(), &actions, nullptr,
                                    pointers(arguments).data(), pointers(variables).data());
    posix_spawn_file_actions_destroy(&actions);
    close(ends[1]);
    m_pipe = ends[0];
    if (result != 0) {
        close(m_pipe);
        throw std::system_error(result, std::generic_category(), arguments.front());
    }
}

Process::~Process() {
    if (m_running) {
        signal(SIGKILL);
        waitpid(m_pid, nullptr, 0);
    }
    closePipe();
}

void Process::closePipe() {
    if (m_pipe >= 0) close(m_pipe);
    m_pipe = -1;
}

bool Process::readMore(std::chrono::steady_clock::time_point deadline) {
    auto const left = std::min(std::chrono::duration_cast<std::chrono::milliseconds>(
                                   deadline - std::chrono::steady_clock::now()),
                               std::chrono::milliseconds(kPatience));
    pollfd readable{m_pipe, POLLIN, 0};
    if (m_pipe < 0 || left.count() <= 0 || poll(&readable, 1, static_cast<int>(left.count())) <= 0)
        return false;
    char buffer[4096];
    ssize_t const got = read(m_pipe, buffer, sizeof buffer);
    if (got <= 0) return false;
    m_output.append(buffer, static_cast<std::size_t>(got));
    return true;
}

bool Process::waitFor(std::string const& text, int times) {
    auto const deadline = std::chrono::steady_clock::now() + kPatience;
    auto const appeared = [&] {
        int count = 0;
        for (auto at = m_output.find(text); at != std::string::npos;
             at = m_output.find(text, at + text.size()))
            ++count;
        return count >= times;
    };
    while (!appeared())
        if (!readMore(deadline)) return false;
    return true;
}

bool Process::hasNow(std::string const& text) {
    pollfd readable{m_pipe, POLLIN, 0};
    while (poll(&readable, 1, 0) > 0 && readMore(std::chrono::steady_clock::time_point::max())) {
    }
    return m_output.find(text) != std::string::npos;
}

int Process::wait() {
    auto const deadline = std::chrono::steady_clock::now() + kPatience;
    while (readMore(deadline)) {
    }
    // The output has ended, so the process has ended or is about to. One that hangs is killed here.
    if (std::chrono::steady_clock::now() >= deadline) signal(SIGKILL);
    int status = 0;
    waitpid(m_pid, &status, 0);
    m_running = false;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

void Process::signal(int number) const {
    kill(m_pid, number);
}

std::vector<std::string> linesOf(std::string const& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

} // namespace kvloamd::e2e
