# SPDX-License-Identifier: BSD-2-Clause
# Test programs, and what makes them quick to build.
find_package(GTest REQUIRED)
include(GoogleTest)

set(KVLOAM_TEST_DEBUG 1 CACHE STRING
    "Level of debug information in tests: 1 is enough for backtraces, 2 shows variables in a debugger")

# What every test program is compiled with.
function(kvloam_test_options target)
    kvloam_target(${target})
    target_compile_options(${target} PRIVATE $<$<CONFIG:Debug>:-g${KVLOAM_TEST_DEBUG}>)
    target_link_libraries(${target} PRIVATE GTest::gtest GTest::gmock)
endfunction()

# The headers that most tests include. Test programs are compiled with -fPIE.
find_package(nlohmann_json REQUIRED)
kvloam_precompiled(kvloam_test_headers
    PRECOMPILE <gmock/gmock.h> <gtest/gtest.h> <nlohmann/json.hpp> ${KVLOAM_COMMON_HEADERS}
    LIBRARIES GTest::gtest GTest::gmock nlohmann_json::nlohmann_json)
set_target_properties(kvloam_test_headers PROPERTIES POSITION_INDEPENDENT_CODE OFF)
target_compile_options(kvloam_test_headers PRIVATE
    -fPIE $<$<CONFIG:Debug>:-g${KVLOAM_TEST_DEBUG}>)

# kvloam_test(<name> [TOGETHER] SOURCES <files> [LIBRARIES <libs>] [LABELS <labels>]
#     [ENVIRONMENT <VAR=value>]): a GoogleTest program; every test case becomes one ctest test. With
# TOGETHER, up to five files are compiled as one, which takes half the time; names in their unnamed
# namespaces must then differ.
function(kvloam_test name)
    cmake_parse_arguments(arg "TOGETHER" "" "SOURCES;LIBRARIES;LABELS;ENVIRONMENT" ${ARGN})
    add_executable(${name} ${arg_SOURCES})
    if(arg_TOGETHER)
        set_target_properties(${name} PROPERTIES UNITY_BUILD ON UNITY_BUILD_BATCH_SIZE 5)
    endif()
    kvloam_test_options(${name})
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/tests)
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} GTest::gtest_main)
    kvloam_use_precompiled(${name} kvloam_test_headers)
    set(properties TIMEOUT 300)
    if(arg_LABELS)
        list(APPEND properties LABELS "${arg_LABELS}")
    endif()
    # What waits for threads and programs starts first, so that short tests fill the time.
    if("e2e" IN_LIST arg_LABELS)
        list(APPEND properties COST 20)
    elseif("threaded" IN_LIST arg_LABELS)
        list(APPEND properties COST 10)
    endif()
    list(APPEND arg_ENVIRONMENT
        "TSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/tests/sanitizers/tsan.supp")
    list(APPEND properties ENVIRONMENT "${arg_ENVIRONMENT}")
    gtest_discover_tests(${name} DISCOVERY_TIMEOUT 60 PROPERTIES ${properties})
endfunction()
