// SPDX-License-Identifier: BSD-2-Clause
// Descriptors of the control server: the listening socket in the file system, the wake-up.
#include "simulator/control/ControlSocket.h"

#include <fcntl.h>
#include <sys/eventfd.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <stdexcept>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

namespace {

constexpr char const* kInUse = "is in use by another process, choose another path";

[[noreturn]] void fail(std::string const& path, std::string const& why) {
    throw std::runtime_error("control socket " + path + ": " + why +
                             "; the platform goes on without control");
}

[[noreturn]] void failErrno(std::string const& path, char const* what) {
    fail(path, std::string(what) + ": " + std::strerror(errno));
}

sockaddr_un addressOf(std::string const& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path)
        fail(path, "the path has more than " + std::to_string(sizeof address.sun_path - 1) +
                       " bytes, choose a shorter one");
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
    return address;
}

sockaddr const* generic(sockaddr_un const& address) {
    return reinterpret_cast<sockaddr const*>(&address);
}

Descriptor newSocket(std::string const& path) {
    Descriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
    if (socket.get() < 0) failErrno(path, "cannot be made");
    return socket;
}

/// Removes what a process left behind when it was killed; refuses everything else.
void clearPath(std::string const& path, sockaddr_un const& address) {
    struct stat file {};
    if (lstat(path.c_str(), &file) != 0) {
        if (errno == ENOENT) return;
        failErrno(path, "cannot be looked at");
    }
    if (!S_ISSOCK(file.st_mode)) fail(path, "is there and is no socket, choose another path");
    Descriptor const probe = newSocket(path);
    if (connect(probe.get(), generic(address), sizeof address) == 0 || errno != ECONNREFUSED)
        fail(path, kInUse);
    if (unlink(path.c_str()) != 0 && errno != ENOENT)
        failErrno(path, "is stale, cannot be removed");
}

} // namespace

PathLock::PathLock(std::string const& path) : m_file(path + ".lock") {
    addressOf(path); // refuses a path that is too long before a file is made
    struct stat held {};
    struct stat named {};
    do {
        m_lock = Descriptor(
            open(m_file.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, S_IRUSR | S_IWUSR));
        if (m_lock.get() < 0) failErrno(path, "its lock file cannot be opened");
        if (flock(m_lock.get(), LOCK_EX | LOCK_NB) != 0) {
            if (errno == EWOULDBLOCK) fail(path, kInUse);
            failErrno(path, "its lock file cannot be locked");
        }
        // A process that ended in the meantime has removed the file, and the lock is on a file
        // without a name.
    } while (fstat(m_lock.get(), &held) != 0 || stat(m_file.c_str(), &named) != 0 ||
             held.st_ino != named.st_ino || held.st_dev != named.st_dev);
}

PathLock::~PathLock() {
    unlink(m_file.c_str());
}

ListeningSocket::ListeningSocket(std::string path) : m_path(std::move(path)), m_lock(m_path) {
    sockaddr_un const address = addressOf(m_path);
    clearPath(m_path, address);
    m_socket = newSocket(m_path);
    if (bind(m_socket.get(), generic(address), sizeof address) != 0)
        failErrno(m_path, "cannot be bound");
    struct stat file {};
    // No client can connect before listen(), so the mode is set in time.
    if (chmod(m_path.c_str(), S_IRUSR | S_IWUSR) != 0 || stat(m_path.c_str(), &file) != 0 ||
        listen(m_socket.get(), SOMAXCONN) != 0) {
        int const error = errno;
        unlink(m_path.c_str());
        errno = error;
        failErrno(m_path, "cannot be opened");
    }
    m_device = file.st_dev;
    m_inode = file.st_ino;
}

ListeningSocket::~ListeningSocket() {
    struct stat file {};
    if (stat(m_path.c_str(), &file) == 0 && file.st_dev == m_device && file.st_ino == m_inode)
        unlink(m_path.c_str());
}

Descriptor ListeningSocket::accept() const {
    return Descriptor(::accept4(m_socket.get(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
}

WakeUp::WakeUp() : m_event(eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC)) {
    if (m_event.get() < 0)
        throw std::runtime_error(std::string("control: no wake-up descriptor: ") +
                                 std::strerror(errno));
}

void WakeUp::signal() const {
    std::uint64_t const one = 1;
    // Fails only when the counter is full; the poll is then awake already.
    static_cast<void>(write(m_event.get(), &one, sizeof one) == sizeof one);
}

void WakeUp::clear() const {
    std::uint64_t count = 0;
    static_cast<void>(read(m_event.get(), &count, sizeof count) == sizeof count);
}

} // namespace kvlsim
