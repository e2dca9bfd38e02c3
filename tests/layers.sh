#!/usr/bin/env bash
# The folders of src/ are layers. This check fails, printing every offending
# line, when a source file
#   - includes a file of a layer its own layer may not use,
#   - includes a header of Qt's Widgets module outside src/app (and main.cpp),
#   - names a window's own handler or location text outside src/app,
# or when a folder of src/ is not a layer at all.
#
#   tests/layers.sh SRC_DIR QTWIDGETS_INCLUDE_DIR
set -euo pipefail

src=$(realpath "${1:?usage: $0 SRC_DIR QTWIDGETS_INCLUDE_DIR}")
widgets=${2:?usage: $0 SRC_DIR QTWIDGETS_INCLUDE_DIR}
[ -d "$widgets" ] || { echo "No Qt Widgets headers in $widgets" >&2; exit 2; }

# The layers each layer may include, its own among them. The program's
# start (main.cpp, beside the folders) belongs to app.
declare -A uses=(
    [base]="base"
    [generate]="base generate"
    [names]="base names"
    [results]="base generate results"
    [cli]="base generate names results cli"
    [app]="base generate names results app"
)

# The Widgets module's headers, by the names an include gives them. A few
# lower-case headers there only forward to QtGui's and are left out.
declare -A widget_header=([QtWidgets]=1)
for path in "$widgets"/*; do
    name=${path##*/}
    [ -e "$widgets/../QtGui/$name" ] || widget_header[$name]=1
done

# A window's own names: its event handlers (PushButton2_Click, Option8_Click,
# Text1_Change, Form_Load ...) and the location texts of its error reports.
window_names='\b[A-Z][a-z]+([A-Z][a-z]+)*[0-9]+_[A-Z][a-z]+([A-Z][a-z]+)*\b|\bForm_[A-Z][a-z]+([A-Z][a-z]+)*\b|in Tessmark\.'

failures=0
fail() { # file line text why
    printf '%s:%s: %s\n    %s\n' "src/${1#"$src"/}" "$2" "$3" "$4"
    failures=$((failures + 1))
}

# The layer of a file below src, or nothing for a file outside it.
layer_of() {
    local relative=${1#"$src"/}
    [ "$relative" != "$1" ] || return 0
    case $relative in
        */*) echo "${relative%%/*}" ;;
        *) echo app ;;
    esac
}

while IFS= read -r -d '' file; do
    layer=$(layer_of "$file")
    if [ -z "${uses[$layer]+set}" ]; then
        fail "$file" 1 "" "src/$layer/ is not one of the layers this check knows"
        continue
    fi
    while IFS=: read -r number text; do
        [[ $text =~ ^[[:space:]]*#[[:space:]]*include[[:space:]]*([\"\<])([^\">]+) ]] || continue
        kind=${BASH_REMATCH[1]} target=${BASH_REMATCH[2]}
        # Where the compiler finds it: beside the file (quoted only), then below src.
        found=
        if [ "$kind" = '"' ] && [ -f "${file%/*}/$target" ]; then
            found=$(realpath -m "${file%/*}/$target")
        elif [ -f "$src/$target" ]; then
            found=$(realpath -m "$src/$target")
        fi
        if [ -n "$found" ]; then
            used=$(layer_of "$found")
            if [ -n "$used" ] && [[ " ${uses[$layer]} " != *" $used "* ]]; then
                fail "$file" "$number" "$text" "$layer may use ${uses[$layer]// /, } only, not $used"
            fi
        elif [ "$layer" != app ]; then
            header=${target#QtWidgets/}
            if [ "$header" != "$target" ] || [ -n "${widget_header[$header]+set}" ]; then
                fail "$file" "$number" "$text" "a widget header outside src/app"
            fi
        fi
    done < <(grep -n '^[[:space:]]*#[[:space:]]*include' "$file" || true)

    if [ "${file#"$src"/app/}" = "$file" ]; then
        while IFS=: read -r number text; do
            fail "$file" "$number" "$text" "a window's own name outside src/app"
        done < <(grep -nE "$window_names" "$file" || true)
    fi
done < <(find "$src" -type f \( -name '*.cpp' -o -name '*.h' \) -print0 | sort -z)

if [ "$failures" -gt 0 ]; then
    echo "$failures line(s) cross the layers of src/ (see the paragraph at the top of src/CMakeLists.txt)"
    exit 1
fi
echo "Every file of src/ keeps to its layer"
