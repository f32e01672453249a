#!/bin/bash
# The headers, the map and the libraries must agree on what is exported.
# Usage: symbols.sh SOURCE_DIR LIBQUILLON LIBHEARTH
set -euo pipefail
export LC_ALL=C
sourceDir=$1 libquillon=$2 libhearth=$3

# Names of functions declared with an export mark: the last word ahead of the
# parenthesis.
declared() { # MARK HEADER...
    local mark=$1
    shift
    grep -hv '^#' "$@" | tr '\n' ' ' | grep -oE "\b$mark\b[^;(]*\(" | sed -E 's/.*\b(\w+) *\($/\1/' |
        sort
}

exported() { # LIBRARY
    nm -D --defined-only "$1" | awk '$2 != "A" { sub(/@.*/, "", $3); print $3 }' | sort
}

failed=0
compare() { # WHAT EXPECTED ACTUAL
    [ -n "$2" ] || { echo "$1: nothing to compare with"; failed=1; }
    diff <(echo "$2") <(echo "$3") || { echo "$1: lines with < are missing, with > too much"; failed=1; }
}

headers=$(declared QUILLON_API "$sourceDir"/include/quillon/*.h)
map=$(grep -oE '^ +\w+;' "$sourceDir/lib/quillon.map" | tr -d ' ;' | sort)
compare "quillon.map against the headers" "$headers" "$map"
compare "libquillon against quillon.map" "$map" "$(exported "$libquillon")"
compare "libhearth against hearth.h" "$(declared HEARTH_API "$sourceDir/include/hearth/hearth.h")" \
    "$(exported "$libhearth")"

# What a host can replace, and nothing else: the library's own functions are bound
# within it.
lookedUp() { # PATTERN
    readelf --relocs --wide "$libquillon" | awk '/R_/ { print $5 }' | grep -E "$1" | sort -u || true
}
compare "names looked up in the host against hearth.h" \
    "$(declared HEARTH_API "$sourceDir/include/hearth/hearth.h")" "$(lookedUp '^[A-Z][A-Za-z0-9_]*$')"
[ -z "$(lookedUp QUILLON_)" ] || { echo "Looked up, though its own: $(lookedUp QUILLON_)"; failed=1; }

# Where kernels have a fallback, instructions that not every processor has stand in the
# namespaces of the instruction sets alone: in a function that several files share, or
# behind a pragma that is left open, they would run anywhere.
newer='^(v[a-z]|pshufb|pmaddubsw|palignr|pmulhrsw|p(ext|ins)r[bdq]|pblend|ptest|pmov[sz]x|pm(ax|in)(sb|sd|uw|ud)|pmulld)'
if nm "$libquillon" | grep -E '[0-9]N_(SCALAR|EMU128|SSE2)[0-9]' >/dev/null; then
    strays=$(objdump -d --no-show-raw-insn "$libquillon" | awk -v newer="$newer" '
        /^[0-9a-f]+ <.*>:$/ { name = $2 }
        name !~ /[0-9]N_(AVX|SSE4|SSSE3)/ && $2 ~ newer { print $2, "in", name }' | sort -u)
    [ -z "$strays" ] || { echo "Not on every processor: $strays"; failed=1; }
fi
exit $failed
