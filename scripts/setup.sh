#!/usr/bin/env bash
# Sets up a Debian 12 machine for Quillane, builds it, and then either starts
# the program or runs every test headless.
#
#   scripts/setup.sh run     install what is missing, build, start the program
#   scripts/setup.sh test    install what is missing, build, run all tests
#
# Environment: BUILD_DIR (default: build), QUILLANE_WERROR=ON to fail on
# warnings, QUILLANE_SANITIZE=ON for an AddressSanitizer/UBSan build.
set -euo pipefail

mode=${1:-}
case "$mode" in
    run|test) ;;
    *) echo "usage: $0 run|test" >&2; exit 2 ;;
esac

top=$(cd "$(dirname "$0")/.." && pwd)
build=${BUILD_DIR:-$top/build}

packages=(
    qt6-base-dev libsqlite3-dev libxlsxwriter-dev
    cmake ninja-build pkg-config g++
    fonts-liberation2 xdg-utils
    # for the headless tests and the reading back of saved workbooks
    xvfb xauth dbus python3-openpyxl
    # for checking the installed menu entry
    desktop-file-utils
    # for scripts/fuzz.sh (libFuzzer)
    clang libclang-rt-14-dev
)

missing=()
for p in "${packages[@]}"; do
    dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q 'install ok installed' || missing+=("$p")
done
if [ ${#missing[@]} -gt 0 ]; then
    echo "Installing: ${missing[*]}"
    sudo=""
    [ "$(id -u)" -eq 0 ] || sudo="sudo"
    $sudo apt-get update -qq
    DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi

cmake -S "$top" -B "$build" -G Ninja \
    -DCMAKE_BUILD_TYPE="${CMAKE_BUILD_TYPE:-Release}" \
    -DQUILLANE_WERROR="${QUILLANE_WERROR:-OFF}" \
    -DQUILLANE_SANITIZE="${QUILLANE_SANITIZE:-OFF}"
cmake --build "$build"

if [ "$mode" = run ]; then
    exec "$build/bin/quillane"
fi

export QT_QPA_PLATFORM=offscreen
ctest --test-dir "$build" --output-on-failure
