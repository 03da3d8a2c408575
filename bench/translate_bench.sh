#!/usr/bin/env bash
# `kvt translate` beside what a user would write: `iconv` piped into Miller, and `iconv` alone.
#
#   bench/translate_bench.sh KVT [MEBIBYTES [ROUNDS [FIGURES]]]
#
# KVT is the program, built as for release. A file of MEBIBYTES (1024) is made from a fixed seed: eight columns, two of
# them dates, one a number with a decimal comma, text of western Europe in windows-1252. It becomes UTF-8, with dates in
# the form of ISO 8601 and plain decimals. The best of ROUNDS (3) counts, which take turns, so that a machine that is busy for
# a while is so for all. That both say the same is checked. Miller (package miller) is left out where it is not installed; it
# gets a part of the file, and one round, since it takes so long. Rates are by the clock and by the time of processors, which
# says more on a machine that has other work; FIGURES gets the latter, as docs/pictures/speed.tsv has them.

set -euo pipefail
export LC_ALL=C

kvt=$(realpath -- "${1:?usage: translate_bench.sh KVT [MEBIBYTES [ROUNDS [FIGURES]]]}")
bytes=$((${2:-1024} * 1024 * 1024))
rounds=${3:-3}
figures=$(realpath -m -- "${4:-/dev/null}")
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

# One round: seconds of the clock, and of processors, go to a file called by the name. What is written is thrown away, so
# that the file system has no say.
TIMEFORMAT='%R %U %S'
take() {
    local name=$1
    shift
    { time "$@" >/dev/null 2>&1; } 2>>"times of $name"
}

row() {
    awk -v name="$1" -v size="$2" -v base="$base" '
        { cpu = $2 + $3 }
        NR == 1 || $1 < clock { clock = $1 }
        NR == 1 || cpu < least { least = cpu }
        END {
            printf "%-28s  %9.0f  %9.0f  %12.2f\n", name, size / clock / 1e6, size / least / 1e6, size / least / 1e6 / base
            if (name !~ /threads/) {
                printf "%s\t%.0f\n", name, size / least / 1e6 >>"rates"
            }
        }' "times of $1"
}

size=$(stat -c %s in.csv)
iconv -f WINDOWS-1252 -t UTF-8 in.csv >utf8.csv
for ((round = 0; round < rounds; ++round)); do
    take 'iconv alone' iconv -f WINDOWS-1252 -t UTF-8 in.csv
    take 'kvt, one thread' "$kvt" "${canonical[@]}" --threads 1 in.csv
    take 'kvt, two threads' "$kvt" "${canonical[@]}" --threads 2 in.csv
    take 'kvt, dates written as ISO' "$kvt" "${job[@]}" --threads 1 in.csv
    take 'kvt, rows alone' "$kvt" translate --threads 1 --delimiter ';' utf8.csv
done
base=$(awk -v size="$size" 'NR == 1 || $2 + $3 < least { least = $2 + $3 } END { print size / least / 1e6 }' \
    'times of iconv alone')
printf '%-28s  %9s  %9s  %12s\n' what MB/s 'MB/s CPU' 'CPU of iconv'
row 'kvt, rows alone' "$(stat -c %s utf8.csv)"
row 'kvt, two threads' "$size"
row 'kvt, one thread' "$size"
row 'kvt, dates written as ISO' "$size"
row 'iconv alone' "$size"
if command -v mlr >/dev/null; then
    take 'iconv | Miller' miller small.csv
    row 'iconv | Miller' "$(stat -c %s small.csv)"
    miller small.csv >theirs
    "$kvt" "${job[@]}" small.csv >ours 2>/dev/null
    cmp ours theirs
fi
cp -- rates "$figures"
