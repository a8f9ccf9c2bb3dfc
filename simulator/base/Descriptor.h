// SPDX-License-Identifier: BSD-2-Clause
// A file descriptor with an owner.
#pragma once

#include <utility>

namespace kvlsim {

/// A `Descriptor` owns a file descriptor and closes it when it is destroyed.
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

} // namespace kvlsim
