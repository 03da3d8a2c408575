#!/usr/bin/env bash
# What a program that was built with the last version finds in this one: names, parameters, the layout of what the public
# headers show. docs/abi.md has the rules.
#
#   abi.sh write LIBRARY SOURCES     describes LIBRARY, which has debug information, in tests/house/abi/VERSION.abi.xz
#   abi.sh compare LIBRARY SOURCES   fails where it is not what its version promises beside the description that is there

set -euo pipefail
export LC_ALL=C.UTF-8

[[ $# -eq 3 && ($1 == write || $1 == compare) ]] || {
    sed -n '2,7s/^# \{0,1\}//p' "$0" >&2
    exit 2
}
library=$2 sources=$3
folder=$sources/tests/house/abi
version=$(sed -n 's/^ *VERSION \([0-9.]*\)$/\1/p' "$sources/CMakeLists.txt")

complain() {
    printf 'abi: %s\n' "$*" >&2
    exit 1
}

write() {
    rm -f "$folder"/*.abi.xz
    abidw --exported-interfaces-only --drop-undefined-syms --no-corpus-path --no-comp-dir-path --no-show-locs "$library" |
        xz -9e >"$folder/$version.abi.xz"
}

# differs OPTION...: whether abidiff finds what these options leave in; it is shown then.
differs() {
    local status=0
    abidiff --suppressions "$folder/others.ini" --no-show-locs "$@" "$work/last.abi" "$library" >"$work/report" ||
        status=$?
    # 1 and 2: it could not be done.
    [[ $((status & 3)) -eq 0 ]] || complain "abidiff failed: $(cat "$work/report")"
    [[ $status -eq 0 ]] || cat "$work/report" >&2
    [[ $status -ne 0 ]]
}

compare() {
    local description last
    description=$(echo "$folder"/*.abi.xz)
    [[ -f $description ]] || complain "$folder has to have one description"
    last=$(basename "$description" .abi.xz)
    work=$(mktemp -d)
    trap 'rm -rf "$work"' EXIT
    xz -dc "$description" >"$work/last.abi"

    if differs --no-added-syms && [[ ${version%%.*} == "${last%%.*}" ]]; then
        complain "programs that were built with $last may not run with this library: it takes another major version"
    fi
    # Until a version is out, names may come to it.
    if [[ $version == "$last" ]] && ! grep -q "^## \[$last\]" "$sources/CHANGELOG.md"; then
        return
    fi
    if [[ ${version%.*} == "${last%.*}" ]] && differs; then
        complain "names came to the library since $last is out: it takes another minor version"
    fi
    grep -Eq "^## \[($version|Unreleased)\]" "$sources/CHANGELOG.md" ||
        complain "CHANGELOG.md does not say what $version is"
}

"$1"
