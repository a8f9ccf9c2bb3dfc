// SPDX-License-Identifier: BSD-2-Clause
// A network device of this host, as the kernel shows it at the time of the question.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// Reads the files that the kernel keeps for every device. Such a read waits for no other process.
/// A file that is not there, or cannot be read, answers nothing.
class HostDevice {
  public:
    /// Whether it can be the name of a network device: 1 to 15 characters, no '/', and neither "."
    /// nor "..". Nothing else may become part of a path.
    static bool isName(std::string const& name);

    /// Requires: `isName(name)`. The device need not be there. `directory`: where the kernel has
    /// its devices.
    explicit HostDevice(std::string name, std::string const& directory = "/sys/class/net");

    std::string const& name() const { return m_name; }
    /// The first line of a file, such as "mtu" or "statistics/rx_bytes".
    std::optional<std::string> text(char const* file) const;
    /// A whole number, in decimal.
    std::optional<std::int64_t> number(char const* file) const;
    /// The kernel's flags of the device, IFF_UP and others.
    std::optional<unsigned> flags() const;

  private:
    std::string m_name;
    std::string m_path;
};
