#!/usr/bin/env bash
# The file `symbols` of a Debian package: what a shared library exports, and since which version.
#
#   debian_symbols.sh LIBRARY PACKAGE VERSION FILE

set -euo pipefail
export LC_ALL=C

library=$1 package=$2 version=$3 file=$4
soname=$(objdump -p "$library" | awk '$1 == "SONAME" { print $2 }')
mkdir -p "$(dirname -- "$file")"
{
    printf '%s %s #MINVER#\n' "$soname" "$package"
    nm -D --defined-only "$library" | awk -v version="$version" '{ print " " $3 "@Base " version }' | sort -u
} >"$file"
