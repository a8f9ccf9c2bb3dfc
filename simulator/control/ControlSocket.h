// SPDX-License-Identifier: BSD-2-Clause
// Descriptors of the control server: the listening socket in the file system, the wake-up.
#pragma once

#include <sys/types.h>

#include <string>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

/// A lock that one process holds on a path: a file beside it, "path.lock", removed at the end.
class PathLock {
  public:
    /// Throws std::runtime_error when another process holds the lock, or it cannot be made.
    explicit PathLock(std::string const& path);
    ~PathLock();
    PathLock(PathLock const&) = delete;
    PathLock& operator=(PathLock const&) = delete;

  private:
    std::string m_file;
    Descriptor m_lock;
};

/// A listening Unix socket, mode 0600. Its file is removed with it, unless another has replaced it.
class ListeningSocket {
  public:
    /// Replaces the socket of a process that has gone. Throws std::runtime_error when the path is
    /// too long, is no socket, is in use, or cannot be bound.
    explicit ListeningSocket(std::string path);
    ~ListeningSocket();
    ListeningSocket(ListeningSocket const&) = delete;
    ListeningSocket& operator=(ListeningSocket const&) = delete;

    int get() const { return m_socket.get(); }
    std::string const& path() const { return m_path; }
    /// The next client, non-blocking, or a descriptor below 0 with errno.
    Descriptor accept() const;

  private:
    std::string m_path;
    PathLock m_lock; ///< from before the path is looked at until the socket is removed
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
