# Installs the built program into prefixes of its own under WORK and checks
# what a user finds there: the program folder, the links in bin, the menu
# entry and the icons; then that installing again repairs the program's
# files but keeps the user's names.mdb.
#
#   cmake -DBUILD=<build dir> -DWORK=<scratch dir> -DWITH_CLI=<0|1> -P install_layout.cmake

cmake_minimum_required(VERSION 3.25)

foreach(var BUILD WORK WITH_CLI)
    if(NOT DEFINED ${var})
        message(FATAL_ERROR "${var} is not set")
    endif()
endforeach()

# cmake --install writes install_manifest.txt into the build folder. The
# checks run in a second cmake of their own, so that the user's record of a
# real install is put back however they end.
set(manifest "${BUILD}/install_manifest.txt")
set(saved_manifest "${WORK}.manifest")
if(NOT CHECKS)
    file(REMOVE_RECURSE "${WORK}")
    file(REMOVE "${saved_manifest}")
    if(EXISTS "${manifest}")
        file(RENAME "${manifest}" "${saved_manifest}")
    endif()
    execute_process(
        COMMAND ${CMAKE_COMMAND} -DCHECKS=1 -DBUILD=${BUILD} -DWORK=${WORK} -DWITH_CLI=${WITH_CLI}
                -P "${CMAKE_CURRENT_LIST_FILE}"
        RESULT_VARIABLE status)
    file(REMOVE "${manifest}")
    if(EXISTS "${saved_manifest}")
        file(RENAME "${saved_manifest}" "${manifest}")
    endif()
    if(NOT status EQUAL 0)
        message(FATAL_ERROR "The install layout is not as expected")
    endif()
    return()
endif()

function(fail)
    string(JOIN "" text ${ARGN})
    message(FATAL_ERROR "${text}")
endfunction()

# Runs cmake --install; the output goes to OUT_VAR.
function(install_into prefix out_var)
    execute_process(
        COMMAND ${CMAKE_COMMAND} -E env ${ARGN} ${CMAKE_COMMAND} --install "${BUILD}" --prefix "${prefix}"
        RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE out)
    if(NOT status EQUAL 0)
        fail("Installing into ${prefix} failed:\n${out}")
    endif()
    set(${out_var} "${out}" PARENT_SCOPE)
endfunction()

function(expect_same installed built)
    if(NOT EXISTS "${installed}")
        fail("${installed} was not installed")
    endif()
    file(SHA256 "${installed}" a)
    file(SHA256 "${built}" b)
    if(NOT a STREQUAL b)
        fail("${installed} differs from ${built}")
    endif()
endfunction()

function(expect_executable path)
    execute_process(COMMAND test -f "${path}" -a -x "${path}" RESULT_VARIABLE status)
    if(NOT status EQUAL 0)
        fail("${path} is missing or not executable")
    endif()
endfunction()

# bin/<program> must be a relative link that reaches the program folder.
function(expect_link root program)
    set(link "${root}/bin/${program}")
    if(NOT IS_SYMLINK "${link}")
        fail("${link} is not a symbolic link")
    endif()
    file(READ_SYMLINK "${link}" target)
    if(IS_ABSOLUTE "${target}")
        fail("${link} points to the absolute path ${target}; it should be relative")
    endif()
    file(REAL_PATH "${link}" reached)
    file(REAL_PATH "${root}/lib/quillane/${program}" wanted)
    if(NOT reached STREQUAL wanted)
        fail("${link} reaches ${reached}, not ${wanted}")
    endif()
    expect_executable("${reached}")
endfunction()

function(expect_line file line)
    file(STRINGS "${file}" lines)
    if(NOT line IN_LIST lines)
        file(READ "${file}" shown)
        fail("${file} has no line \"${line}\":\n${shown}")
    endif()
endfunction()

set(programs quillane)
if(WITH_CLI)
    list(APPEND programs quillane-cli)
endif()
set(bin "${BUILD}/bin")

function(expect_program_folder root)
    set(folder "${root}/lib/quillane")
    foreach(program IN LISTS programs)
        expect_executable("${folder}/${program}")
        expect_link("${root}" ${program})
    endforeach()
    expect_same("${folder}/HAND-M.CUR" "${bin}/HAND-M.CUR")
    expect_same("${folder}/x/o.cjs" "${bin}/x/o.cjs")
    file(GLOB pictures RELATIVE "${bin}/Splash" "${bin}/Splash/*")
    if(NOT pictures)
        fail("${bin}/Splash holds no picture; was the program built?")
    endif()
    foreach(picture IN LISTS pictures)
        expect_same("${folder}/Splash/${picture}" "${bin}/Splash/${picture}")
    endforeach()
endfunction()

# --- A first install into an empty prefix --------------------------------
set(prefix "${WORK}/prefix")
install_into("${prefix}" out)
expect_program_folder("${prefix}")
expect_same("${prefix}/lib/quillane/names.mdb" "${bin}/names.mdb")

set(entry "${prefix}/share/applications/quillane.desktop")
if(NOT EXISTS "${entry}")
    fail("No menu entry at ${entry}")
endif()
foreach(line "Exec=${prefix}/bin/quillane" "Icon=quillane")
    expect_line("${entry}" "${line}")
endforeach()
find_program(validate desktop-file-validate)
if(validate)
    execute_process(COMMAND "${validate}" "${entry}"
                    RESULT_VARIABLE status OUTPUT_VARIABLE said ERROR_VARIABLE said)
    if(NOT status EQUAL 0 OR said MATCHES "error:|warning:")
        fail("desktop-file-validate objects to the menu entry:\n${said}")
    endif()
endif()

# Every drawn icon lands in the folder of its size.
file(GLOB icons "${BUILD}/src/artwork/quillane-*.png")
if(NOT icons)
    fail("No drawn icons in ${BUILD}/src/artwork")
endif()
foreach(icon IN LISTS icons)
    string(REGEX REPLACE ".*quillane-([0-9]+)\\.png$" "\\1" size "${icon}")
    expect_same("${prefix}/share/icons/hicolor/${size}x${size}/apps/quillane.png" "${icon}")
endforeach()

# The manual pages, completion and metadata, where man, bash and software
# centres look below a prefix.
set(extras share/metainfo/org.quillane.Quillane.metainfo.xml share/doc/quillane/copyright)
if(WITH_CLI)
    list(APPEND extras share/man/man1/quillane.1.gz share/man/man1/quillane-cli.1.gz
         share/bash-completion/completions/quillane-cli)
endif()
foreach(extra IN LISTS extras)
    if(NOT EXISTS "${prefix}/${extra}")
        fail("${prefix}/${extra} was not installed")
    endif()
endforeach()

# --- Installing again over a changed install ------------------------------
# The user's list has grown; the program's own files were damaged or are
# from an older install. Installing again mends the files and keeps the list.
set(folder "${prefix}/lib/quillane")
file(WRITE "${folder}/names.mdb" "the user's own names")
file(WRITE "${folder}/quillane" "older")
file(REMOVE "${prefix}/bin/quillane")
file(CREATE_LINK "/nonexistent" "${prefix}/bin/quillane" SYMBOLIC)
file(WRITE "${entry}" "[Desktop Entry]\n")

install_into("${prefix}" out)
file(READ "${folder}/names.mdb" kept)
if(NOT kept STREQUAL "the user's own names")
    fail("Installing again replaced the user's names.mdb")
endif()
if(NOT out MATCHES "Keeping: [^\n]*names\\.mdb")
    fail("Installing again did not say that names.mdb was kept:\n${out}")
endif()
expect_program_folder("${prefix}")
file(SIZE "${folder}/quillane" size)
if(size LESS 1000)
    fail("Installing again left the older executable in place")
endif()
expect_line("${entry}" "Exec=${prefix}/bin/quillane")

# --- A staged install, as for a package ------------------------------------
# Files go below DESTDIR; the menu entry names where they will finally be.
set(stage "${WORK}/stage")
install_into("/opt/quillane" out "DESTDIR=${stage}")
expect_program_folder("${stage}/opt/quillane")
expect_line("${stage}/opt/quillane/share/applications/quillane.desktop"
            "Exec=/opt/quillane/bin/quillane")

message(STATUS "The install layout is as expected in ${WORK}")
