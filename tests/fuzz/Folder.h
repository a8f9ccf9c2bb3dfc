// SPDX-License-Identifier: BSD-2-Clause
// A folder for the files of a fuzz target.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <string>

namespace fuzz {

/// A `Folder` is a folder that is removed with its object, in memory where the host has such a file
/// system: no input waits for a disk.
class Folder {
  public:
    Folder() {
        std::error_code ignored;
        m_path = std::filesystem::is_directory("/dev/shm", ignored)
                     ? "/dev/shm"
                     : std::filesystem::temp_directory_path().string();
        m_path += "/kvloam-fuzz-XXXXXX";
        if (mkdtemp(m_path.data()) == nullptr) throw std::runtime_error("no folder at " + m_path);
    }
    ~Folder() {
        std::error_code ignored;
        std::filesystem::remove_all(m_path, ignored);
    }
    Folder(Folder const&) = delete;
    Folder& operator=(Folder const&) = delete;

    std::string const& path() const { return m_path; }
    std::string file(std::string const& name) const { return m_path + "/" + name; }

  private:
    std::string m_path;
};

} // namespace fuzz
