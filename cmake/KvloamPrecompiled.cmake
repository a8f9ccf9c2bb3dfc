# SPDX-License-Identifier: BSD-2-Clause
# Precompiled headers, which halve the time that a build takes. A source still includes what it uses: the
# presets `release` and `ilp32` compile without them.

# kvloam_precompiled(<name> [PRECOMPILE <headers>] [LIBRARIES <libs>]): headers that are compiled once,
# for the targets that use them.
function(kvloam_precompiled name)
    cmake_parse_arguments(arg "" "" "PRECOMPILE;LIBRARIES" ${ARGN})
    file(CONFIGURE OUTPUT ${CMAKE_CURRENT_BINARY_DIR}/${name}.cpp CONTENT "")
    add_library(${name} OBJECT ${CMAKE_CURRENT_BINARY_DIR}/${name}.cpp)
    kvloam_target(${name})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES})
    # Or a cached object would not be found after the headers are compiled again.
    target_compile_options(${name} PRIVATE
        $<$<CXX_COMPILER_ID:Clang>:SHELL:-Xclang -fno-pch-timestamp>)
    target_precompile_headers(${name} PRIVATE ${arg_PRECOMPILE})
endfunction()

# kvloam_use_precompiled(<target> <name>): compiles the target's sources with these headers.
function(kvloam_use_precompiled target name)
    target_precompile_headers(${target} REUSE_FROM ${name})
endfunction()

# What most sources of the agent, the simulator and the board modules include.
set(KVLOAM_COMMON_HEADERS
    <algorithm> <array> <atomic> <chrono> <condition_variable> <filesystem> <fstream> <functional>
    <map> <memory> <mutex> <optional> <set> <sstream> <string> <thread> <vector>)
