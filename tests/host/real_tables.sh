#!/usr/bin/env bash
# Fetches the npm packages whose tables real_tables_test reads, once for each build, and runs it.
#
#   real_tables.sh TEST FOLDER
#
# Ends with 77, which is a test that was left out, where npm cannot fetch, or ctest is run where nobody installed it.

set -euo pipefail

test=$(realpath -- "$1") folder=$2
mkdir -p "$folder"
cd "$folder"
for package in vega-datasets@3.2.1 csv-spectrum@2.0.0; do
    [[ -d $package ]] && continue
    command -v npm >/dev/null || { printf 'left out: npm is not installed\n' && exit 77; }
    archive=$(npm pack --silent "$package" 2>/dev/null | tail -n 1) || true
    [[ -f $archive ]] || { printf 'left out: npm cannot fetch %s\n' "$package" && exit 77; }
    mkdir -p "$package.new"
    tar xzf "$archive" -C "$package.new" --strip-components=1
    rm -f "$archive"
    mv "$package.new" "$package"
done
"$test"
