# SPDX-License-Identifier: BSD-2-Clause
# What every target of the project shares: language level, warnings, sanitizers, visibility.

# kvloam_target(<target>): properties of a target of our own code.
function(kvloam_target target)
    target_compile_features(${target} PUBLIC cxx_std_20)
    set_target_properties(${target} PROPERTIES
        CXX_EXTENSIONS OFF
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON
        POSITION_INDEPENDENT_CODE ON
        LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib
        RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin)
    target_compile_options(${target} PRIVATE
        -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion
        -Wnon-virtual-dtor -Woverloaded-virtual
        $<$<CXX_COMPILER_ID:GNU>:-Wsuggest-override>
        # g++ 12 takes "text" + std::string for overlapping copies when it optimises.
        $<$<AND:$<CXX_COMPILER_ID:GNU>,$<VERSION_LESS:$<CXX_COMPILER_VERSION>,13>>:-Wno-restrict>
        $<$<CXX_COMPILER_ID:Clang>:-Winconsistent-missing-override -Wsuggest-override>
        $<$<BOOL:${KVLOAM_WERROR}>:-Werror>)
    if(CMAKE_SIZEOF_VOID_P EQUAL 4)
        # Or stat() fails for a file with a large inode number.
        target_compile_definitions(${target} PRIVATE _FILE_OFFSET_BITS=64)
    endif()
    if(KVLOAM_SANITIZE)
        target_compile_options(${target} PRIVATE
            -fsanitize=${KVLOAM_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
        target_link_options(${target} PRIVATE -fsanitize=${KVLOAM_SANITIZE})
    endif()
    if(KVLOAM_FUZZ)
        target_compile_options(${target} PRIVATE -fsanitize=fuzzer-no-link)
    endif()
    if(KVLOAM_COVERAGE)
        target_compile_options(${target} PRIVATE --coverage -fprofile-update=atomic)
        target_link_options(${target} PRIVATE --coverage)
    endif()
endfunction()
