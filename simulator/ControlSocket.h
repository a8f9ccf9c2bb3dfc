// SPDX-License-Identifier: BSD-2-Clause
// Descriptors of the control server: the listening socket in the file system, the wake-up.
#pragma once

#include <sys/types.h>

#include <string>
#include <utility>

namespace kvlsim {

/// A file descriptor, closed with its owner.
class Descriptor {
  public:
    explicit Descriptor(int fd = -1) : m_fd(fd) {}
    Descriptor(Descriptor&& other) noexcept : m_fd(std::exchange(other.m_fd, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept {
        std::swap(m_fd, other.m_fd);
        return *this;
    }
    Descriptor(Descriptor const&) = delete;
    Descriptor& operator=(Descriptor const&) = delete;
    ~Descriptor();

    int get() const { return m_fd; }

  private:
    int m_fd;
};

/// A listening Unix socket, mode 0600. Its file goes with it, unless another has taken the place.
class ListeningSocket {
  public:
    /// Replaces the socket of a process that has gone. Throws std::runtime_error when the path is
    /// too long, is no socket, is in use, or cannot be bound.
    explicit ListeningSocket(std::string path);
    ~ListeningSocket();
    ListeningSocket(ListeningSocket const&) = delete;
    ListeningSocket& operator=(ListeningSocket const&) = delete;

    int get() const { return m_socket.get(); }
    /// The next client, non-blocking, or a descriptor below 0 with errno.
    Descriptor accept() const;

  private:
    std::string m_path;
    Descriptor m_socket;
    dev_t m_device = 0;
    ino_t m_inode = 0;
};

/// Wakes a poll() from another thread.
class WakeUp {
  public:
    WakeUp(); ///< throws std::runtime_error
    int get() const { return m_event.get(); }
    void signal() const;
    void clear() const;

  private:
    Descriptor m_event;
};

} // namespace kvlsim
