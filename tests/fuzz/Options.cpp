// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the agent's command line and configuration file: the input is arguments, each ended by a
// line end, an empty line, and the file.
#include "agent/daemon/Options.h"

#include <string>
#include <variant>
#include <vector>

#include "agent/fronts/agentx/AgentxAddress.h"
#include "tests/fuzz/DatabaseFile.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"

namespace {

/// Arguments that would read another file than the input's.
bool namesAFile(std::string const& argument) {
    return argument.starts_with("--config");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static fuzz::Folder const folder;
    static std::string const file = folder.file("kvloamd.toml");
    fuzz::FuzzInput input(octets, size);
    std::vector<std::string> arguments{"kvloamd", "--config", file};
    for (std::string argument(input.line('\n')); !argument.empty(); argument = input.line('\n')) {
        kvloamd::parseOid(argument);
        kvloamd::parseAgentxAddress(argument);
        // An argument ends at a zero, as the kernel has it.
        if (!namesAFile(argument)) arguments.emplace_back(argument.c_str());
    }
    fuzz::writeFile(file, std::string(input.rest()));
    std::vector<char const*> pointers;
    pointers.reserve(arguments.size());
    for (std::string const& argument : arguments)
        pointers.push_back(argument.c_str());
    auto const read = kvloamd::parseOptions(static_cast<int>(pointers.size()), pointers.data());
    if (auto const* const exit = std::get_if<kvloamd::Exit>(&read)) {
        fuzz::require(!exit->text.empty(), "an end has a reason");
        fuzz::require(exit->status == 0 || exit->text.find('\n') == std::string::npos,
                      "an error is one line");
        return 0;
    }
    auto const& options = std::get<kvloamd::Options>(read);
    fuzz::require(options.interfaceBase > 0, "no interface has the index 0");
    fuzz::require(options.agentx.empty() || kvloamd::parseAgentxAddress(options.agentx).has_value(),
                  "the master has an address");
    return 0;
}
