// SPDX-License-Identifier: BSD-2-Clause
#include "Child.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <fstream>
#include <system_error>

namespace {

[[noreturn]] void fail(char const* what) {
    throw std::system_error(errno, std::generic_category(), what);
}

pid_t forkBound(std::function<int()> const& body) {
    // What waits in the buffers would be printed twice.
    std::fflush(nullptr);
    pid_t const parent = getpid();
    pid_t const child = fork();
    if (child < 0) fail("fork");
    if (child > 0) return child;
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent) _exit(1);
    int status = 1;
    try {
        status = body();
    } catch (std::exception const& error) {
        std::fprintf(stderr, "%s\n", error.what());
    }
    std::fflush(nullptr);
    _exit(status);
}

int execute(std::vector<std::string> const& command) {
    int const nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
    dup2(nowhere, STDOUT_FILENO);
    std::vector<char*> arguments;
    for (std::string const& argument : command)
        arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);
    execvp(arguments[0], arguments.data());
    std::perror(arguments[0]);
    return 127;
}

} // namespace

Child::Child(std::function<int()> const& body) : m_pid(forkBound(body)) {}

Child::Child(std::vector<std::string> const& command)
    : m_pid(forkBound([&] { return execute(command); })) {}

Child::~Child() {
    if (m_pid <= 0) return;
    kill(m_pid, SIGKILL);
    waitpid(m_pid, nullptr, 0);
}

int Child::wait() {
    int status = 0;
    waitpid(m_pid, &status, 0);
    m_pid = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

void useOneProcessor() {
    cpu_set_t usable;
    if (sched_getaffinity(0, sizeof usable, &usable) != 0) fail("sched_getaffinity");
    std::size_t last = CPU_SETSIZE - 1;
    while (!CPU_ISSET(last, &usable))
        --last;
    cpu_set_t one;
    CPU_ZERO(&one);
    CPU_SET(last, &one);
    if (sched_setaffinity(0, sizeof one, &one) != 0) fail("sched_setaffinity");
}

Folder::Folder() {
    m_path = (std::filesystem::temp_directory_path() / "bench_agent-XXXXXX").string();
    if (mkdtemp(m_path.data()) == nullptr) fail(m_path.c_str());
}

Folder::~Folder() {
    std::error_code ignored;
    std::filesystem::remove_all(m_path, ignored);
}

void Folder::write(std::string const& name, std::string const& text) const {
    std::ofstream(path(name)) << text;
}
