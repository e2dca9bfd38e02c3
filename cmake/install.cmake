# Installing for the desktop: cmake --install build --prefix ~/.local
#
#   PREFIX/lib/quillane/     the program folder: the executables and the files
#                            they look for beside themselves
#   PREFIX/bin/              relative symlinks into the program folder
#   PREFIX/share/applications/quillane.desktop
#   PREFIX/share/icons/hicolor/NxN/apps/quillane.png
#   PREFIX/share/metainfo/org.quillane.Quillane.metainfo.xml
#   PREFIX/share/man/man1/quillane.1.gz, quillane-cli.1.gz
#   PREFIX/share/bash-completion/completions/quillane-cli
#   PREFIX/share/doc/quillane/changelog.gz, copyright
#
# The program finds its files through its own resolved path, so starting it
# through the symlink in bin still finds the program folder.
#
# names.mdb holds the user's own names: it is copied only when the program
# folder has none, so installing again updates everything else and keeps the
# list as it is. It is kept out of install_manifest.txt for the same reason:
# removing what the manifest lists must not take the list with it.

set(QUILLANE_INSTALL_FOLDER lib/quillane)

set(quillane_programs quillane)
if(TARGET quillane-cli)
    list(APPEND quillane_programs quillane-cli)
endif()

install(TARGETS ${quillane_programs} RUNTIME DESTINATION ${QUILLANE_INSTALL_FOLDER})
install(FILES ${QUILLANE_PROGRAM_DIR}/HAND-M.CUR DESTINATION ${QUILLANE_INSTALL_FOLDER})
install(FILES ${QUILLANE_PROGRAM_DIR}/x/o.cjs DESTINATION ${QUILLANE_INSTALL_FOLDER}/x)
install(DIRECTORY ${QUILLANE_PROGRAM_DIR}/Splash DESTINATION ${QUILLANE_INSTALL_FOLDER})

# The manual pages are written from the programs' --help at build time.
set(quillane_man ${CMAKE_BINARY_DIR}/man)
if(TARGET quillane-cli)
    add_custom_command(
        OUTPUT ${quillane_man}/quillane.1.gz ${quillane_man}/quillane-cli.1.gz
        COMMAND ${CMAKE_COMMAND} -DQUILLANE=$<TARGET_FILE:quillane> -DCLI=$<TARGET_FILE:quillane-cli>
                -DOUT=${quillane_man} -DVERSION=${PROJECT_VERSION}
                -P ${CMAKE_CURRENT_LIST_DIR}/manpages.cmake
        DEPENDS quillane quillane-cli ${CMAKE_CURRENT_LIST_DIR}/manpages.cmake
        COMMENT "Writing the manual pages from --help"
        VERBATIM)
    add_custom_target(manpages ALL DEPENDS ${quillane_man}/quillane.1.gz ${quillane_man}/quillane-cli.1.gz)
    install(FILES ${quillane_man}/quillane.1.gz ${quillane_man}/quillane-cli.1.gz
            DESTINATION share/man/man1)
    install(FILES ${PROJECT_SOURCE_DIR}/data/package/quillane-cli.bash-completion
            DESTINATION share/bash-completion/completions RENAME quillane-cli)
endif()

configure_file(${PROJECT_SOURCE_DIR}/data/package/org.quillane.Quillane.metainfo.xml
               ${CMAKE_BINARY_DIR}/package/org.quillane.Quillane.metainfo.xml @ONLY)
install(FILES ${CMAKE_BINARY_DIR}/package/org.quillane.Quillane.metainfo.xml DESTINATION share/metainfo)
configure_file(${PROJECT_SOURCE_DIR}/data/package/changelog.in ${CMAKE_BINARY_DIR}/package/changelog @ONLY)
add_custom_command(
    OUTPUT ${CMAKE_BINARY_DIR}/package/changelog.gz
    COMMAND gzip -9nkf ${CMAKE_BINARY_DIR}/package/changelog
    DEPENDS ${PROJECT_SOURCE_DIR}/data/package/changelog.in
    VERBATIM)
add_custom_target(changelog ALL DEPENDS ${CMAKE_BINARY_DIR}/package/changelog.gz)
install(FILES ${CMAKE_BINARY_DIR}/package/changelog.gz ${PROJECT_SOURCE_DIR}/data/package/copyright
        DESTINATION share/doc/quillane)

install(CODE "
    set(QUILLANE_BUILT_DB \"${QUILLANE_PROGRAM_DIR}/names.mdb\")
    set(QUILLANE_SHIPPED_DB \"${QUILLANE_SHIPPED_DB}\")
    set(QUILLANE_INSTALL_FOLDER \"${QUILLANE_INSTALL_FOLDER}\")
    set(QUILLANE_PROGRAMS \"${quillane_programs}\")
    set(QUILLANE_ARTWORK_DIR \"${CMAKE_BINARY_DIR}/src/artwork\")
    set(QUILLANE_DESKTOP_TEMPLATE \"${PROJECT_SOURCE_DIR}/data/quillane.desktop.in\")
    include(\"${CMAKE_CURRENT_LIST_DIR}/install-desktop.cmake\")
")
