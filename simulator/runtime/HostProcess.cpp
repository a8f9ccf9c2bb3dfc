// SPDX-License-Identifier: BSD-2-Clause
// Processes of this host, as the kernel's process files show them.
#include "simulator/runtime/HostProcess.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <sstream>
#include <stdexcept>
#include <utility>

#include "simulator/base/Descriptor.h"
#include "simulator/base/Text.h"

namespace kvlsim {

namespace {

/// The beginning of a file that the kernel makes up; nothing when it cannot be read.
std::optional<std::string> readProcFile(pid_t pid, char const* name) {
    std::string const path = "/proc/" + std::to_string(pid) + "/" + name;
    Descriptor const file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file.get() < 0) return std::nullopt;
    std::array<char, 4096> text{};
    ssize_t size = 0;
    do
        size = read(file.get(), text.data(), text.size());
    while (size < 0 && errno == EINTR);
    if (size < 0) return std::nullopt;
    return std::string(text.data(), static_cast<std::size_t>(size));
}

/// A `Pipe` is both ends of a pipe.
struct Pipe {
    Descriptor out; ///< to read from
    Descriptor in;  ///< to write to

    Pipe() {
        std::array<int, 2> ends{};
        if (pipe2(ends.data(), O_CLOEXEC) != 0)
            throw std::runtime_error(std::string("cannot start a process (") +
                                     std::strerror(errno) + ")");
        out = Descriptor(ends[0]);
        in = Descriptor(ends[1]);
    }
};

bool readByte(int fd, char& byte) {
    ssize_t size = 0;
    do
        size = read(fd, &byte, 1);
    while (size < 0 && errno == EINTR);
    return size == 1;
}

/// A `SpawnPlan` is the state in which a spawned process starts: no signal blocked or ignored, and
/// these files.
class SpawnPlan {
  public:
    SpawnPlan(int input, int output) {
        posix_spawn_file_actions_init(&m_files);
        posix_spawn_file_actions_adddup2(&m_files, input, STDIN_FILENO);
        posix_spawn_file_actions_adddup2(&m_files, output, STDOUT_FILENO);
        posix_spawn_file_actions_addopen(&m_files, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
        // Sockets of the program that uses the platform are not for its processes.
        posix_spawn_file_actions_addclosefrom_np(&m_files, STDERR_FILENO + 1);
        posix_spawnattr_init(&m_attributes);
        sigset_t none;
        sigemptyset(&none);
        sigset_t all;
        sigfillset(&all);
        posix_spawnattr_setsigmask(&m_attributes, &none);
        posix_spawnattr_setsigdefault(&m_attributes, &all);
        posix_spawnattr_setflags(&m_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    }
    ~SpawnPlan() {
        posix_spawn_file_actions_destroy(&m_files);
        posix_spawnattr_destroy(&m_attributes);
    }
    SpawnPlan(SpawnPlan const&) = delete;
    SpawnPlan& operator=(SpawnPlan const&) = delete;

    pid_t spawn(char const* program, std::string name) {
        std::array<char*, 2> arguments = {name.data(), nullptr};
        std::array<char*, 1> environment = {nullptr};
        pid_t pid = 0;
        int const error = posix_spawn(&pid, program, &m_files, &m_attributes, arguments.data(),
                                      environment.data());
        if (error != 0)
            throw std::runtime_error(std::string("cannot run ") + program + " (" +
                                     std::strerror(error) + ")");
        return pid;
    }

  private:
    posix_spawn_file_actions_t m_files{};
    posix_spawnattr_t m_attributes{};
};

} // namespace

std::optional<HostProcess> runningProcess(pid_t pid) {
    if (pid <= 0) return std::nullopt;
    auto const status = readProcFile(pid, "stat");
    // The second field is the program's name in brackets, and may contain anything.
    auto const bracket = status ? status->rfind(')') : std::string::npos;
    if (bracket == std::string::npos) return std::nullopt;
    std::istringstream fields(status->substr(bracket + 1));
    std::string state;
    fields >> state;
    if (state.empty() || state == "Z" || state == "X") return std::nullopt;
    std::string skipped;
    for (int field = 4; field < 22; ++field)
        fields >> skipped;
    HostProcess process{pid, 0};
    fields >> process.startedAt;
    return fields ? std::optional(process) : std::nullopt;
}

std::string programOf(pid_t pid) {
    std::string const line = readProcFile(pid, "cmdline").value_or("");
    std::string const program = line.substr(0, line.find('\0'));
    return program.substr(program.rfind('/') + 1);
}

std::vector<HostProcess> processesRunning(std::string const& program) {
    std::vector<HostProcess> found;
    std::error_code error;
    for (std::filesystem::directory_iterator entry("/proc", error), end; entry != end && !error;
         entry.increment(error)) {
        std::string const name = entry->path().filename().string();
        pid_t pid = 0;
        auto const [stop, bad] = std::from_chars(name.data(), name.data() + name.size(), pid);
        if (bad != std::errc() || stop != name.data() + name.size()) continue;
        if (programOf(pid) != program) continue;
        if (auto const process = runningProcess(pid)) found.push_back(*process);
    }
    std::ranges::sort(found, {}, &HostProcess::pid);
    return found;
}

WaitingChild::WaitingChild(std::string const& name) {
    Pipe input;
    Pipe output;
    // Written while the other end is open here: a child that ends at once raises no signal.
    char byte = '\n';
    bool const written = write(input.in.get(), &byte, 1) == 1;
    // It copies its input until the kernel has closed the last other end of the lifeline.
    m_process.pid = SpawnPlan(input.out.get(), output.in.get()).spawn("/bin/cat", name);
    m_lifeline = std::move(input.in);
    output.in = Descriptor();
    // Once it has copied a byte, the program runs and its command line can be read: that is only
    // some time after it has been spawned.
    bool const copied = written && readByte(output.out.get(), byte);
    auto const process = runningProcess(m_process.pid);
    if (copied && process) {
        m_process = *process;
        return;
    }
    end();
    throw std::runtime_error("the process " + inQuotes(name) + " does not run");
}

WaitingChild::~WaitingChild() {
    end();
}

void WaitingChild::end() {
    m_lifeline = Descriptor();
    if (!runs()) return;
    kill(m_process.pid, SIGKILL);
    while (waitpid(m_process.pid, nullptr, 0) < 0 && errno == EINTR) {
    }
}

bool WaitingChild::runs() {
    if (m_reaped) return false;
    pid_t const ended = waitpid(m_process.pid, nullptr, WNOHANG);
    // A host that reaps all its children may have taken the exit status already.
    m_reaped = ended == m_process.pid || (ended < 0 && errno == ECHILD);
    return !m_reaped;
}

} // namespace kvlsim
