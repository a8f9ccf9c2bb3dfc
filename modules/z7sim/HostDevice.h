// SPDX-License-Identifier: BSD-2-Clause
// A network device of this host, as the kernel describes it at present.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

/// A `HostDevice` reads the files in which the kernel describes a network device. These reads do
/// not block. A file that is missing or cannot be read yields nothing.
class HostDevice {
  public:
    /// Whether `name` is valid for a network device: 1 to 15 characters, no '/', and neither "."
    /// nor
    /// "..". Only such a name may become part of a path.
    static bool isName(std::string const& name);

    /// Requires: `isName(name)`. The device need not exist. `directory`: where the kernel lists
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
