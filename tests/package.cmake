# Makes the Debian package from the built program and checks what a user of
# it gets: the files and control fields, the checkers' verdicts, and the
# names list of each user's own where the program folder belongs to root.
# The unpacked programs run as an unprivileged user (nobody, when the tests
# run as root) with data and settings folders of the test's own.
#
#   cmake -DBUILD=<build dir> -DSOURCE=<source dir> -P package.cmake

cmake_minimum_required(VERSION 3.25)

foreach(var BUILD SOURCE)
    if(NOT DEFINED ${var})
        message(FATAL_ERROR "${var} is not set")
    endif()
endforeach()
foreach(tool dpkg-deb dpkg-shlibdeps cpack)
    find_program(have_${tool} ${tool})
    if(NOT have_${tool})
        message(STATUS "Skipped: ${tool} is not installed (scripts/setup.sh package installs it)")
        return()
    endif()
endforeach()

function(fail)
    string(JOIN "" text ${ARGN})
    message(FATAL_ERROR "${text}")
endfunction()

function(run out_var)
    execute_process(COMMAND ${ARGN} RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE out)
    if(NOT status EQUAL 0)
        fail("${ARGN} failed (${status}):\n${out}")
    endif()
    set(${out_var} "${out}" PARENT_SCOPE)
endfunction()

# Below /tmp, where another account can reach it; named for the build, so
# that builds side by side do not share it.
string(MD5 tag "${BUILD}")
string(SUBSTRING "${tag}" 0 10 tag)
set(WORK "/tmp/quillane-package-test-${tag}")

# cpack's install writes the build's install_manifest.txt, the user's record
# of a real install: the checks run in a second cmake of their own, so that
# it is put back however they end.
set(manifest "${BUILD}/install_manifest.txt")
set(saved_manifest "${WORK}.manifest")
if(NOT CHECKS)
    file(REMOVE "${saved_manifest}")
    if(EXISTS "${manifest}")
        file(RENAME "${manifest}" "${saved_manifest}")
    endif()
    execute_process(COMMAND ${CMAKE_COMMAND} -DCHECKS=1 -DBUILD=${BUILD} -DSOURCE=${SOURCE}
                            -P "${CMAKE_CURRENT_LIST_FILE}"
                    RESULT_VARIABLE status)
    file(REMOVE "${manifest}")
    if(EXISTS "${saved_manifest}")
        file(RENAME "${saved_manifest}" "${manifest}")
    endif()
    execute_process(COMMAND chmod -R u+w "${WORK}")
    file(REMOVE_RECURSE "${WORK}")
    if(NOT status EQUAL 0)
        message(FATAL_ERROR "The package is not as expected")
    endif()
    return()
endif()
file(REMOVE_RECURSE "${WORK}")
file(MAKE_DIRECTORY "${WORK}")

# --- The package -----------------------------------------------------------
run(out ${have_cpack} -G DEB --config "${BUILD}/CPackConfig.cmake" -B "${WORK}/out")
file(GLOB debs "${WORK}/out/quillane_*.deb")
list(LENGTH debs count)
if(NOT count EQUAL 1)
    fail("cpack made ${count} packages:\n${out}")
endif()
set(deb "${debs}")

run(control dpkg-deb -f "${deb}")
foreach(wanted "Package: quillane" "Architecture: amd64" "Section: utils"
        "Maintainer: [^\n]+@" "Homepage: https://" "Depends: [^\n]*xdg-utils"
        "Depends: [^\n]*libqt6widgets6" "Depends: [^\n]*libsqlite3-0" "Depends: [^\n]*libxlsxwriter"
        "Description: [^\n]+\n [^\n]+")
    if(NOT control MATCHES "${wanted}")
        fail("The control fields have no match for '${wanted}':\n${control}")
    endif()
endforeach()
get_filename_component(name "${deb}" NAME)
if(NOT name MATCHES "^quillane_[0-9.]+_amd64\\.deb$")
    fail("The package is named ${name}")
endif()

set(root "${WORK}/root")
run(out dpkg-deb -x "${deb}" "${root}")
set(folder "${root}/usr/lib/quillane")
foreach(file usr/lib/quillane/quillane usr/lib/quillane/quillane-cli usr/lib/quillane/names.mdb
        usr/lib/quillane/HAND-M.CUR usr/lib/quillane/x/o.cjs
        usr/share/applications/quillane.desktop
        usr/share/icons/hicolor/48x48/apps/quillane.png
        usr/share/icons/hicolor/256x256/apps/quillane.png
        usr/share/metainfo/org.quillane.Quillane.metainfo.xml
        usr/share/man/man1/quillane.1.gz usr/share/man/man1/quillane-cli.1.gz
        usr/share/bash-completion/completions/quillane-cli
        usr/share/doc/quillane/copyright usr/share/doc/quillane/changelog.gz)
    if(NOT EXISTS "${root}/${file}")
        fail("The package holds no ${file}")
    endif()
endforeach()
foreach(program quillane quillane-cli)
    file(READ_SYMLINK "${root}/usr/bin/${program}" target)
    if(NOT target STREQUAL "../lib/quillane/${program}")
        fail("/usr/bin/${program} points to '${target}'")
    endif()
endforeach()
file(GLOB pictures "${folder}/Splash/*")
if(NOT pictures)
    fail("The package holds no splash picture")
endif()
file(STRINGS "${root}/usr/share/applications/quillane.desktop" exec REGEX "^Exec=")
if(NOT exec STREQUAL "Exec=/usr/bin/quillane")
    fail("The menu entry says ${exec}")
endif()
# The lists as shipped, never the names a developer added to the build's copy.
file(SHA256 "${folder}/names.mdb" shipped_sum)
file(SHA256 "${BUILD}/data/names-shipped.mdb" wanted_sum)
if(NOT shipped_sum STREQUAL wanted_sum)
    fail("The package's names.mdb is not the shipped one")
endif()

# Every picture of the README is a screenshot of the metadata.
file(READ "${root}/usr/share/metainfo/org.quillane.Quillane.metainfo.xml" metainfo)
file(GLOB readme_pictures RELATIVE "${SOURCE}/docs/pictures" "${SOURCE}/docs/pictures/*.png")
foreach(picture IN LISTS readme_pictures)
    if(NOT metainfo MATCHES "<image>https://[^<]*/${picture}</image>")
        fail("The metadata shows no screenshot ${picture}")
    endif()
endforeach()

# --- What the checkers say -------------------------------------------------
find_program(desktop_file_validate desktop-file-validate)
if(desktop_file_validate)
    run(said ${desktop_file_validate} "${root}/usr/share/applications/quillane.desktop")
    if(said MATCHES "error:|warning:")
        fail("desktop-file-validate: ${said}")
    endif()
endif()
find_program(appstreamcli appstreamcli)
if(appstreamcli)
    run(said ${appstreamcli} validate --no-net
        "${root}/usr/share/metainfo/org.quillane.Quillane.metainfo.xml")
endif()
find_program(lintian lintian)
if(lintian)
    execute_process(COMMAND ${lintian} --fail-on error,warning "${deb}"
                    RESULT_VARIABLE status OUTPUT_VARIABLE said ERROR_VARIABLE said)
    if(NOT status EQUAL 0)
        fail("lintian: ${said}")
    endif()
endif()

# --- The manual and the completion say what the help says ------------------
set(cli "${root}/usr/bin/quillane-cli")
run(manual gzip -dc "${root}/usr/share/man/man1/quillane-cli.1.gz")
string(REPLACE "\\-" "-" manual "${manual}")
set(helps "")
foreach(command "" generate names add delete clear import)
    run(help "${cli}" ${command} --help)
    string(APPEND helps "${help}")
endforeach()
file(READ "${root}/usr/share/bash-completion/completions/quillane-cli" completion)
string(REGEX MATCHALL "--[a-z]+" options "${helps}")
list(REMOVE_DUPLICATES options)
foreach(option IN LISTS options)
    if(NOT completion MATCHES " ${option}[ \"]")
        fail("The bash completion does not offer ${option}")
    endif()
endforeach()
# What the shell offers after a few command lines.
set(bash_completion /usr/share/bash-completion/bash_completion)
if(EXISTS "${bash_completion}")
    # (no semicolons: CMake would take them for list separators)
    set(script [=[
        source "$1"
        source "$2"
        offer() {
            COMP_LINE=$1
            COMP_POINT=${#COMP_LINE}
            read -ra COMP_WORDS <<<"$1"
            [[ $1 == *" " ]] && COMP_WORDS+=("")
            COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
            COMPREPLY=()
            _quillane_cli
            echo "${COMPREPLY[*]}"
        }
        offer "quillane-cli g"
        offer "quillane-cli --database x.mdb a"
        offer "quillane-cli generate --format "
        offer "quillane-cli add "
        offer "quillane-cli names first --gender f"
    ]=])
    run(offered bash -c "${script}" bash "${bash_completion}"
        "${root}/usr/share/bash-completion/completions/quillane-cli")
    set(wanted "generate\nadd\ntext lines csv tsv jsonl sql xlsx2 xlsx1\nfirst last\nfemale\n")
    if(NOT offered STREQUAL wanted)
        fail("The bash completion offers:\n${offered}")
    endif()
endif()

string(REGEX MATCHALL "[^\n]+" lines "${helps}")
foreach(line IN LISTS lines)
    string(FIND "${manual}" "${line}" at)
    if(at EQUAL -1)
        fail("The manual page lacks the help's line '${line}'")
    endif()
endforeach()

# --- A names list of each user's own -------------------------------------
# Root writes through any mode, so the programs run as nobody when the
# tests run as root.
execute_process(COMMAND id -u OUTPUT_VARIABLE uid OUTPUT_STRIP_TRAILING_WHITESPACE)
set(as_user "")
set(user_dir "${WORK}/user")
file(MAKE_DIRECTORY "${user_dir}")
if(uid STREQUAL "0")
    set(as_user setpriv --reuid=nobody --regid=nogroup --clear-groups)
    run(out chown -R nobody:nogroup "${user_dir}")
endif()
run(out chmod 755 "${WORK}")
execute_process(COMMAND chmod -R a-w "${folder}")

# Runs as the user with a data folder of its own below the user's folder;
# the exit status goes to status_var, all output to out_var.
function(as_user data status_var out_var)
    execute_process(
        COMMAND ${as_user} env HOME=${user_dir}/home XDG_DATA_HOME=${user_dir}/${data}
                XDG_CONFIG_HOME=${user_dir}/config XDG_CACHE_HOME=${user_dir}/cache
                XDG_RUNTIME_DIR=${user_dir}/runtime QT_QPA_PLATFORM=offscreen ${ARGN}
        RESULT_VARIABLE status OUTPUT_VARIABLE out ERROR_VARIABLE out)
    set(${status_var} "${status}" PARENT_SCOPE)
    set(${out_var} "${out}" PARENT_SCOPE)
endfunction()

function(expect_done data)
    as_user(${data} status out ${ARGN})
    if(NOT status EQUAL 0)
        fail("${ARGN} failed (${status}):\n${out}")
    endif()
    set(out "${out}" PARENT_SCOPE)
endfunction()

function(expect_unchanged file sum)
    file(SHA256 "${file}" now)
    if(NOT now STREQUAL sum)
        fail("${file} was changed")
    endif()
endfunction()

function(expect_absent file)
    if(EXISTS "${file}")
        fail("${file} was made")
    endif()
endfunction()

# The program folder as installed: the first add makes the user's copy.
set(copy "${user_dir}/data/quillane/names.mdb")
expect_done(data "${cli}" --version)
if(NOT out MATCHES "names database: ${copy}")
    fail("--version does not name the user's copy:\n${out}")
endif()
expect_absent("${copy}")
expect_done(data "${cli}" add first Tamsin --list user)
expect_done(data "${cli}" names first --list user)
if(NOT out STREQUAL "Tamsin\n")
    fail("The user's list holds:\n${out}")
endif()
expect_unchanged("${folder}/names.mdb" "${shipped_sum}")
expect_done(data "${cli}" --version)
if(NOT out MATCHES "names database: ${copy} \\(your own copy of /")
    fail("--version does not name the user's copy:\n${out}")
endif()

# A copy that cannot be made is one line naming it, and changes nothing.
file(WRITE "${user_dir}/blocked" "in the way")
as_user(blocked/data status out "${cli}" add first Quillon --list user)
if(NOT status EQUAL 1 OR NOT out MATCHES "^quillane-cli: [^\n]*${user_dir}/blocked/data/quillane/names.mdb[^\n]*\n$")
    fail("A copy that cannot be made gave (${status}):\n${out}")
endif()
expect_unchanged("${folder}/names.mdb" "${shipped_sum}")

# The window, started for the first time: it is still up when the test
# ends it, has said nothing, and has made the user's copy of the shipped
# lists, writing nothing else.
as_user(window status out timeout 8 "${root}/usr/bin/quillane")
if(NOT status EQUAL 124 OR NOT out STREQUAL "")
    fail("The window ended early (${status}):\n${out}")
endif()
expect_unchanged("${user_dir}/window/quillane/names.mdb" "${shipped_sum}")
expect_unchanged("${folder}/names.mdb" "${shipped_sum}")

# --database wins, before the command or after it.
set(mine "${user_dir}/mine.mdb")
file(COPY_FILE "${folder}/names.mdb" "${mine}")
run(out chmod u+w "${mine}")
if(as_user)
    run(out chown nobody:nogroup "${mine}")
endif()
expect_done(chosen "${cli}" --database "${mine}" add last Quillfeather --list user)
expect_done(chosen "${cli}" add last Inkwell --list user "--database=${mine}")
expect_done(chosen "${cli}" names last --list user --database "${mine}")
if(NOT out STREQUAL "Inkwell\nQuillfeather\n")
    fail("--database did not win:\n${out}")
endif()
expect_absent("${user_dir}/chosen")
expect_done(chosen "${root}/usr/bin/quillane" --database "${mine}" --version)
if(NOT out MATCHES "names database: ${mine}\n")
    fail("The window's --version does not name --database's file:\n${out}")
endif()
as_user(chosen status out timeout 6 "${root}/usr/bin/quillane" "--database=${mine}")
if(NOT status EQUAL 124 OR NOT out STREQUAL "")
    fail("The window with --database ended early (${status}):\n${out}")
endif()
expect_absent("${user_dir}/chosen")

# A program folder the user may write keeps its own names.mdb.
set(own "${user_dir}/own")
run(out cp -a "${folder}" "${own}")
run(out chmod -R u+w "${own}")
if(as_user)
    run(out chown -R nobody:nogroup "${own}")
endif()
expect_done(owned "${own}/quillane-cli" add first Quillon --list user)
expect_absent("${user_dir}/owned")
expect_done(owned "${own}/quillane-cli" --database "${folder}/names.mdb" names first --list user)
if(NOT out STREQUAL "")
    fail("The shipped list holds names of the user's:\n${out}")
endif()
file(SHA256 "${own}/names.mdb" now)
if(now STREQUAL shipped_sum)
    fail("The add did not reach the writable program folder's names.mdb")
endif()

message(STATUS "The package is as expected")
