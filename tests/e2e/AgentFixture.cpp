// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/AgentFixture.h"

#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

#include "agent/daemon/Options.h"

namespace kvloamd::e2e {

namespace {

std::string inherited(char const* name) {
    char const* const value = std::getenv(name);
    return value == nullptr ? std::string() : value;
}

bool isFree(int type, int port) {
    int const probe = socket(AF_INET, type | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_ANY);
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    bool const bound = bind(probe, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
    close(probe);
    return bound;
}

} // namespace

std::vector<Answer> parseAnswers(std::string const& output) {
    std::vector<Answer> answers;
    for (std::string const& line : linesOf(output)) {
        // The end of the MIB view, not an answer.
        if (line.find("No more variables left in this MIB View") != std::string::npos) continue;
        auto const equals = line.find(" = ");
        auto name = parseOid(line.substr(0, equals));
        if (equals != std::string::npos && name.has_value())
            answers.push_back({std::move(*name), line.substr(equals + 3)});
        else if (!answers.empty())
            answers.back().value += "\n" + line; // a value that continues on the next line
    }
    return answers;
}

AgentFixture::AgentFixture() {
    std::string folder = ::testing::TempDir() + "kvloamd-XXXXXX";
    if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
    m_folder = folder;
    m_snmpConfig = path("snmp.conf");
    // The tools print a message when they create it themselves.
    std::filesystem::create_directories(path("client/cert_indexes"));
    std::filesystem::create_directories(path("store"));
    configureSnmp(kReader);
}

AgentFixture::~AgentFixture() {
    m_agent.reset();
    m_trapReceiver.reset();
    std::error_code ignored;
    std::filesystem::remove_all(m_folder, ignored);
}

Process::Environment AgentFixture::environment() const {
    Process::Environment variables{
        {"PATH", inherited("PATH")},
        {"HOME", m_folder},
        {"SNMPCONFPATH", m_folder + "/none"},
        {"SNMP_PERSISTENT_DIR", m_folder + "/client"},
        {"KVLSIM_SOCKET", path("sim.sock")},
        {"VQRXCFGPATH", m_folder + "/store"},
        // The SNMP library's own leak is named in the file.
        {"LSAN_OPTIONS", "print_suppressions=0:suppressions=" LSAN_SUPPRESSIONS},
    };
    for (char const* const name :
         {"ASAN_OPTIONS", "TSAN_OPTIONS", "UBSAN_OPTIONS", "LD_LIBRARY_PATH"})
        if (std::string value = inherited(name); !value.empty()) variables[name] = value;
    if (m_chassis) variables["KVLSIM_CHASSIS"] = *m_chassis;
    for (auto const& [name, value] : m_variables)
        variables[name] = value;
    return variables;
}

void AgentFixture::useChassis(std::string const& yaml) {
    m_chassis = path("chassis.yaml");
    write(*m_chassis, yaml);
}

void AgentFixture::startAgent(std::vector<std::string> const& arguments) {
    for (int attempt = 0; attempt < 10; ++attempt) {
        m_port = freePort();
        std::vector<std::string> command{
            KVLOAMD,      "--port",           std::to_string(m_port), "--module",
            "z7sim",      "--module-dir",     moduleDirectory(),      "--snmp-config",
            m_snmpConfig, "--persistent-dir", path("persistent")};
        command.insert(command.end(), arguments.begin(), arguments.end());
        m_agent = std::make_unique<Process>(command, environment());
        if (m_agent->waitFor("kvloamd: serving ")) return;
        // Another process took the port between the choice and the start.
        if (m_agent->output().find("port is in use") == std::string::npos) break;
    }
    FAIL() << "the agent does not start: " << m_agent->output();
}

void AgentFixture::launchAgent(std::vector<std::string> const& arguments) {
    std::vector<std::string> command{KVLOAMD};
    command.insert(command.end(), arguments.begin(), arguments.end());
    m_agent = std::make_unique<Process>(command, environment());
}

Result AgentFixture::runAgent(std::vector<std::string> const& arguments) {
    std::vector<std::string> command{KVLOAMD};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return run(command);
}

int AgentFixture::stopAgent() {
    m_agent->signal(SIGTERM);
    return m_agent->wait();
}

Result AgentFixture::run(std::vector<std::string> const& command) const {
    Process process(command, environment());
    int const status = process.wait();
    return {status, process.output()};
}

Result AgentFixture::snmp(std::string const& tool,
                          std::vector<std::string> const& arguments) const {
    std::vector<std::string> command{tool, "-M", MIB_PATH, "-m", "KVL-OAM-MIB"};
    command.insert(command.end(), arguments.begin(), arguments.end());
    return run(command);
}

Result AgentFixture::ask(std::string const& tool, std::vector<std::string> const& arguments) const {
    std::vector<std::string> all{"-v2c", "-c", "public", "-t", "30", "-r", "2", "-On", address()};
    // The tool's own options come before the address.
    std::size_t options = 0;
    while (options < arguments.size() && arguments[options].starts_with("-"))
        ++options;
    auto const split = arguments.begin() + static_cast<std::ptrdiff_t>(options);
    all.insert(all.end() - 1, arguments.begin(), split);
    all.insert(all.end(), split, arguments.end());
    return snmp(tool, all);
}

std::vector<Answer> AgentFixture::answers(std::string const& tool,
                                          std::vector<std::string> const& arguments) const {
    Result const result = ask(tool, arguments);
    EXPECT_EQ(result.status, 0) << result.output;
    return parseAnswers(result.output);
}

std::vector<Answer> AgentFixture::walk(std::string const& from) const {
    return answers("snmpwalk", {from});
}

std::string AgentFixture::get(std::string const& name) const {
    auto const answered = answers("snmpget", {name});
    return answered.empty() ? "nothing" : answered.front().value;
}

void AgentFixture::editWalks(std::string const& edit) {
    std::filesystem::create_directory(path("bin"));
    std::string const searched = environment()["PATH"];
    write(path("bin/snmpbulkwalk"),
          "#!/bin/sh\nPATH='" + searched + "' snmpbulkwalk \"$@\" | sed '" + edit + "'\n");
    std::filesystem::permissions(path("bin/snmpbulkwalk"), std::filesystem::perms::owner_all);
    setVariable("PATH", path("bin") + ":" + searched);
}

void AgentFixture::sim(std::vector<std::string> const& arguments) const {
    std::vector<std::string> command{KVLSIM};
    command.insert(command.end(), arguments.begin(), arguments.end());
    Result const result = run(command);
    EXPECT_EQ(result.status, 0) << result.output;
}

bool AgentFixture::eventually(std::function<bool()> const& condition) {
    auto const deadline = std::chrono::steady_clock::now() + kPatience;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > deadline) return false;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
}

void AgentFixture::startWithReceiver(std::string const& access) {
    startTrapReceiver("authCommunity log public\n");
    configureSnmp(access + " public 127.0.0.1\ntrap2sink " + trapAddress() + " public\n");
    startAgent();
}

void AgentFixture::startTrapReceiver(std::string const& config,
                                     std::vector<std::string> const& output) {
    write(path("trapd.conf"), config);
    for (int attempt = 0; attempt < 10; ++attempt) {
        if (!m_trapPortIsChosen) m_trapPort = freePort();
        std::vector<std::string> command{"snmptrapd",       "-f", "-Lo", "-n", "-C", "-c",
                                         path("trapd.conf")};
        command.insert(command.end(), output.begin(), output.end());
        command.push_back("udp:" + trapAddress());
        m_trapReceiver = std::make_unique<Process>(command, environment());
        if (m_trapReceiver->waitFor("NET-SNMP version") &&
            eventually([this] { return udpPortIsBound(m_trapPort); }))
            return;
    }
    FAIL() << "snmptrapd does not start: " << m_trapReceiver->output();
}

bool AgentFixture::udpPortIsBound(int port) {
    char wanted[16];
    std::snprintf(wanted, sizeof wanted, ":%04X ", static_cast<unsigned>(port));
    std::ifstream table("/proc/net/udp");
    for (std::string line; std::getline(table, line);)
        if (line.find(wanted) != std::string::npos) return true;
    return false;
}

int AgentFixture::freePort() {
    // The system gives higher ports to clients, so that one of them could take a port before the
    // program that it is meant for. Every process begins at another place.
    constexpr int first = 10000;
    constexpr int count = 10000;
    static int next = getpid() * 7919 % count;
    for (int tried = 0; tried < count; ++tried) {
        int const port = first + next++ % count;
        if (isFree(SOCK_DGRAM, port) && isFree(SOCK_STREAM, port)) return port;
    }
    throw std::runtime_error("no free port on loopback");
}

std::string AgentFixture::moduleDirectory() const {
    return MODULE_DIR;
}

void AgentFixture::write(std::string const& file, std::string const& text) {
    std::ofstream stream(file);
    stream << text;
    stream.close();
    ASSERT_TRUE(stream.good()) << file;
}

} // namespace kvloamd::e2e
