#!/bin/bash
# The example in the README is the one that is compiled, and makes the picture
# that it is said to make.
# Usage: readme.sh SOURCE_DIR [EMULATOR...] README_PROGRAM
set -euo pipefail
sourceDir=$1
shift
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

sed -n '/^```c$/,/^```$/p' "$sourceDir/README.md" | sed '1d;$d' | diff - "$sourceDir/examples/readme.c"

"$@" "$sourceDir/examples/pictures/lake.png" "$work/small.png"
# Width and height stand big-endian in bytes 16 to 23 of a PNG: 1260 by 833
# become 320 by 211.
size=$(od -An -tu1 -j16 -N8 "$work/small.png" | tr -s ' ')
[ "$size" = " 0 0 1 64 0 0 0 211" ] || { echo "The picture measures$size"; exit 1; }
