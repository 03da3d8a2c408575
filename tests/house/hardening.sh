#!/usr/bin/env bash
# Looks at built files for what KvtHardening.cmake asks for.
#
#   hardening.sh SOURCE-FOLDER COMPILE-COMMANDS FILE...
#
# Whether calls of the C library are checked cannot be seen in a file that has none with a known size; the commands by
# which its sources were compiled say it.

set -euo pipefail
export LC_ALL=C

folder=$1 commands=$2
shift 2
status=0
complain() {
    printf '%s: %s\n' "$1" "$2"
    status=1
}

for file in "$@"; do
    headers=$(readelf -Wl "$file") dynamic=$(readelf -Wd "$file") names=$(readelf -W --dyn-syms "$file")
    grep -q 'GNU_RELRO' <<<"$headers" || complain "$file" "tables of addresses stay writable (no RELRO)"
    grep -Eq 'BIND_NOW|FLAGS_1.*NOW' <<<"$dynamic" || complain "$file" "names are looked up late (no BIND_NOW)"
    grep -Eq 'GNU_STACK.* RW ' <<<"$headers" || complain "$file" "the stack can be executed"
    grep -Eq 'RWE' <<<"$headers" && complain "$file" "a segment can be written and executed"
    grep -q 'TEXTREL' <<<"$dynamic" && complain "$file" "code is changed when it is loaded (TEXTREL)"
    readelf -Wh "$file" | grep -Eq 'Type: +DYN' || complain "$file" "it has a fixed address (no PIE)"
    grep -q '__stack_chk_fail' <<<"$names" || complain "$file" "the stack has no canaries"
done
unchecked=$(grep -F '"command": ' "$commands" | grep -F -e " $folder/kvt/" -e " $folder/tools/" |
    grep -v -e ' -o tests/' | grep -vc -e '-D_FORTIFY_SOURCE=2' || true) # tests compile some of them without optimisation
[[ $unchecked -eq 0 ]] || complain "$commands" "$unchecked sources without _FORTIFY_SOURCE"
exit "$status"
