# Rules of installation that the programs share.
include(GNUInstallDirs)
set(CMAKE_INSTALL_DOCDIR ${CMAKE_INSTALL_DATAROOTDIR}/doc/vibrator-service)

# install_manual(NAME.SECTION): a page of docs/man.
function(install_manual page)
    string(REGEX REPLACE ".*[.]" "" section ${page})
    install(FILES ${PROJECT_SOURCE_DIR}/docs/man/${page}
        DESTINATION ${CMAKE_INSTALL_MANDIR}/man${section})
endfunction()

# install_completions(PROGRAM): what PROGRAM tells shells to complete; it must run on this machine.
function(install_completions program)
    if(CMAKE_CROSSCOMPILING)
        return()
    endif()
    foreach(completion
            bash:share/bash-completion/completions/${program}
            zsh:share/zsh/vendor-completions/_${program}
            fish:share/fish/vendor_completions.d/${program}.fish)
        string(REPLACE ":" ";" completion ${completion})
        list(GET completion 0 shell)
        list(GET completion 1 place)
        set(file ${CMAKE_CURRENT_BINARY_DIR}/${program}.${shell})
        add_custom_command(OUTPUT ${file} DEPENDS ${program}
            COMMAND ${program} completion ${shell} > ${file})
        add_custom_target(complete-${program}-${shell} ALL DEPENDS ${file})
        get_filename_component(directory ${place} DIRECTORY)
        get_filename_component(name ${place} NAME)
        install(FILES ${file} DESTINATION ${directory} RENAME ${name})
    endforeach()
endfunction()
