#!/usr/bin/env bash
# Holds the example in the README to the program that is built from it.
#
#   readme_example.sh code README SOURCE      the README's C++ block is the SOURCE
#   readme_example.sh output README PROGRAM   the README's "text" block is what the PROGRAM prints, and it ends well
#   readme_example.sh notices README          `output` fails for a program that prints the block and ends by status 1

set -euo pipefail
export LC_ALL=C.UTF-8

readme=$2

# block LANGUAGE: the first block of the README that is fenced as that.
block() {
    awk -v fence="\`\`\`$1" '
        inside && /^```$/ { exit }
        inside { print }
        $0 == fence { inside = 1 }' "$readme"
}

# The program's status would be lost in a process substitution, so that its output is taken first.
output() {
    local printed
    printed=$("$1")
    diff -u <(block text) - <<<"$printed"
}

notices() {
    local status=0
    program=$(mktemp)
    trap 'rm -f "$program"' EXIT
    printf '#!/bin/sh\ncat <<"END"\n%s\nEND\nexit "$STATUS"\n' "$(block text)" >"$program"
    chmod +x "$program"
    STATUS=0 "$0" output "$readme" "$program"
    STATUS=1 "$0" output "$readme" "$program" || status=$?
    [[ $status -ne 0 ]]
}

case $1 in
code) diff -u <(block cpp) "$3" ;;
output) output "$3" ;;
notices) notices ;;
*) exit 2 ;;
esac
