# SPDX-License-Identifier: BSD-2-Clause
# yaml-cpp of a 32-bit build: Debian's packages of its headers for 64 and 32 bits exclude each other,
# so the headers are those of the one and the library that of the other.
find_library(KVLOAM_YAML_CPP_ILP32 libyaml-cpp.so.0.7 PATHS /usr/lib/i386-linux-gnu REQUIRED
    NO_DEFAULT_PATH)
add_library(yaml-cpp SHARED IMPORTED)
set_target_properties(yaml-cpp PROPERTIES IMPORTED_LOCATION ${KVLOAM_YAML_CPP_ILP32})
