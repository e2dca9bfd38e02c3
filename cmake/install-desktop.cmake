# Runs at install time, from the rules in install.cmake, for the parts of an
# install that plain install() rules cannot do: a file copied only when
# absent, relative symlinks, a desktop entry that names the prefix chosen at
# install time, and the drawn icons renamed into the icon theme's folders.
#
# Expects QUILLANE_BUILT_DB, QUILLANE_SHIPPED_DB, QUILLANE_INSTALL_FOLDER, QUILLANE_PROGRAMS,
# QUILLANE_ARTWORK_DIR and QUILLANE_DESKTOP_TEMPLATE.

set(quillane_root "$ENV{DESTDIR}${CMAKE_INSTALL_PREFIX}")
set(quillane_folder "${quillane_root}/${QUILLANE_INSTALL_FOLDER}")

# The names database: the user's own list once installed. A package gets
# the lists as shipped; each user's names go to a copy of their own.
set(quillane_db "${quillane_folder}/names.mdb")
if(DEFINED ENV{QUILLANE_PACKAGING})
    file(MAKE_DIRECTORY "${quillane_folder}")
    file(COPY_FILE "${QUILLANE_SHIPPED_DB}" "${quillane_db}")
    message(STATUS "Installing: ${quillane_db} (the lists as shipped)")
    list(APPEND CMAKE_INSTALL_MANIFEST_FILES "${quillane_db}")
elseif(EXISTS "${quillane_db}")
    message(STATUS "Keeping: ${quillane_db} (it holds your own names and is never replaced)")
elseif(NOT EXISTS "${QUILLANE_BUILT_DB}")
    message(FATAL_ERROR "${QUILLANE_BUILT_DB} is missing: build Quillane before installing it.")
else()
    file(MAKE_DIRECTORY "${quillane_folder}")
    file(COPY_FILE "${QUILLANE_BUILT_DB}" "${quillane_db}")
    message(STATUS "Installing: ${quillane_db} (only because there was none; "
                   "later installs keep it)")
endif()

# bin/<program> -> ../lib/quillane/<program>, so the prefix can be moved.
file(MAKE_DIRECTORY "${quillane_root}/bin")
foreach(program IN LISTS QUILLANE_PROGRAMS)
    set(link "${quillane_root}/bin/${program}")
    file(REMOVE "${link}")
    file(CREATE_LINK "../${QUILLANE_INSTALL_FOLDER}/${program}" "${link}" SYMBOLIC)
    message(STATUS "Linking: ${link} -> ../${QUILLANE_INSTALL_FOLDER}/${program}")
    list(APPEND CMAKE_INSTALL_MANIFEST_FILES "${link}")
endforeach()

# The menu entry starts the program by its absolute path, without DESTDIR:
# that is where it will be when the staged files are in place. A path with
# spaces or the characters the entry format reserves is quoted and escaped
# by its rules (backslashes double once for the quoting and once more for
# the string value; a percent sign doubles).
set(exec "${CMAKE_INSTALL_PREFIX}/bin/quillane")
string(REPLACE "%" "%%" exec "${exec}")
if(exec MATCHES "[ \t\n\"'\\\\><~|&;$*?#()`]")
    string(REPLACE "\\" "\\\\\\\\" exec "${exec}")
    string(REPLACE "\"" "\\\\\"" exec "${exec}")
    string(REPLACE "`" "\\\\`" exec "${exec}")
    string(REPLACE "$" "\\\\$" exec "${exec}")
    set(exec "\"${exec}\"")
endif()
set(QUILLANE_EXEC "${exec}")
file(READ "${QUILLANE_DESKTOP_TEMPLATE}" template)
string(CONFIGURE "${template}" wanted @ONLY)
set(entry "${quillane_root}/share/applications/quillane.desktop")
set(present "")
if(EXISTS "${entry}")
    file(READ "${entry}" present)
endif()
if(present STREQUAL wanted)
    message(STATUS "Up-to-date: ${entry}")
else()
    file(WRITE "${entry}" "${wanted}")
    message(STATUS "Installing: ${entry}")
endif()
list(APPEND CMAKE_INSTALL_MANIFEST_FILES "${entry}")

# quillane-<size>.png -> share/icons/hicolor/<size>x<size>/apps/quillane.png
file(GLOB icons "${QUILLANE_ARTWORK_DIR}/quillane-*.png")
if(NOT icons)
    message(FATAL_ERROR "No icons in ${QUILLANE_ARTWORK_DIR}: build Quillane before installing it.")
endif()
foreach(icon IN LISTS icons)
    get_filename_component(name "${icon}" NAME)
    if(name MATCHES "^quillane-([0-9]+)\\.png$")
        set(size "${CMAKE_MATCH_1}")
        file(INSTALL "${icon}"
             DESTINATION "${CMAKE_INSTALL_PREFIX}/share/icons/hicolor/${size}x${size}/apps"
             RENAME quillane.png)
    endif()
endforeach()
