#!/usr/bin/env bash
# `kvt translate` beside what a user would write: `iconv` piped into Miller, and `iconv` alone.
#
#   bench/translate_bench.sh KVT [MEBIBYTES [ROUNDS]]
#
# KVT is the program, built as for release. A file of MEBIBYTES (1024) is made from a fixed seed: eight columns, two of
# them dates, one a number with a decimal comma, text of western Europe in windows-1252. It becomes UTF-8, with dates in
# the form of ISO 8601 and plain decimals. The best of ROUNDS (3) counts. That both say the same is checked. Miller
# (package miller) is left out where it is not installed; it gets a part of the file, since it takes so long.

set -euo pipefail
export LC_ALL=C

kvt=$(realpath -- "${1:?usage: translate_bench.sh KVT [MEBIBYTES [ROUNDS]]}")
bytes=$((${2:-1024} * 1024 * 1024))
rounds=${3:-3}
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

awk -v bytes="$bytes" 'BEGIN {
    srand(1)
    split("M\374ller Gro\337mann Garc\355a \305ngstr\366m O'"'"'Neil Lef\350vre Pe\361a \326sterreicher Jones Brown", names, " ")
    split("K\366ln M\374nchen Z\374rich Gen\350ve M\341laga \305rhus Reykjav\355k London Paris Roma", cities, " ")
    split("open paid late", states, " ")
    split(",gepr\374ft,erste Mahnung verschickt,\366ffentlich,siehe Vertrag", notes, ",")
    print "id;name;born;city;amount;state;booked;note"
    while (done < bytes) {
        ++id
        line = sprintf("%d;%s;%02d.%02d.%d;%s;%d.%03d,%02d;%s;%02d.%02d.%d;%s", id, names[1 + int(rand() * 10)],
            1 + int(rand() * 28), 1 + int(rand() * 12), 1930 + int(rand() * 80), cities[1 + int(rand() * 10)],
            1 + int(rand() * 99), int(rand() * 1000), int(rand() * 100), states[1 + int(rand() * 3)],
            1 + int(rand() * 28), 1 + int(rand() * 12), 2015 + int(rand() * 10), notes[1 + int(rand() * 5)])
        print line
        done += length(line) + 1
    }
}' >in.csv
small=$((bytes < 33554432 ? bytes : 33554432))
head -c "$small" in.csv | sed '$d' >small.csv

job=(translate --from windows-1252 --delimiter ';' --date born=%d.%m.%Y --write-date born=%Y-%m-%d
    --date booked=%d.%m.%Y --write-date booked=%Y-%m-%d --number amount=de)
canonical=(translate --from windows-1252 --delimiter ';' --date born=%d.%m.%Y --date booked=%d.%m.%Y --number amount=de)
miller() {
    iconv -f WINDOWS-1252 -t UTF-8 "$1" | mlr --csv --fs semicolon --quote-original put '
        $born = strftime(strptime($born, "%d.%m.%Y"), "%Y-%m-%d");
        $booked = strftime(strptime($booked, "%d.%m.%Y"), "%Y-%m-%d");
        $amount = sub(gsub($amount, "[.]", ""), ",", ".")' 2>/dev/null ||
        iconv -f WINDOWS-1252 -t UTF-8 "$1" | mlr --csv --fs semicolon put '
            $born = strftime(strptime($born, "%d.%m.%Y"), "%Y-%m-%d");
            $booked = strftime(strptime($booked, "%d.%m.%Y"), "%Y-%m-%d");
            $amount = sub(gsub($amount, "[.]", ""), ",", ".")'
}

# Seconds of the fastest round.
best() {
    local round before after
    for ((round = 0; round < rounds; ++round)); do
        before=$(date +%s%N)
        "$@" >out 2>/dev/null
        after=$(date +%s%N)
        echo $((after - before))
    done | sort -n | head -n 1
}

row() {
    awk -v name="$1" -v size="$2" -v time="$3" -v base="$4" 'BEGIN {
        printf "%-34s  %9.1f  %9.1f  %12.2f\n", name, time / 1e6, size / time * 1e3, (size / time) / base
    }'
}

size=$(stat -c %s in.csv)
iconv_time=$(best iconv -f WINDOWS-1252 -t UTF-8 in.csv)
rate=$(awk -v size="$size" -v time="$iconv_time" 'BEGIN { print size / time }')
printf '%-34s  %9s  %9s  %12s\n' what ms MB/s 'times iconv'
row 'iconv alone' "$size" "$iconv_time" "$rate"
row 'kvt, one thread' "$size" "$(best "$kvt" "${canonical[@]}" --threads 1 in.csv)" "$rate"
row 'kvt, two threads' "$size" "$(best "$kvt" "${canonical[@]}" --threads 2 in.csv)" "$rate"
row 'kvt, dates written as ISO' "$size" "$(best "$kvt" "${job[@]}" --threads 1 in.csv)" "$rate"
iconv -f WINDOWS-1252 -t UTF-8 in.csv >utf8.csv
row 'kvt, rows alone' "$(stat -c %s utf8.csv)" "$(best "$kvt" translate --threads 1 --delimiter ';' utf8.csv)" "$rate"
if command -v mlr >/dev/null; then
    row 'iconv | Miller' "$(stat -c %s small.csv)" "$(rounds=1 best miller small.csv)" "$rate"
    miller small.csv >theirs
    "$kvt" "${job[@]}" small.csv >ours 2>/dev/null
    cmp ours theirs
fi
