# SPDX-License-Identifier: BSD-2-Clause
# Completion for shells, printed by the program itself. Debian's zsh looks for the script of a package in
# share/zsh/vendor-completions.
set(KVLOAM_ZSH_COMPLETIONS ${CMAKE_INSTALL_DATADIR}/zsh/site-functions CACHE STRING
    "Where the completion scripts for zsh are installed")

# kvloam_completions(<target> <program>): makes and installs the scripts of a program. A build for another
# machine cannot run it.
function(kvloam_completions target program)
    if(CMAKE_CROSSCOMPILING AND NOT CMAKE_CROSSCOMPILING_EMULATOR)
        return()
    endif()
    set(completions ${CMAKE_CURRENT_BINARY_DIR}/completions)
    file(MAKE_DIRECTORY ${completions})
    set(scripts "")
    foreach(shell bash zsh fish)
        add_custom_command(OUTPUT ${completions}/${program}.${shell}
            COMMAND ${target} completion ${shell} > ${completions}/${program}.${shell}
            DEPENDS ${target}
            VERBATIM)
        list(APPEND scripts ${completions}/${program}.${shell})
    endforeach()
    add_custom_target(${program}_completions ALL DEPENDS ${scripts})
    install(FILES ${completions}/${program}.bash RENAME ${program}
        DESTINATION ${CMAKE_INSTALL_DATADIR}/bash-completion/completions)
    install(FILES ${completions}/${program}.zsh RENAME _${program}
        DESTINATION ${KVLOAM_ZSH_COMPLETIONS})
    install(FILES ${completions}/${program}.fish
        DESTINATION ${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d)
endfunction()
