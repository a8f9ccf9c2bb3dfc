// SPDX-License-Identifier: BSD-2-Clause
// A directory that goes with the test.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <string>

namespace support {

class TemporaryDirectory {
  public:
    TemporaryDirectory() : m_path("/tmp/kvlsim-test-XXXXXX") {
        if (mkdtemp(m_path.data()) == nullptr) throw std::runtime_error("no temporary directory");
    }
    ~TemporaryDirectory() { std::filesystem::remove_all(m_path); }
    TemporaryDirectory(TemporaryDirectory const&) = delete;
    TemporaryDirectory& operator=(TemporaryDirectory const&) = delete;

    std::string file(char const* name) const { return m_path + "/" + name; }

  private:
    std::string m_path;
};

} // namespace support
