#!/usr/bin/env bash
# Takes the README's pictures from the real program on a virtual screen and
# saves them in docs/pictures:
#
#   main-window.png     the main window as it opens
#   results-window.png  the results of generating 250 names
#   error-report.png    the report shown when the names database is locked
#
# The program runs from a temporary copy of its folder, with the shipped
# names and settings of its own, so your names.mdb and your settings are
# never read or changed. Builds first if needed (BUILD_DIR as for setup.sh).
set -euo pipefail

top=$(cd "$(dirname "$0")/.." && pwd)
build=${BUILD_DIR:-$top/build}
out=$top/docs/pictures

# The screen work happens in a second run of this script, inside a virtual
# X server of its own and a D-Bus session that ends with it.
if [ "${1:-}" != --on-screen ]; then
    # shellcheck source=scripts/packages.sh
    . "$top/scripts/packages.sh"
    # An existing build is brought up to date as it was configured; a
    # missing one is set up as setup.sh does.
    if [ -f "$build/CMakeCache.txt" ]; then
        cmake --build "$build"
    else
        BUILD_DIR=$build "$top/scripts/setup.sh" build
    fi
    # xdotool finds the windows and types and clicks; ImageMagick takes
    # and trims the pictures.
    install_missing xdotool imagemagick python3

    work=$(mktemp -d)
    trap 'rm -rf "$work"' EXIT
    cp -a "$build/bin" "$work/program"
    # The shipped lists, not whatever list the build folder holds now.
    cp "$build/data/names-shipped.mdb" "$work/program/names.mdb"
    mkdir -p "$work/home/.config" "$work/runtime" "$work/bin" "$out"
    chmod 700 "$work/runtime"
    # No splash; the count box starts at 100.
    printf '[Quillane]\nShowAgain=1\nText1=100\n' >"$work/home/.config/Varnholt.ini"
    # Now and then the program opens its web page; here that opens nothing.
    printf '#!/bin/sh\nexit 0\n' >"$work/bin/xdg-open"
    chmod +x "$work/bin/xdg-open"

    HOME=$work/home XDG_CONFIG_HOME=$work/home/.config XDG_RUNTIME_DIR=$work/runtime \
        PATH=$work/bin:$PATH WORK=$work OUT=$out \
        dbus-run-session -- xvfb-run -a -s "-screen 0 1280x1024x24" "$0" --on-screen
    echo "Pictures saved in $out:"
    ls -l "$out"
    exit 0
fi

unset QT_QPA_PLATFORM QT_SCALE_FACTOR QT_FONT_DPI
# WORK and OUT come from the first run.
program=$WORK/program/quillane
pid=""
locker=""
finish() {
    [ -z "$pid" ] || kill "$pid" 2>/dev/null || true
    [ -z "$locker" ] || kill "$locker" 2>/dev/null || true
}
trap finish EXIT

# The one visible window with this title that is not one of the others
# given, waited for up to 20 seconds.
window() {
    local title=$1 id
    shift
    for _ in $(seq 200); do
        for id in $(xdotool search --onlyvisible --name "^$title\$" 2>/dev/null); do
            case " $* " in *" $id "*) ;; *) echo "$id"; return 0 ;; esac
        done
        sleep 0.1
    done
    echo "No window \"$title\" appeared" >&2
    return 1
}

# Clicks at a point of a window, given in the layout's twips (15 to a pixel)
# as the program's code places its controls.
click() {
    local id=$1 x=$2 y=$3 left top
    eval "$(xdotool getwindowgeometry --shell "$id" | grep -E '^(X|Y)=')"
    left=$X top=$Y
    xdotool mousemove $((left + x / 15)) $((top + y / 15)) click 1
}

# Saves a window as a small PNG: a palette of at most 256 colours suits
# these flat controls and keeps the text sharp.
save() {
    local id=$1 name=$2
    sleep 0.5
    /usr/bin/import -window "$id" "png:$WORK/$name"
    /usr/bin/convert "$WORK/$name" -strip +dither -colors 256 -define png:compression-level=9 \
        "PNG8:$OUT/$name"
}

start() {
    "$program" &
    pid=$!
    main=$(window Quillane)
}

stop() {
    kill "$pid"
    wait "$pid" 2>/dev/null || true
    pid=""
}

# The main window as it opens.
start
save "$main" main-window.png

# 250 names: into the count box ("Text1"), then "Start Generating", which
# hides the main window and shows the results.
click "$main" $((120 + 240 + 3650)) $((2505 + 300 + 187))
xdotool key ctrl+a
xdotool type 250
click "$main" $((120 + 3900)) $((9140 + 202))
results=$(window Preview)
save "$results" results-window.png
stop

# The list locked by another program once the window is open (the program
# reads the lists as it starts and would end there): "Add First Name" waits
# out the busy timeout and then reports the failure.
start
/usr/bin/python3 -c '
import sqlite3, sys, time
c = sqlite3.connect(sys.argv[1], isolation_level=None)
c.execute("BEGIN EXCLUSIVE")
print("locked", flush=True)
time.sleep(120)
' "$WORK/program/names.mdb" >"$WORK/locked" &
locker=$!
for _ in $(seq 100); do grep -q locked "$WORK/locked" && break; sleep 0.1; done
click "$main" $((120 + 240 + 1800)) $((3390 + 1695 + 202))
ask=$(window Quillane "$main")
xdotool mousemove --window "$ask" 20 20 type Wren
xdotool key Return
report=$(window "Application Error")
sleep 0.5
# The report over the main window behind it. With no window manager the
# report has no frame of its own; a thin line marks its edge.
eval "$(xdotool getwindowgeometry --shell "$report" | grep -E '^(X|Y|WIDTH|HEIGHT)=')"
box_left=$X box_top=$Y box_right=$((X + WIDTH - 1)) box_bottom=$((Y + HEIGHT - 1))
eval "$(xdotool getwindowgeometry --shell "$main" | grep -E '^(X|Y|WIDTH|HEIGHT)=')"
/usr/bin/import -window root "png:$WORK/screen.png"
/usr/bin/convert "$WORK/screen.png" -fill none -stroke '#404040' \
    -draw "rectangle $((box_left - 1)),$((box_top - 1)) $((box_right + 1)),$((box_bottom + 1))" \
    -crop "${WIDTH}x${HEIGHT}+${X}+${Y}" +repage \
    -strip +dither -colors 256 -define png:compression-level=9 "PNG8:$OUT/error-report.png"
xdotool key --window "$report" Return 2>/dev/null || true
stop
