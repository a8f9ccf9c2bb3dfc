// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ConfigCheck.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <iterator>
#include <string_view>
#include <system_error>
#include <vector>

#include "agent/rows/Clock.h"

extern char** environ; // NOLINT(readability-redundant-declaration): not declared everywhere

namespace kvloamd {

namespace {

constexpr std::string_view kPrefix = "kvloamd: ";
constexpr std::size_t kMostOutput = 65536;

/// The first line of the output, and how many follow.
std::string summaryOf(std::string_view output) {
    std::size_t const end = std::min(output.find('\n'), output.size());
    std::string_view first = output.substr(0, end);
    if (first.starts_with(kPrefix)) first.remove_prefix(kPrefix.size());
    auto const lines = std::ranges::count(output, '\n');
    std::string summary(first);
    if (lines > 1) summary += " (and " + std::to_string(lines - 1) + " more; see --check-config)";
    return summary;
}

/// Starts this program with `arguments`, its output in `output`, and every signal as usual. Returns
/// the error of posix_spawn.
int spawn(std::vector<std::string> arguments, int output, pid_t& child) {
    std::vector<char*> words;
    words.reserve(arguments.size() + 1);
    for (std::string& argument : arguments)
        words.push_back(argument.data());
    words.push_back(nullptr);
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_addopen(&files, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_adddup2(&files, output, STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&files, output, STDERR_FILENO);
    posix_spawnattr_t attributes;
    posix_spawnattr_init(&attributes);
    sigset_t none{};
    sigemptyset(&none);
    posix_spawnattr_setsigmask(&attributes, &none);
    posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK);
    int const error =
        posix_spawn(&child, "/proc/self/exe", &files, &attributes, words.data(), environ);
    posix_spawnattr_destroy(&attributes);
    posix_spawn_file_actions_destroy(&files);
    return error;
}

} // namespace

ConfigCheck::ConfigCheck(Options const& options) : m_snmpConfig(options.snmpConfig) {}

ConfigCheck::~ConfigCheck() {
    if (!m_thread.joinable()) return;
    m_cancelled.wake();
    m_thread.join();
}

void ConfigCheck::start() {
    if (m_thread.joinable()) {
        m_isAskedAgain = true;
        return;
    }
    m_isAskedAgain = false;
    try {
        m_thread = std::thread([this] { run(); });
    } catch (std::system_error const& error) {
        m_fault = std::string("the check got no thread: ") + error.what();
        m_done.wake();
    }
}

std::optional<std::string> ConfigCheck::take() {
    m_done.clear();
    if (m_thread.joinable()) m_thread.join();
    if (!m_isAskedAgain) return m_fault;
    start();
    return std::nullopt;
}

void ConfigCheck::run() {
    m_fault = check();
    m_done.wake();
}

std::string ConfigCheck::check() {
    int ends[2] = {-1, -1};
    if (pipe2(ends, O_CLOEXEC) != 0) return std::string("the check: ") + std::strerror(errno);
    std::vector<std::string> arguments{"kvloamd", "--check-snmp-config"};
    if (!m_snmpConfig.empty()) {
        arguments.emplace_back("--snmp-config");
        arguments.push_back(m_snmpConfig);
    }
    pid_t child = -1;
    int const error = spawn(std::move(arguments), ends[1], child);
    close(ends[1]);
    if (error != 0) {
        close(ends[0]);
        return std::string("the check cannot be started: ") + std::strerror(error);
    }
    std::string output;
    bool ended = false;
    auto const deadline = Clock::now() + kPatience;
    while (!ended && Clock::now() < deadline) {
        pollfd polled[] = {{ends[0], POLLIN, 0}, {m_cancelled.descriptor(), POLLIN, 0}};
        constexpr int kTurn = 1000; // milliseconds
        if (poll(polled, std::size(polled), kTurn) < 0) continue;
        if (polled[1].revents != 0) break;
        if (polled[0].revents == 0) continue;
        char buffer[4096];
        ssize_t const got = read(ends[0], buffer, sizeof buffer);
        if (got <= 0)
            ended = true;
        else if (output.size() < kMostOutput)
            output.append(buffer, static_cast<std::size_t>(got));
    }
    close(ends[0]);
    if (!ended) kill(child, SIGKILL);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (!ended) return "the check does not end";
    if (WIFEXITED(status) && WEXITSTATUS(status) == 0) return {};
    return output.empty() ? "the check has failed" : summaryOf(output);
}

} // namespace kvloamd
