#!/usr/bin/env bash
# What libkvt.so exports, and what it takes from others.
#
#   exported_names.sh list LIBRARY            prints the names
#   exported_names.sh own LIBRARY             fails on a name outside namespace kvt and the named global classes
#   exported_names.sh compare LIBRARY FILE    fails when the names are not those of the reviewed FILE
#   exported_names.sh needed LIBRARY          fails when it loads a library that it is not known to need
#
# `./dev exports` refreshes the reviewed file.

set -euo pipefail
export LC_ALL=C

# The classes that stand in the global namespace, as they are mangled.
global_classes='(10IZQTString|15IZQTStringArray|14ObsoleteRegexp|12ObsoleteDate|12ObsoleteTime)'

mangled() {
    nm -D --defined-only "$1" | sed -E 's/^[0-9a-f]* +[A-Za-z] //' | sort -u
}

# The names for a reader: constructors and destructors collapse into one line. Left out is what only follows from a
# listed name and which compilers choose differently: names of run-time types, guards, thunks.
list() {
    mangled "$1" | c++filt |
        grep -Ev '^(typeinfo name for|guard variable for|(non-)?virtual thunk to|(covariant return )thunk to|construction vtable for|VTT for|TLS (init|wrapper) function for) ' |
        sort -u
}

own() {
    local strangers
    strangers=$(mangled "$1" | grep -Ev \
        "^_Z(|Z|GV|GVZ|T[VTISCWH]|Th[0-9n]+_|Tv[0-9n]+_[0-9n]+_|Tc[0-9nhv_]+_)(N[KVRO]*(3kvt|$global_classes)|$global_classes)" ||
        true)
    if [[ -n $strangers ]]; then
        echo "exported, but neither in namespace kvt nor one of the named global classes:"
        c++filt <<<"$strangers"
        return 1
    fi
    # Not by a pipe: grep ends at the first hit, and the end of whoever still writes to it would count as a failure.
    grep -q '^_ZN*[KVRO]*3kvt' <<<"$(mangled "$1")" || {
        echo "no name of namespace kvt is exported at all"
        return 1
    }
}

compare() {
    diff --label "reviewed: $2" --label "exported: $1" -u "$2" <(list "$1") || {
        echo "the exported names are not the reviewed ones; if they should be: ./dev exports"
        return 1
    }
}

# Each library that is loaded costs the start of every program, some of them much.
needed() {
    local strangers
    strangers=$(objdump -p "$1" | sed -n 's/^ *NEEDED *//p' |
        grep -Ev '^(libicuuc|libicudata|libdouble-conversion|libstdc\+\+|libgcc_s|libm|libc|ld-linux-[a-z0-9_-]+)\.so\.' ||
        true)
    if [[ -n $strangers ]]; then
        echo "loaded, but not known to be needed:"
        echo "$strangers"
        return 1
    fi
}

case ${1:-} in
list | own | compare | needed) "$@" ;;
*)
    sed -n '2,9s/^# \{0,1\}//p' "$0" >&2
    exit 2
    ;;
esac
