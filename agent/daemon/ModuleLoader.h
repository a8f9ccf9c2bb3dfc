// SPDX-License-Identifier: BSD-2-Clause
// Loads board modules.
#pragma once

#include <stdexcept>
#include <string>

#include "board/BoardModule.h"

namespace kvloamd {

/// Names the module, the fault and the remedy in one line.
class ModuleError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// A `LoadedModule` is a board module that has been loaded. It stays loaded until the process ends,
/// because its boards and the threads of its factory run its code.
class LoadedModule {
  public:
    /// Loads `<name>kvl.so` from `directory`. Throws ModuleError.
    LoadedModule(std::string name, std::string const& directory);

    /// Creates the factory of the module. Throws ModuleError.
    ReferenceCounter<BoardFactory> createFactory() const;

    std::string const& name() const { return m_name; }
    std::string const& path() const { return m_path; }

  private:
    std::string m_name;
    std::string m_path;
    KVLCreateBoardFactory* m_createFactory = nullptr;
};

} // namespace kvloamd
