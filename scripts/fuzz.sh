#!/usr/bin/env bash
# Builds the libFuzzer target for the splitting of text files into names with
# clang (AddressSanitizer and UndefinedBehaviorSanitizer) and runs it.
#   scripts/fuzz.sh [seconds]      default 60
set -euo pipefail
cd "$(dirname "$0")/.."
seconds=${1:-60}
out=${FUZZ_DIR:-build-fuzz}
mkdir -p "$out/corpus"

# Qt is built position-independent and asks the same of what uses it.
clang++ -std=c++20 -g -O1 -fPIC \
    -fsanitize=fuzzer,address,undefined -fno-sanitize-recover=undefined \
    -DQT_NO_CAST_FROM_ASCII -DQT_NO_KEYWORDS \
    -Isrc $(pkg-config --cflags Qt6Core) \
    tests/fuzz/fuzz_namesplitter.cpp src/names/namesplitter.cpp \
    $(pkg-config --libs Qt6Core) \
    -o "$out/fuzz_namesplitter"

# A few seeds: the line ends, a byte-order mark, UTF-16, apostrophes, NULs.
printf 'xAnn\r\nBo\rCy\n' >"$out/corpus/lines"
printf '\x03\xef\xbb\xbfZo\xc3\xab\n' >"$out/corpus/bom"
printf '\x05\xff\xfeA\x00n\x00\r\x00\n\x00' >"$out/corpus/utf16"
printf "\x02O'Brien\x00\n   \n" >"$out/corpus/odd"

"$out/fuzz_namesplitter" -max_total_time="$seconds" -max_len=4096 -print_final_stats=1 \
    -artifact_prefix="$out/" \
    "$out/corpus"
