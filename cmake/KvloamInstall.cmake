# SPDX-License-Identifier: BSD-2-Clause
# What another project needs to build against an installation: headers, the CMake package and the
# pkg-config files. Nothing of it names the prefix, so an installed tree can be moved.
include(CMakePackageConfigHelpers)
include(KvloamHeaders)

set(header_directory ${CMAKE_INSTALL_INCLUDEDIR}/kvloam)
set(package_directory ${CMAKE_INSTALL_LIBDIR}/cmake/kvloam)
set(pkgconfig_directory ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# The board platform's headers are installed whole: a module may need more of them than the library.
kvloam_public_headers(public_headers)
file(GLOB platform_headers CONFIGURE_DEPENDS RELATIVE ${PROJECT_SOURCE_DIR}
    ${PROJECT_SOURCE_DIR}/boardplatform/*.h)
list(APPEND public_headers ${platform_headers})
list(REMOVE_DUPLICATES public_headers)
foreach(header IN LISTS public_headers)
    cmake_path(GET header PARENT_PATH folder)
    install(FILES ${PROJECT_SOURCE_DIR}/${header} DESTINATION ${header_directory}/${folder})
endforeach()
target_include_directories(kvloam_boardplatform INTERFACE $<INSTALL_INTERFACE:${header_directory}>)

set_target_properties(kvloam_boardplatform PROPERTIES EXPORT_NAME boardplatform)
set(exported kvloam kvloam_boardplatform)
if(TARGET kvlsim)
    list(APPEND exported kvlsim)
endif()
install(TARGETS ${exported} EXPORT kvloam LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(EXPORT kvloam NAMESPACE kvloam:: FILE kvloamTargets.cmake DESTINATION ${package_directory})

configure_package_config_file(${CMAKE_CURRENT_LIST_DIR}/kvloamConfig.cmake.in
    ${PROJECT_BINARY_DIR}/kvloamConfig.cmake
    INSTALL_DESTINATION ${package_directory}
    NO_SET_AND_CHECK_MACRO)
# Before 1.0 every minor version may break what the one before promised.
write_basic_package_version_file(${PROJECT_BINARY_DIR}/kvloamConfigVersion.cmake
    COMPATIBILITY SameMinorVersion)
install(FILES
    ${PROJECT_BINARY_DIR}/kvloamConfig.cmake
    ${PROJECT_BINARY_DIR}/kvloamConfigVersion.cmake
    DESTINATION ${package_directory})

# The way from the directory of the .pc files to the prefix.
file(RELATIVE_PATH to_prefix
    ${CMAKE_INSTALL_PREFIX}/${pkgconfig_directory} ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" to_prefix "${to_prefix}")
set(pc_files kvloam)
if(TARGET kvlsim)
    list(APPEND pc_files kvlsim)
endif()
foreach(file IN LISTS pc_files)
    configure_file(${CMAKE_CURRENT_LIST_DIR}/${file}.pc.in ${PROJECT_BINARY_DIR}/${file}.pc @ONLY)
    install(FILES ${PROJECT_BINARY_DIR}/${file}.pc DESTINATION ${pkgconfig_directory})
endforeach()
