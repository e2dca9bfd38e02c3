# The Debian package: scripts/setup.sh package, or cpack -G DEB in the build
# folder, makes quillane_<version>_<arch>.deb. It installs the program for
# every account: the program folder in /usr/lib/quillane belongs to root,
# so each user gets a names list of their own (see base/programfiles.h).
#
# The package holds the names database as shipped, not the build's
# bin/names.mdb with whatever names were added to it while developing:
# package-config.cmake tells the install rules that a package is being made.

# The hardening Debian builds its own packages with, for every build, so
# that the package's programs are the ones the tests ran.
if(NOT QUILLANE_SANITIZE)
    target_compile_options(quillane_options INTERFACE -fstack-protector-strong)
    target_compile_definitions(quillane_options INTERFACE
        $<$<NOT:$<CONFIG:Debug>>:_FORTIFY_SOURCE=2>)
    target_link_options(quillane_options INTERFACE LINKER:-z,relro LINKER:-z,now)
endif()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME quillane)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_CONTACT "The Quillane developers <maintainers@quillane.org>")
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "make lists of random personal names")
set(CPACK_DEBIAN_PACKAGE_DESCRIPTION "Quillane makes lists of random personal names, for anyone who needs names
that belong to nobody: sample rows for a form or a database under test,
characters for a story, a class list for an exercise. Names come from a
built-in list of about 94,000 census names, by gender, or from a list of
your own; results are saved as text or opened in a spreadsheet program.
.
quillane-cli does the same from scripts, builds and test-data pipelines.")
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_HOMEPAGE "https://quillane.org/")
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
# Opening workbooks and the web page goes through xdg-open.
set(CPACK_DEBIAN_PACKAGE_DEPENDS "xdg-utils")
set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_INSTALL_PREFIX /usr)
# The menu entry names the program by its final path, so the files are
# staged below DESTDIR with the real prefix rather than below a prefix of
# CPack's own.
set(CPACK_SET_DESTDIR ON)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_PROJECT_CONFIG_FILE ${CMAKE_CURRENT_LIST_DIR}/package-config.cmake)
set(CPACK_PACKAGE_DIRECTORY ${CMAKE_BINARY_DIR})
include(CPack)
