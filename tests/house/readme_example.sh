#!/usr/bin/env bash
# Holds the example in the README to the program that is built from it.
#
#   readme_example.sh code README SOURCE      the README's first C++ block is the SOURCE
#   readme_example.sh output README PROGRAM   the README's first "text" block after it is what the PROGRAM prints

set -euo pipefail
export LC_ALL=C.UTF-8

# block LANGUAGE FILE: the first fenced block of that language; for "text", the first after the C++ block.
block() {
    awk -v language="$1" '
        inside && /^```$/ { exit }
        inside { print }
        /^```cpp$/ { seen = 1 }
        $0 == "```" language && (language == "cpp" || seen) { inside = 1 }' "$2"
}

case $1 in
code) diff -u <(block cpp "$2") "$3" ;;
output) diff -u <(block text "$2") <("$3") ;;
*) exit 2 ;;
esac
