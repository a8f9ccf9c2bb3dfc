// SPDX-License-Identifier: BSD-2-Clause
// A process with a command line of the test's choice, which waits until it is ended.
#pragma once

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstddef>
#include <stdexcept>
#include <string>

namespace sim {

class NamedProcess {
  public:
    explicit NamedProcess(std::string name) {
        // It copies its input to the output until the input ends, with the test at the latest.
        if (pipe2(m_input.data(), O_CLOEXEC) != 0 || pipe2(m_output.data(), O_CLOEXEC) != 0)
            throw std::runtime_error("no pipe");
        posix_spawn_file_actions_t files;
        posix_spawn_file_actions_init(&files);
        posix_spawn_file_actions_adddup2(&files, m_input[0], STDIN_FILENO);
        posix_spawn_file_actions_adddup2(&files, m_output[1], STDOUT_FILENO);
        std::array<char*, 2> arguments = {name.data(), nullptr};
        std::array<char*, 1> environment = {nullptr};
        int const error =
            posix_spawn(&m_pid, "/bin/cat", &files, nullptr, arguments.data(), environment.data());
        posix_spawn_file_actions_destroy(&files);
        // What has copied a byte has its command line.
        char byte = '.';
        if (error != 0 || write(m_input[1], &byte, 1) != 1 || read(m_output[0], &byte, 1) != 1)
            throw std::runtime_error("no process");
    }
    ~NamedProcess() {
        end();
        for (int const fd : {m_input[0], m_input[1], m_output[0], m_output[1]})
            close(fd);
    }
    NamedProcess(NamedProcess const&) = delete;
    NamedProcess& operator=(NamedProcess const&) = delete;

    pid_t pid() const { return m_pid; }

    /// Ends it; it stays as a process without command line until `end`.
    void die() const {
        kill(m_pid, SIGKILL);
        siginfo_t info{};
        while (waitid(P_PID, static_cast<id_t>(m_pid), &info, WEXITED | WNOWAIT) < 0 &&
               errno == EINTR) {
        }
    }
    void end() {
        if (m_ended) return;
        m_ended = true;
        kill(m_pid, SIGKILL);
        while (waitpid(m_pid, nullptr, 0) < 0 && errno == EINTR) {
        }
    }

  private:
    std::array<int, 2> m_input{};
    std::array<int, 2> m_output{};
    pid_t m_pid = -1;
    bool m_ended = false;
};

} // namespace sim
