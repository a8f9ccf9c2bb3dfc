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
endfunction()

# kvloam_test(<name> SOURCES <files> [LIBRARIES <libs>] [LABELS <labels>] [ENVIRONMENT <VAR=value>]):
# a GoogleTest program; every test case becomes one ctest test.
function(kvloam_test name)
    cmake_parse_arguments(arg "" "" "SOURCES;LIBRARIES;LABELS;ENVIRONMENT" ${ARGN})
    add_executable(${name} ${arg_SOURCES})
    kvloam_target(${name})
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/tests)
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} GTest::gtest GTest::gmock GTest::gtest_main)
    set(properties TIMEOUT 300)
    if(arg_LABELS)
        list(APPEND properties LABELS "${arg_LABELS}")
    endif()
    list(APPEND arg_ENVIRONMENT
        "TSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/tests/sanitizers/tsan.supp")
    list(APPEND properties ENVIRONMENT "${arg_ENVIRONMENT}")
    gtest_discover_tests(${name} DISCOVERY_TIMEOUT 60 PROPERTIES ${properties})
endfunction()
