#!/usr/bin/env bash
# Makes one C++ program of the code in a guide, so that what the guide shows compiles, runs and is true.
#
#   guide_code.sh GUIDE.md PROGRAM.cpp
#
# The C++ blocks of a guide are taken for the pieces of one function, in their order; their #include lines go before it.
# What such code needs and a reader does not, stands before its block in a comment that begins with "<!-- cpp". A line
#
#     EXPRESSION;   // VALUE
#
# whose VALUE is a text in quotes, a number, true or false, becomes a check that this is what comes out.

set -euo pipefail
export LC_ALL=C.UTF-8

guide=$(realpath -- "$1")
awk -v guide="$guide" '
    /^```cpp$/ || /^<!-- cpp$/ { inside = 1; ++blocks; body = body "#line " (NR + 1) " \"" guide "\"\n"; next }
    /^```$/ || (/^-->$/ && inside) { inside = 0; next }
    !inside { next }
    /^#include/ { includes = includes $0 "\n"; body = body "\n"; next }
    match($0, /; +\/\/ ("[^"]*"|-?[0-9]+(\.[0-9]+)?|true|false)$/) {
        value = substr($0, RSTART)
        sub(/^; +\/\/ /, "", value)
        body = body "guide::check(__LINE__, (" substr($0, 1, RSTART - 1) "), " value ");\n"
        next
    }
    { body = body $0 "\n" }
    END {
        if (!blocks) {
            print guide ": no C++ in it" > "/dev/stderr"
            exit 1
        }
        printf "#include <house/guide_code.h>\n%s\nstatic void readGuide() {\n%s}\n\n", includes, body
        print "int main() {\n    return guide::run(readGuide);\n}"
    }' "$guide" >"$2.part"
mv "$2.part" "$2"
