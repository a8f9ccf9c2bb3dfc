# SPDX-License-Identifier: BSD-2-Clause
# Which headers are public: kvloam.h and those that it brings along.

# kvloam_public_headers(<variable>): their paths, from the top of the source tree.
function(kvloam_public_headers variable)
    set(headers "")
    set(pending kvloam.h)
    while(pending)
        list(POP_FRONT pending header)
        list(APPEND headers ${header})
        # What a header includes may change the list.
        set_property(DIRECTORY ${PROJECT_SOURCE_DIR} APPEND PROPERTY
            CMAKE_CONFIGURE_DEPENDS ${PROJECT_SOURCE_DIR}/${header})
        file(STRINGS ${PROJECT_SOURCE_DIR}/${header} lines REGEX "^#include \"")
        foreach(line IN LISTS lines)
            string(REGEX REPLACE "^#include \"([^\"]+)\".*" "\\1" included "${line}")
            if(NOT included IN_LIST headers AND NOT included IN_LIST pending)
                list(APPEND pending ${included})
            endif()
        endforeach()
    endwhile()
    list(SORT headers)
    set(${variable} ${headers} PARENT_SCOPE)
endfunction()
