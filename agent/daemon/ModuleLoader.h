// SPDX-License-Identifier: BSD-2-Clause
// Loads board modules.
#pragma once

#include <stdexcept>
#include <string>

#include "board/BoardModule.h"

namespace kvloamd {

/// One line: which module, what is wrong with it, what to do.
class ModuleError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// A board module, loaded. It stays loaded until the process ends: its boards, and the threads
/// that its factory started, live in its code.
class LoadedModule {
  public:
    /// Loads `<name>kvl.so` from `directory`. Throws ModuleError.
    LoadedModule(std::string name, std::string const& directory);

    /// Has the module make its factory. Throws ModuleError.
    ReferenceCounter<BoardFactory> createFactory() const;

    std::string const& name() const { return m_name; }
    std::string const& path() const { return m_path; }

  private:
    std::string m_name;
    std::string m_path;
    KVLCreateBoardFactory* m_createFactory = nullptr;
};

} // namespace kvloamd
