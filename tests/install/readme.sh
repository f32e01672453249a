#!/bin/bash
# The programs in the README are those that are compiled, and make the pictures that
# they are said to make; the function that replaces Panic compiles.
# Usage: readme.sh SOURCE_DIR CXX SYSROOT README_PROGRAM README_CPP_PROGRAM [EMULATOR...]
# where SYSROOT is empty but in a cross build.
set -euo pipefail
sourceDir=$1 inC=$4 inCpp=$5
cxx=("$2" ${3:+--sysroot="$3"}) emulator=("${@:6}")
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

block() { # LANGUAGE FILE, of which the first block counts
    awk -v fence="\`\`\`$1" '
        /^```/ { inside = $0 == fence && ++count == 1; next } inside' "$sourceDir/$2"
}
block c README.md | diff - "$sourceDir/examples/readme.c"
block cpp README.md | diff - "$sourceDir/examples/readme.cpp"
block cpp docs/site/hearth.md | "${cxx[@]}" -std=c++17 -fsyntax-only -Wall -Wextra -Werror -I"$sourceDir/include" -x c++ -

expectSize() { # PROGRAM PICTURE SIZE
    "${emulator[@]}" "$1" "$sourceDir/examples/pictures/$2.png" "$work/out.png"
    # Width and height stand big-endian in bytes 16 to 23 of a PNG.
    local size
    size=$(od -An -tu1 -j16 -N8 "$work/out.png" | awk '{ print 256 * $3 + $4 "x" 256 * $7 + $8 }')
    [ "$size" = "$3" ] || { echo "$1 makes $size of $2"; exit 1; }
}
# 1280 by 853, and 256 by 256 with alpha.
expectSize "$inC" lake 1296x869
expectSize "$inC" marble 272x272
expectSize "$inCpp" lake 352x245
expectSize "$inCpp" marble 352x352

echo "not a picture" >"$work/bad.png"
for program in "$inC" "$inCpp"; do
    if "${emulator[@]}" "$program" "$work/bad.png" "$work/out.png" 2>"$work/error"; then exit 1; fi
    grep "bad.png cannot be read" "$work/error"
done
