// SPDX-License-Identifier: BSD-2-Clause
// Descriptors of the control server: the listening socket in the file system, the wake-up.
#pragma once

#include <sys/types.h>

#include <string>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

/// A `PathLock` is a lock that one process holds on a path: a locked file beside it, "path.lock",
/// which is removed at the end.
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

/// A `ListeningSocket` is a listening Unix socket with mode 0600. It removes its file when it is
/// destroyed, unless another process has replaced the file.
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

/// A `WakeUp` is a descriptor through which another thread ends a poll().
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
