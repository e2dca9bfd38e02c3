# Installing for the desktop: cmake --install build --prefix ~/.local
#
#   PREFIX/lib/quillane/     the program folder: the executables and the files
#                            they look for beside themselves
#   PREFIX/bin/              relative symlinks into the program folder
#   PREFIX/share/applications/quillane.desktop
#   PREFIX/share/icons/hicolor/NxN/apps/quillane.png
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

install(CODE "
    set(QUILLANE_BUILT_DB \"${QUILLANE_PROGRAM_DIR}/names.mdb\")
    set(QUILLANE_INSTALL_FOLDER \"${QUILLANE_INSTALL_FOLDER}\")
    set(QUILLANE_PROGRAMS \"${quillane_programs}\")
    set(QUILLANE_ARTWORK_DIR \"${CMAKE_BINARY_DIR}/src/artwork\")
    set(QUILLANE_DESKTOP_TEMPLATE \"${PROJECT_SOURCE_DIR}/data/quillane.desktop.in\")
    include(\"${CMAKE_CURRENT_LIST_DIR}/install-desktop.cmake\")
")
