#!/usr/bin/env bash
# The commands `match`, `text upper` and `date format` of kvt beside what a user would take instead: `grep -P`, `sed` in a
# locale of UTF-8, and `dconv` (package dateutils) and Miller (package miller).
#
#   bench/command_bench.sh KVT [MEBIBYTES [ROUNDS]]
#
# KVT is the program, built as for release. Files of MEBIBYTES (256) are made from a fixed seed: lines of a log, with a
# date in one of a thousand, text of western Europe (without ß, which sed leaves as it is), and dates. The best of ROUNDS (3) counts, in the processor's time. That
# both say the same is checked. The last column is the time of kvt over that of the other; the limits are 1, and 2 for a
# pattern that begins with nothing fixed. What is not installed is left out.

set -euo pipefail

kvt=$(realpath -- "${1:?usage: command_bench.sh KVT [MEBIBYTES [ROUNDS]]}")
bytes=$((${2:-256} * 1024 * 1024))
rounds=${3:-3}
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"
export LC_ALL=C.UTF-8

LC_ALL=C awk -v bytes="$bytes" 'BEGIN {
    srand(1)
    lines = split("12:03:55.120 INFO  [pool-3] request 4711 from 10.0.12.7 took 15 ms, 2048 bytes sent|" \
        "12:03:55.121 DEBUG [pool-1] cache hit for key user/77/profile, age 35 s|" \
        "12:03:56.007 WARN  [main] queue has 120 of 128 places taken|" \
        "12:03:57.003 INFO  [pool-3] session 9f3c-22 opened, 3 others active", line, "|")
    while (done < bytes) {
        text = rand() < 0.001 ? "2020-01-31 12:04:00 ERROR [main] disk full" : line[1 + int(rand() * lines)]
        print text
        done += length(text) + 1
    }
}' >log.txt
LC_ALL=C awk -v bytes="$bytes" 'BEGIN {
    srand(2)
    words = split("Schöne Brücken führen über die Höfe l'"'"'été déjà où l'"'"'élève rêve à côté and the lazy dog", word, " ")
    while (done < bytes) {
        text = word[1 + int(rand() * words)]
        for (i = 0; i < 9; ++i) text = text " " word[1 + int(rand() * words)]
        print text
        done += length(text) + 1
    }
}' >text.txt
LC_ALL=C awk -v bytes="$((bytes / 8))" 'BEGIN {
    srand(3)
    for (; done < bytes; done += 9) printf "%04d%02d%02d\n", 1930 + int(rand() * 100), 1 + int(rand() * 12), 1 + int(rand() * 28)
}' >dates.txt

# Hundredths of a second of the processor, of the fastest round.
best() {
    local round TIMEFORMAT='%U %S'
    for ((round = 0; round < rounds; ++round)); do
        { time "$@" >out 2>/dev/null; } 2>&1 | awk '{ printf "%d\n", ($1 + $2) * 1000 }'
    done | sort -n | head -n 1
}

# row NAME LIMIT OURS THEIRS: names of functions.
row() {
    "$3" >ours
    "$4" >theirs
    cmp ours theirs
    awk -v name="$1" -v limit="$2" -v ours="$(best "$3")" -v theirs="$(best "$4")" 'BEGIN {
        printf "%-44s  %8d  %8d  %6.2f  %5s%s\n", name, ours, theirs, ours / theirs, limit,
            (ours / theirs > limit) ? "  MISSED" : ""
    }'
}

match() { "$kvt" match "$pattern" log.txt; }
grep_perl() { grep -P -- "$pattern" log.txt || true; }
upper() { "$kvt" text upper text.txt; }
sed_upper() { sed 's/.*/\U&/' text.txt; }
format() { "$kvt" date format -f dates.txt %d.%m.%Y; }
dconv() { "$(command -v dateutils.dconv || command -v dconv)" -i %Y%m%d -f %d.%m.%Y <dates.txt; }
miller() { mlr --infer-none --nidx put '$1 = strftime(strptime($1, "%Y%m%d"), "%d.%m.%Y")' dates.txt; }

printf '%-44s  %8s  %8s  %6s  %5s\n' what 'kvt ms' 'other ms' ratio limit
for pattern in 'ERROR \[(\w+)\] (.*)' '\d{4}-\d\d-\d\d \d\d:\d\d' '(\d+)-(\d+)-(\d+)' 'session [0-9a-f]{4}-'; do
    row "match '$pattern', grep -P" 1 match grep_perl
done
for pattern in '\w+ \[main\] disk' '(open|activ)ed?,' '[a-z]+ hit'; do
    row "match '$pattern', grep -P" 2 match grep_perl
done
row 'text upper, sed' 1 upper sed_upper
if command -v dateutils.dconv >/dev/null || command -v dconv >/dev/null; then
    row 'date format, dconv' 1 format dconv
fi
if command -v mlr >/dev/null; then
    row 'date format, Miller' 1 format miller
fi
