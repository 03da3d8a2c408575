#!/usr/bin/env bash
# Holds an example in the README to the program that is built from it.
#
#   readme_example.sh code README SOURCE [NUMBER]      the README's C++ block of that number (1) is the SOURCE
#   readme_example.sh output README PROGRAM [NUMBER]   the README's first "text" block after it is what the PROGRAM
#                                                      prints, in an empty folder

set -euo pipefail
export LC_ALL=C.UTF-8

# block LANGUAGE FILE: the C++ block of the number; for "text", the first after that.
block() {
    awk -v language="$1" -v number="$number" '
        inside && /^```$/ { exit }
        inside { print }
        /^```cpp$/ { ++seen }
        $0 == "```" language && seen == number { inside = 1 }' "$2"
}

# Runs a program, which may leave files behind, in a folder that is removed again.
run() {
    local folder program
    program=$(realpath "$1")
    folder=$(mktemp -d)
    trap 'rm -rf "$folder"' EXIT
    cd "$folder"
    "$program"
}

number=${4:-1}
case $1 in
code) diff -u <(block cpp "$2") "$3" ;;
output) diff -u <(block text "$2") <(run "$3") ;;
*) exit 2 ;;
esac
