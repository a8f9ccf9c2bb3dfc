// SPDX-License-Identifier: BSD-2-Clause
// The directory in which the agent keeps its state.
#pragma once

#include <string>

namespace kvloamd {

/// A `StateDirectory` is the persistent directory, reserved for this process while the object
/// exists.
///
/// A user who can write to it decides what the agent serves and to whom, so it and its
/// files must belong to the agent's user or to root. A process reserves the directory by a lock on
/// its file `kvloamd.lock`, which contains the process id. The kernel releases the lock when the
/// process ends, however it ends.
class StateDirectory {
  public:
    /// Creates a missing directory for its owner only. Throws `std::runtime_error`, whose text
    /// says what to do, if another agent uses the directory, if the directory or one of the
    /// agent's files in it is a symbolic link or belongs to another user, or if every user can
    /// write to the directory. A directory that cannot be written is only logged: state is then
    /// not kept. An empty `path` is no directory.
    explicit StateDirectory(std::string const& path);
    /// Makes the same checks without creating or reserving anything; `path` may be in use.
    static void check(std::string const& path);
    ~StateDirectory();
    StateDirectory(StateDirectory const&) = delete;
    StateDirectory& operator=(StateDirectory const&) = delete;

  private:
    void lock(std::string const& file);

    int m_lock = -1; ///< the descriptor of the locked file; -1: none
};

} // namespace kvloamd
