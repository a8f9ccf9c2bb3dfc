// SPDX-License-Identifier: BSD-2-Clause
// A file in memory with identifier lists, of which processes map copies.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <functional>
#include <mutex>

namespace KVL {

/// Where lists are in a file, and by what the file is known again.
struct ListPlace {
    int file = -1; ///< negative: the system refused
    dev_t device = 0;
    ino_t inode = 0;
    off_t offset = 0;
    std::size_t size = 0;
};

/// A `ListFile` is a file in memory to which blocks of lists are appended. A block is mapped as
/// often as needed; each mapping is a private copy, which needs memory for what is changed in it
/// only. Thread-safe.
class ListFile {
  public:
    /// The process's file. Never destroyed.
    static ListFile& instance();

    /// Appends a block of `size` bytes, which `construct` fills; it must not throw.
    ListPlace append(std::size_t size, std::function<void(void*)> const& construct);
    /// Maps one more copy of a block. Null where the system refuses.
    static void* map(ListPlace const& place);

  private:
    bool open();

    std::mutex m_mutex;
    ListPlace m_end;      ///< where the next block goes
    pid_t m_process = -1; ///< which made the file; a child makes its own
};

} // namespace KVL
