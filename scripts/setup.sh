#!/usr/bin/env bash
# Sets up a Debian 12 machine for Quillane, builds it, and then starts the
# program, runs every test headless, or makes the Debian package.
#
#   scripts/setup.sh run      install what is missing, build, start the program
#   scripts/setup.sh test     install what is missing, build, run all tests
#   scripts/setup.sh package  install what is missing, build, make
#                             build/quillane_<version>_<arch>.deb
#   scripts/setup.sh build    install what is missing, build (for other scripts)
#
# Environment: BUILD_DIR (default: build), QUILLANE_WERROR=ON to fail on
# warnings, QUILLANE_SANITIZE=ON for an AddressSanitizer/UBSan build,
# QUILLANE_COVERAGE=ON for a build that counts coverage (scripts/coverage.sh).
# run, test and build set each of these (default OFF, and a Release build);
# package keeps those of a build folder already configured, unless set.
set -euo pipefail

mode=${1:-}
case "$mode" in
    run|test|package|build) ;;
    *) echo "usage: $0 run|test|package|build" >&2; exit 2 ;;
esac

top=$(cd "$(dirname "$0")/.." && pwd)
# shellcheck source=scripts/packages.sh
. "$top/scripts/packages.sh"
build=${BUILD_DIR:-$top/build}

packages=(
    qt6-base-dev libsqlite3-dev libxlsxwriter-dev
    cmake ninja-build pkg-config g++
    fonts-liberation2 xdg-utils
    # for the headless tests and the reading back of saved workbooks
    xvfb xauth dbus python3-openpyxl
    # for loading quillane-cli's SQL output in a test
    sqlite3
    # for the package (dpkg-shlibdeps, file) and for checking what it holds
    dpkg-dev file lintian appstream desktop-file-utils bash-completion
    # for scripts/coverage.sh
    gcovr
    # for scripts/fuzz.sh (libFuzzer)
    clang libclang-rt-14-dev
)

install_missing "${packages[@]}"

# Making the package leaves a configured build folder's options as they are
# (a developer's -Werror build stays one): only what the environment sets
# is passed on. Every other mode, and a new build folder, gets the defaults.
configure=(-S "$top" -B "$build")
reuse=
[ "$mode" = package ] && [ -e "$build/CMakeCache.txt" ] && reuse=1
[ -n "$reuse" ] || configure+=(-G Ninja)
for setting in CMAKE_BUILD_TYPE=Release QUILLANE_WERROR=OFF QUILLANE_SANITIZE=OFF \
               QUILLANE_COVERAGE=OFF; do
    name=${setting%%=*}
    if [ -n "${!name:-}" ] || [ -z "$reuse" ]; then
        configure+=("-D$name=${!name:-${setting#*=}}")
    fi
done
cmake "${configure[@]}"
if [ "$mode" = package ] \
    && grep -Eiqs '^QUILLANE_(SANITIZE|COVERAGE):BOOL=(ON|1|TRUE|YES|Y)$' "$build/CMakeCache.txt"; then
    echo "$build is a sanitizer or coverage build, which is no build to ship;" \
         "make the package from another (BUILD_DIR=build-package $0 package)" >&2
    exit 1
fi
cmake --build "$build"

case "$mode" in
    run) exec "$build/bin/quillane" ;;
    build) exit 0 ;;
    package)
        # cpack's install writes the build's install_manifest.txt, which is
        # the record of an install of your own (and what removing it reads):
        # it is put back as it was.
        manifest="$build/install_manifest.txt"
        saved="$build/install_manifest.txt.saved"
        rm -f "$saved" "$build"/quillane_*.deb
        [ ! -e "$manifest" ] || mv "$manifest" "$saved"
        status=0
        (cd "$build" && cpack -G DEB) || status=$?
        rm -f "$manifest"
        [ ! -e "$saved" ] || mv "$saved" "$manifest"
        [ "$status" -eq 0 ] || exit "$status"
        ls "$build"/quillane_*.deb
        exit 0 ;;
esac

export QT_QPA_PLATFORM=offscreen
ctest --test-dir "$build" --output-on-failure
