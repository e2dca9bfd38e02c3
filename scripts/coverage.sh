#!/usr/bin/env bash
# Measures how much of src/ the tests run: builds a coverage build (Debug,
# gcc --coverage) in build-coverage, runs every test there, and prints line
# and branch coverage for each folder of src/ with gcovr.
#
#   scripts/coverage.sh
#
# Branches that only an exception thrown by a call could take, and those the
# compiler proves unreachable, are left out of the count. The per-file
# figures are in build-coverage/coverage.txt, and the lines and branches one
# by one in build-coverage/coverage/index.html.
#
# Environment: BUILD_DIR (default: build-coverage), QUILLANE_WERROR=ON to
# fail on warnings. The exit status is the tests' own.
set -euo pipefail

top=$(cd "$(dirname "$0")/.." && pwd)
build=${BUILD_DIR:-$top/build-coverage}

QUILLANE_COVERAGE=ON CMAKE_BUILD_TYPE=Debug BUILD_DIR="$build" "$top/scripts/setup.sh" build

# Counts from earlier runs would add to this one's.
find "$build" -name '*.gcda' -delete
# Some tests run a child as an unprivileged user (root ignores permission
# bits): its counts are kept too only if it may write them beside ours.
find "$build" -type d -exec chmod a+rwx {} +
umask 000

status=0
QT_QPA_PLATFORM=offscreen ctest --test-dir "$build" -j2 --output-on-failure || status=$?

rm -rf "$build/coverage"
mkdir -p "$build/coverage"
gcovr --root "$top" --filter "$top/src/" -j 2 \
    --exclude-throw-branches --exclude-unreachable-branches --gcov-ignore-parse-errors \
    --json-summary "$build/coverage.json" \
    --txt "$build/coverage.txt" \
    --html-details "$build/coverage/index.html" \
    "$build"

# Each folder of src/ in the order of its layers, the files beside them last.
python3 - "$build/coverage.json" <<'EOF'
import json, sys

order = ["base", "generate", "names", "results", "app", "cli"]
totals = {}
for f in json.load(open(sys.argv[1]))["files"]:
    path = f["filename"].removeprefix("src/")
    folder = path.split("/")[0] if "/" in path else path
    t = totals.setdefault(folder, [0, 0, 0, 0])
    for i, key in enumerate(["line_covered", "line_total", "branch_covered", "branch_total"]):
        t[i] += f[key]

def row(name, covered, total, bcovered, btotal):
    pct = lambda c, n: f"{100.0 * c / n:5.1f}%" if n else "    -"
    print(f"{name:<12} {pct(covered, total)} {covered:>6}/{total:<6}  {pct(bcovered, btotal)} {bcovered:>6}/{btotal:<6}")

print(f"{'src/':<12} {'lines':>21}  {'branches':>21}")
for folder in order + sorted(set(totals) - set(order)):
    if folder in totals:
        row(folder, *totals[folder])
row("all", *[sum(t[i] for t in totals.values()) for i in range(4)])
EOF
exit "$status"
