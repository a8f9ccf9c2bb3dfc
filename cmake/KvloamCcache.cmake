# SPDX-License-Identifier: BSD-2-Clause
# Compiles through ccache where it is installed, unless another compiler launcher is set.
option(KVLOAM_CCACHE "Compile through ccache where it is installed" ON)
if(NOT KVLOAM_CCACHE OR NOT PROJECT_IS_TOP_LEVEL OR CMAKE_CXX_COMPILER_LAUNCHER)
    return()
endif()
find_program(KVLOAM_CCACHE_PROGRAM ccache)
mark_as_advanced(KVLOAM_CCACHE_PROGRAM)
if(KVLOAM_CCACHE_PROGRAM)
    # Otherwise ccache compiles every file that uses precompiled headers itself.
    set(CMAKE_CXX_COMPILER_LAUNCHER
        env CCACHE_SLOPPINESS=pch_defines,time_macros ${KVLOAM_CCACHE_PROGRAM})
endif()
