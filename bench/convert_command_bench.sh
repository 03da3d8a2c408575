#!/usr/bin/env bash
# `kvt convert` of a large file beside `iconv` and `uconv`, with and without losses, and beside what the library alone
# needs for it.
#
#   bench/convert_command_bench.sh KVT [MEBIBYTES [ROUNDS]]
#
# KVT is the program, built as for release. Files of MEBIBYTES (1024) are made from a fixed seed, as words in a random
# order, and converted to standard output, which is a file. The best of ROUNDS (3) counts. What the library alone needs is
# taken from `--dry-run` with one encoding, which reads and converts, but does not write. That all say the same is
# checked; of texts with losses, where the programs substitute differently, that they say something.

set -euo pipefail
export LC_ALL=C

kvt=$(realpath -- "${1:?usage: convert_command_bench.sh KVT [MEBIBYTES [ROUNDS]]}")
mebibytes=${2:-1024}
rounds=${3:-3}
folder=$(mktemp -d)
trap 'rm -rf -- "$folder"' EXIT
cd -- "$folder"

# text NAME SENTENCE: a file of UTF-8.
text() {
    awk -v sentence="$2" 'BEGIN {
        srand(1)
        count = split(sentence, words, " ")
        while (done < 4194304) {
            line = ""
            for (i = 0; i < 12; ++i) {
                line = line words[1 + int(rand() * count)] " "
            }
            print line
            done += length(line) + 1
        }
    }' >part
    for ((i = 0; i < mebibytes; i += 4)); do
        cat part
    done >"$1"
}

# Nanoseconds of the fastest round.
best() {
    local round before after
    for ((round = 0; round < rounds; ++round)); do
        before=$(date +%s%N)
        "$@" >out 2>/dev/null || true
        after=$(date +%s%N)
        echo $((after - before))
    done | sort -n | head -n 1
}

same() {
    cmp "$1" out || echo "   differs: $2"
}

# row NAME FROM TO FILE, without losses.
row() {
    local ours alone theirs others
    ours=$(best "$kvt" convert --from "$2" --to "$3" "$4")
    mv out ours
    alone=$(best "$kvt" convert --dry-run --from "$2" --to "$3" "$4")
    theirs=$(best iconv -f "$2" -t "$3" "$4")
    same ours iconv
    others=$(best uconv -f "$2" -t "$3" "$4")
    same ours uconv
    print "$1" "$4" "$ours" "$alone" "$theirs" "$others"
}

# lossy NAME FROM TO FILE
lossy() {
    local ours alone theirs others
    ours=$(best "$kvt" convert --on-error replace --from "$2" --to "$3" "$4")
    alone=$(best "$kvt" convert --dry-run --from "$2" --to "$3" "$4")
    theirs=$(best iconv -c -f "$2" -t "$3" "$4")
    others=$(best uconv --callback substitute -f "$2" -t "$3" "$4")
    print "$1, losses" "$4" "$ours" "$alone" "$theirs" "$others"
}

print() {
    awk -v name="$1" -v size="$(stat -c %s "$2")" -v ours="$3" -v alone="$4" -v theirs="$5" -v others="$6" 'BEGIN {
        printf "%-42s  %8.1f  %6.0f  %8.2f  %12.2f  %12.2f\n", name, ours / 1e6, size / ours * 1e3, alone / ours,
            theirs / ours, others / ours
    }'
}

text ascii 'The quick brown Fox jumps over the lazy Dog, and the dog does not mind it.'
text latin "Größere Brücken führen über die Flüsse; l'été, déjà, où l'élève rêve à côté."
text japanese 'いろはにほへと ちりぬるを わかよたれそ 常ならむ、 有為の奥山 今日越えて 浅き夢見じ 酔ひもせず。'
text mixed "Größere Brücken слово führen 日本 über die Flüsse; l'été déjà œuvre Жизнь rêve à côté."
iconv -f UTF-8 -t UTF-16LE latin >latin16
iconv -f UTF-8 -t WINDOWS-1252 latin >latin1252
iconv -f UTF-8 -t SHIFT_JIS japanese >sjis

printf '%-42s  %8s  %6s  %8s  %12s  %12s\n' what ms MB/s 'of alone' 'times iconv' 'times uconv'
row 'UTF-8 to UTF-16LE, ASCII' UTF-8 UTF-16LE ascii
row 'UTF-8 to UTF-16LE, Latin' UTF-8 UTF-16LE latin
row 'UTF-8 to UTF-16LE, Japanese' UTF-8 UTF-16LE japanese
row 'UTF-16LE to UTF-8, Latin' UTF-16LE UTF-8 latin16
row 'UTF-8 to UTF-32LE, Latin' UTF-8 UTF-32LE latin
row 'windows-1252 to UTF-8, Latin' windows-1252 UTF-8 latin1252
row 'UTF-8 to windows-1252, Latin' UTF-8 windows-1252 latin
row 'Shift_JIS to UTF-8, Japanese' Shift_JIS UTF-8 sjis
row 'UTF-8 to Shift_JIS, Japanese' UTF-8 Shift_JIS japanese
lossy 'UTF-8 to windows-1252, words' UTF-8 windows-1252 mixed
lossy 'UTF-8 to US-ASCII, letters' UTF-8 US-ASCII latin
lossy 'windows-1252 read as UTF-8' UTF-8 UTF-16LE latin1252
lossy 'Shift_JIS to windows-1252, all' Shift_JIS windows-1252 sjis

# dry WHAT ONE FOUR: what it takes to try encodings, in conversions to one of them.
dry() {
    local one four
    one=$(best "$kvt" convert --on-error replace --from UTF-8 --to "$2" latin)
    four=$(best "$kvt" convert --dry-run --from UTF-8 --to "$3" latin)
    awk -v name="--dry-run, four encodings, $1" -v one="$one" -v four="$four" 'BEGIN {
        printf "%-42s  %8.1f  %.2f conversions to one\n", name, four / 1e6, four / one
    }'
}

dry 'no losses' windows-1252 windows-1252,ISO-8859-1,ISO-8859-15,UTF-16LE
dry losses KOI8-R windows-1252,ISO-8859-2,KOI8-R,Shift_JIS
