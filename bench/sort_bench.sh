#!/usr/bin/env bash
# `kvt sort` beside the system's sort, on files that do not fit the memory that both are given.
#
#   bench/sort_bench.sh KVT [MEBIBYTES [MEMORY]]
#
# KVT is the program, built as for release; files of MEBIBYTES (1024) are sorted in MEMORY (128M). Each text is made
# anew from a fixed seed, and both sort it twice; the shorter time counts. That the results are the same is checked.
# Files and workspaces are in $TMPDIR; the machine should be idle, and have memory to cache the files.

set -euo pipefail
export LC_ALL=C

kvt=$(realpath -- "${1:?usage: sort_bench.sh KVT [MEBIBYTES [MEMORY]]}")
bytes=$((${2:-1024} * 1024 * 1024))
memory=${3:-128M}
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

# Lines of random words, of paths that begin alike, and of few different ones.
make_text() {
    awk -v kind="$1" -v bytes="$bytes" 'BEGIN {
        srand(1)
        letters = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789"
        for (i = 0; i < 5000; ++i) {
            word = ""
            for (n = 2 + int(rand() * 8); n > 0; --n) word = word substr(letters, 1 + int(rand() * 62), 1)
            words[i] = word
        }
        while (done < bytes) {
            if (kind == "paths") {
                line = "https://www.example.org/archive/" words[int(rand() * 20)] "/" int(rand() * 1000000000)
            } else if (kind == "few") {
                line = words[int(rand() * 5000)] " " words[int(rand() * 20)]
            } else {
                line = words[int(rand() * 5000)]
                for (n = int(rand() * 14); n > 0; --n) line = line " " words[int(rand() * 5000)]
            }
            print line
            done += length(line) + 1
        }
    }'
}

seconds() {
    local before after
    before=$(date +%s%N)
    "$@"
    after=$(date +%s%N)
    awk -v t=$((after - before)) 'BEGIN { printf "%.2f\n", t / 1e9 }'
}

shorter() { printf '%s\n%s\n' "$1" "$2" | sort -n | head -n 1; }

printf '%-6s  %8s  %8s  %9s\n' text kvt sort 'kvt/sort'
for text in words paths few; do
    make_text "$text" >in
    cat in >/dev/null
    ours=$(shorter "$(seconds "$kvt" sort --memory "$memory" in -o ours)" \
        "$(seconds "$kvt" sort --memory "$memory" in -o ours)")
    theirs=$(shorter "$(seconds sort -s -S "$memory" --parallel=1 in -o theirs)" \
        "$(seconds sort -s -S "$memory" --parallel=1 in -o theirs)")
    cmp ours theirs
    awk -v text="$text" -v ours="$ours" -v theirs="$theirs" \
        'BEGIN { printf "%-6s  %8.2f  %8.2f  %9.2f\n", text, ours, theirs, ours / theirs }'
    rm -f in ours theirs
done
