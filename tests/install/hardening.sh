#!/bin/bash
# The libraries are hardened, as their own files tell.
# Usage: hardening.sh READELF OBJDUMP NM LIBRARY...
set -euo pipefail
readelf=$1 objdump=$2 nm=$3
shift 3
failed=0
demand() { # WHAT PATTERN TEXT
    grep -qE -- "$2" <<<"$3" || { echo "$library: no $1"; failed=1; }
}

for library; do
    segments=$("$readelf" -lW "$library") dynamic=$("$readelf" -dW "$library")
    imports=$("$nm" -D --undefined-only "$library")
    demand "relocations that become read-only" 'GNU_RELRO' "$segments"
    demand "immediate binding" 'FLAGS_1.*\bNOW\b' "$dynamic"
    demand "stack without execution" 'GNU_STACK +.* RW +0x' "$segments"
    demand "code without relocations" '^relocated: 0$' "relocated: $(grep -c TEXTREL <<<"$dynamic" || true)"
    demand "stack protector" '__stack_chk_fail' "$imports"

    # An indirect call may only arrive at a mark, which every exported function has.
    unmarked=$("$objdump" -d --no-show-raw-insn "$library" |
        awk '/^[0-9a-f]+ <.*>:$/ { name = substr($2, 2, length($2) - 3); getline
                                   print ($2 ~ /^(endbr64|bti|paciasp)$/), name }' |
        awk '$1 == 0 { print $2 }' | sort)
    exports=$("$nm" -D --defined-only "$library" | awk '$2 ~ /[TW]/ { sub(/@.*/, "", $3); print $3 }' | sort)
    [ -n "$exports" ] || { echo "$library exports nothing"; failed=1; }
    open=$(comm -12 <(echo "$unmarked") <(echo "$exports"))
    [ -z "$open" ] || { echo "$library: no mark for indirect calls at" $open; failed=1; }
done
# The library of the two that formats text.
demand "checked calls of the C library" '_chk@' "$imports"
exit $failed
