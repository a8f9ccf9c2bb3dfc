// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/HttpSockets.h"

#include <grp.h>
#include <netdb.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr int kBacklog = 64;
constexpr mode_t kMode = 0660;
constexpr char kDefaultHost[] = "127.0.0.1";

[[noreturn]] void fail(std::string const& what) {
    throw std::runtime_error(what + ": " + std::strerror(errno));
}

/// A descriptor that is closed unless it is taken.
class Descriptor {
  public:
    explicit Descriptor(int descriptor) : m_descriptor(descriptor) {}
    ~Descriptor() {
        if (m_descriptor >= 0) close(m_descriptor);
    }
    Descriptor(Descriptor const&) = delete;
    Descriptor& operator=(Descriptor const&) = delete;

    int get() const { return m_descriptor; }
    int take() { return std::exchange(m_descriptor, -1); }

  private:
    int m_descriptor;
};

int newSocket(int family) {
    return socket(family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
}

/// The address of a Unix socket. Throws when the path is too long.
sockaddr_un unixAddress(std::string const& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path)
        throw std::runtime_error("--http-socket: the path " + path + " has more than " +
                                 std::to_string(sizeof address.sun_path - 1) + " characters");
    path.copy(std::begin(address.sun_path), path.size());
    return address;
}

/// Whether a process listens at the socket.
bool isServed(sockaddr_un const& address) {
    Descriptor const probe(newSocket(AF_UNIX));
    return connect(probe.get(), reinterpret_cast<sockaddr const*>(&address), sizeof address) == 0 ||
           errno == EAGAIN; // its queue is full
}

/// What stands against replacing the file at `path`; empty: nothing.
std::string obstacleAt(std::string const& path) {
    struct stat found {};
    if (lstat(path.c_str(), &found) != 0) {
        if (errno == ENOENT) return {};
        return "--http-socket: " + path + ": " + std::strerror(errno);
    }
    if (!S_ISSOCK(found.st_mode))
        return "--http-socket: " + path + " exists and is not a socket; choose another path";
    return {};
}

void giveToGroup(std::string const& path, std::string const& group) {
    // Not thread-safe, but nothing else reads groups.
    // NOLINTNEXTLINE(concurrency-mt-unsafe)
    ::group const* const found = getgrnam(group.c_str());
    if (found == nullptr) return;
    // A service that runs as this group may not even ask for it.
    struct stat file {};
    if (stat(path.c_str(), &file) == 0 && file.st_gid == found->gr_gid) return;
    if (chown(path.c_str(), static_cast<uid_t>(-1), found->gr_gid) == 0) return;
    log(LogLevel::Warning, "the socket " + path + " cannot be given to the group " + group + ": " +
                               std::strerror(errno) + "; only the agent's own user can use it");
}

/// The addresses of a name, freed at the end.
using Addresses = std::unique_ptr<addrinfo, decltype(&freeaddrinfo)>;

Addresses resolve(HostAndPort const& place, std::string const& text) {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    if (place.host.empty())
        throw std::runtime_error("--http: '" + text +
                                 "' is not an address; write it like 127.0.0.1:8161");
    if (int const error = getaddrinfo(place.host.c_str(), place.port.c_str(), &hints, &found);
        error != 0)
        throw std::runtime_error("--http: '" + text + "': " + gai_strerror(error));
    return {found, &freeaddrinfo};
}

bool isLoopback(sockaddr const& address) {
    if (address.sa_family == AF_INET) {
        auto const& four = reinterpret_cast<sockaddr_in const&>(address);
        return ntohl(four.sin_addr.s_addr) >> 24U == 127;
    }
    auto const& six = reinterpret_cast<sockaddr_in6 const&>(address);
    return IN6_IS_ADDR_LOOPBACK(&six.sin6_addr);
}

} // namespace

ListeningSocket ListeningSocket::unixAt(std::string const& path, std::string const& group) {
    sockaddr_un const final = unixAddress(path);
    if (std::string const obstacle = obstacleAt(path); !obstacle.empty())
        throw std::runtime_error(obstacle);
    if (isServed(final))
        throw std::runtime_error("--http-socket: another process listens at " + path +
                                 "; stop it, or choose another path");
    // The socket gets its mode and group under another name, and then replaces the old one at once.
    std::string const temporary = path + "~";
    sockaddr_un const address = unixAddress(temporary);
    unlink(temporary.c_str());
    Descriptor made(newSocket(AF_UNIX));
    if (made.get() < 0) fail("--http-socket");
    if (bind(made.get(), reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0)
        fail("--http-socket: " + path);
    struct stat file {};
    giveToGroup(temporary, group);
    if (chmod(temporary.c_str(), kMode) != 0 || listen(made.get(), kBacklog) != 0 ||
        stat(temporary.c_str(), &file) != 0 || rename(temporary.c_str(), path.c_str()) != 0) {
        int const error = errno;
        unlink(temporary.c_str());
        errno = error;
        fail("--http-socket: " + path);
    }
    ListeningSocket listening;
    listening.m_descriptor = made.take();
    listening.m_path = path;
    listening.m_device = file.st_dev;
    listening.m_inode = file.st_ino;
    return listening;
}

ListeningSocket ListeningSocket::tcpAt(std::string const& address) {
    HostAndPort const place = parseHostAndPort(address);
    Addresses const found = resolve(place, address);
    Descriptor made(newSocket(found->ai_family));
    if (made.get() < 0) fail("--http " + address);
    int const on = 1;
    setsockopt(made.get(), SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
    if (bind(made.get(), found->ai_addr, found->ai_addrlen) != 0 ||
        listen(made.get(), kBacklog) != 0)
        fail("--http: cannot listen on " + address);
    ListeningSocket listening;
    listening.m_descriptor = made.take();
    listening.m_isRemote = !isLoopback(*found->ai_addr);
    listening.m_host = place.host;
    listening.m_port = place.port;
    return listening;
}

ListeningSocket::ListeningSocket(ListeningSocket&& other) noexcept
    : m_descriptor(std::exchange(other.m_descriptor, -1)),
      m_isRemote(other.m_isRemote),
      m_host(std::move(other.m_host)),
      m_port(std::move(other.m_port)),
      m_path(std::move(other.m_path)),
      m_device(other.m_device),
      m_inode(other.m_inode) {}

ListeningSocket::~ListeningSocket() {
    if (m_descriptor < 0) return;
    close(m_descriptor);
    struct stat file {};
    if (isUnix() && lstat(m_path.c_str(), &file) == 0 && file.st_dev == m_device &&
        file.st_ino == m_inode)
        unlink(m_path.c_str());
}

std::string ListeningSocket::place() const {
    if (isUnix()) return "on " + m_path;
    bool const isSix = m_host.find(':') != std::string::npos;
    return "on http://" + (isSix ? '[' + m_host + ']' : m_host) + ':' + m_port + '/';
}

HostAndPort parseHostAndPort(std::string const& text) {
    std::size_t const colon = text.rfind(':');
    std::string host = colon == std::string::npos ? kDefaultHost : text.substr(0, colon);
    std::string port = colon == std::string::npos ? text : text.substr(colon + 1);
    bool const isNumber = !port.empty() && port.size() <= 5 &&
                          std::ranges::all_of(port, [](char c) { return c >= '0' && c <= '9'; });
    if (!isNumber || std::stoi(port) < 1 || std::stoi(port) > 65535) return {};
    if (host.starts_with('[') && host.ends_with(']'))
        host = host.substr(1, host.size() - 2);
    else if (host.find(':') != std::string::npos)
        return {}; // an IPv6 address without brackets
    return {std::move(host), std::move(port)};
}

std::string checkUnixSocket(std::string const& path) {
    try {
        unixAddress(path + "~");
    } catch (std::runtime_error const& error) {
        return error.what();
    }
    auto const folder = std::filesystem::absolute(path).parent_path();
    if (access(folder.c_str(), W_OK | X_OK) != 0)
        return "--http-socket: " + folder.string() + ": " + std::strerror(errno);
    return obstacleAt(path);
}

std::string checkTcpAddress(std::string const& address, bool hasToken) {
    try {
        Addresses const found = resolve(parseHostAndPort(address), address);
        Descriptor const made(newSocket(found->ai_family));
        int const on = 1;
        setsockopt(made.get(), SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
        if (bind(made.get(), found->ai_addr, found->ai_addrlen) != 0 && errno != EADDRINUSE)
            fail("--http: cannot listen on " + address);
        if (!isLoopback(*found->ai_addr) && !hasToken)
            return "--http: other hosts can reach " + address +
                   "; name a file with a token by --http-token-file";
    } catch (std::runtime_error const& error) {
        return error.what();
    }
    return {};
}

std::string readToken(std::string const& file) {
    constexpr std::size_t kShortest = 16;
    constexpr std::size_t kLongest = 512;
    struct stat found {};
    if (stat(file.c_str(), &found) != 0) fail("--http-token-file: " + file);
    if ((found.st_mode & S_IROTH) != 0)
        throw std::runtime_error("--http-token-file: everybody can read " + file +
                                 "; run: chmod o= " + file);
    std::ifstream input(file);
    std::string token;
    if (!input || !S_ISREG(found.st_mode)) {
        errno = S_ISREG(found.st_mode) ? errno : EINVAL;
        fail("--http-token-file: " + file);
    }
    std::getline(input, token);
    token.erase(0, token.find_first_not_of(" \t"));
    token.erase(token.find_last_not_of(" \t\r") + 1);
    bool const isPlain =
        std::ranges::all_of(token, [](char letter) { return letter > ' ' && letter < 0x7f; });
    if (!isPlain || token.size() < kShortest || token.size() > kLongest)
        throw std::runtime_error("--http-token-file: the first line of " + file +
                                 " is not a token of 16 to 512 letters, digits and marks; make one "
                                 "with: openssl rand -hex 32");
    return token;
}

} // namespace kvloamd
