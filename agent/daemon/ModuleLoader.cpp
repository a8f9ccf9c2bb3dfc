// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ModuleLoader.h"

#include <dlfcn.h>
#include <unistd.h>

#include <exception>
#include <utility>

namespace kvloamd {

LoadedModule::LoadedModule(std::string name, std::string const& directory)
    : m_name(std::move(name)) {
    if (m_name.empty() || m_name.find('/') != std::string::npos)
        throw ModuleError("'" + m_name +
                          "' is not a module name; give the name without a path, as in " +
                          "--module z7sim, and the path with --module-dir");
    m_path = directory + "/" + m_name + "kvl.so";
    if (access(m_path.c_str(), F_OK) != 0)
        throw ModuleError("unknown module '" + m_name + "': there is no " + m_path +
                          "; check the name, or name its directory with --module-dir");
    void* const library = dlopen(m_path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr)
        throw ModuleError("module '" + m_name + "' cannot be loaded: " + dlerror());
    void* const entry = dlsym(library, KVL_BOARD_MODULE_ENTRY_POINT);
    if (entry == nullptr)
        throw ModuleError("module '" + m_name + "' has no entry point " +
                          KVL_BOARD_MODULE_ENTRY_POINT + ": " + m_path + " is not a board module");
    m_createFactory = reinterpret_cast<KVLCreateBoardFactory*>(entry);
}

ReferenceCounter<BoardFactory> LoadedModule::createFactory() const {
    BoardFactory* factory = nullptr;
    try {
        factory = m_createFactory(KVL_BOARD_MODULE_ABI_VERSION);
    } catch (std::exception const& error) {
        throw ModuleError("module '" + m_name + "' failed to start: " + error.what());
    } catch (...) {
        throw ModuleError("module '" + m_name + "' failed to start with an unknown exception");
    }
    if (factory == nullptr)
        throw ModuleError("module '" + m_name + "' refuses version " +
                          std::to_string(KVL_BOARD_MODULE_ABI_VERSION) +
                          " of the module interface; rebuild it for this agent");
    return factory;
}

} // namespace kvloamd
