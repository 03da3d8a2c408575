#!/usr/bin/env bash
# Makes the pictures that show data: which cells of the tutorial's table could not be translated, and what translating
# costs beside other programs, from the figures in speed.tsv, which bench/translate_bench.sh writes; and how fast the library
# converts beside ICU and iconv, from the table in bench/README.md.
#
#   docs/pictures/make.sh KVT FOLDER
#
# KVT is the program, and FOLDER, such as docs/pictures, gets lost.svg, speed.svg and conversions.svg. All are read on light
# and on dark.

set -euo pipefail
export LC_ALL=C.UTF-8

kvt=$(realpath -- "${1:?usage: make.sh KVT FOLDER}")
folder=$(realpath -- "${2:?usage: make.sh KVT FOLDER}")
cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.."

lost() {
    local table=examples/data/members.windows-1252.csv work
    work=$(mktemp -d)
    "$kvt" translate --from windows-1252 --delimiter ';' --date 'Geboren=%d.%m.%Y' --date 'Eingetreten=%Y-%m-%d' \
        --number Beitrag=de --reject "$work/bad.csv" --report "$work/report.csv" "$table" >/dev/null 2>&1 || [[ $? == 1 ]]
    {
        head -n 1 "$table" | tr -d '\r'
        echo "$(($(wc -l <"$table")))"
        "$kvt" translate --no-header --out-delimiter tab --keep 2,3,6 "$work/report.csv" 2>/dev/null | tail -n +2
    } | awk -F '\t' '
        NR == 1 { columns = split($0, names, ";"); next }
        NR == 2 { rows = $1; next }
        { at[$1, $2] = $3 }
        END {
            print "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 700 " 60 + 22 * (rows - 1) "\" font-family=\"sans-serif\" font-size=\"13\" fill=\"#777\">"
            print "  <title>Which cells could not be translated</title>"
            for (c = 1; c <= columns; ++c) {
                printf "  <text x=\"%d\" y=\"30\" text-anchor=\"middle\" font-weight=\"bold\">%s</text>\n", 10 + 120 * c, names[c]
            }
            for (r = 2; r <= rows; ++r) {
                y = 22 * r
                printf "  <text x=\"10\" y=\"%d\">row %d</text>\n", y + 13, r
                for (c = 1; c <= columns; ++c) {
                    number = (r, "") in at ? at[r, ""] : at[r, names[c]]
                    printf "  <rect x=\"%d\" y=\"%d\" width=\"112\" height=\"18\" rx=\"3\" fill=\"%s\"/>\n", 120 * c - 46, y, number ? "#c0504d" : "#8ba4bd"
                    if (number && !((r, "") in at && c > 1)) {
                        printf "  <text x=\"%d\" y=\"%d\" text-anchor=\"middle\" fill=\"#fff\">%s</text>\n", 10 + 120 * c, y + 13, number
                    }
                }
            }
            print "</svg>"
        }'
    rm -rf -- "$work"
}

speed() {
    awk -F '\t' '
        { name[NR] = $1; rate[NR] = $2; most = $2 > most ? $2 : most }
        END {
            print "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 700 " 20 + 28 * NR "\" font-family=\"sans-serif\" font-size=\"13\" fill=\"#777\">"
            print "  <title>What translating costs, in MB/s</title>"
            for (i = 1; i <= NR; ++i) {
                y = 28 * i - 14
                printf "  <text x=\"230\" y=\"%d\" text-anchor=\"end\">%s</text>\n", y + 14, name[i]
                printf "  <rect x=\"240\" y=\"%d\" width=\"%.1f\" height=\"20\" rx=\"3\" fill=\"%s\"/>\n", y, 1 + 380 * rate[i] / most, name[i] ~ /^kvt/ ? "#5b8c5a" : "#8ba4bd"
                printf "  <text x=\"%.1f\" y=\"%d\">%s</text>\n", 248 + 380 * rate[i] / most, y + 14, rate[i]
            }
            print "</svg>"
        }' docs/pictures/speed.tsv
}

# Of the table, the rows of text that is not ASCII to or from UTF-8. A row without a pair has that of the row above.
conversions() {
    awk -F ' *[|] *' '
        $2 ~ / to / || ($2 == "" && NF == 9) {
            pair = $2 == "" ? pair : $2
            if (pair ~ /UTF-8/ && $3 ~ /^(Latin|CJK)$/) {
                ++rows
                name[rows] = pair ", " $3
                for (way = 1; way <= 3; ++way) {
                    rate[rows, way] = $(3 + way)
                    most = rate[rows, way] > most ? rate[rows, way] : most
                }
            }
        }
        /^`convert_limits_bench`/ { exit }
        END {
            split("kvt ICU iconv", ways, " ")
            split("#5b8c5a #8ba4bd #b7b7b7", colour, " ")
            print "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 700 " 40 + 48 * rows "\" font-family=\"sans-serif\" font-size=\"12\" fill=\"#777\">"
            print "  <title>How fast text is converted, in GB/s of the source</title>"
            for (way = 1; way <= 3; ++way) {
                printf "  <rect x=\"%d\" y=\"10\" width=\"12\" height=\"12\" rx=\"3\" fill=\"%s\"/>\n", 160 + 80 * way, colour[way]
                printf "  <text x=\"%d\" y=\"21\">%s</text>\n", 178 + 80 * way, ways[way]
            }
            for (r = 1; r <= rows; ++r) {
                y = 48 * r - 12
                printf "  <text x=\"230\" y=\"%d\" text-anchor=\"end\">%s</text>\n", y + 25, name[r]
                for (way = 1; way <= 3; ++way) {
                    printf "  <rect x=\"240\" y=\"%d\" width=\"%.1f\" height=\"11\" rx=\"3\" fill=\"%s\"/>\n", y + 13 * (way - 1), 1 + 380 * rate[r, way] / most, colour[way]
                    printf "  <text x=\"%.1f\" y=\"%d\">%s</text>\n", 248 + 380 * rate[r, way] / most, y + 13 * way - 3, rate[r, way]
                }
            }
            print "</svg>"
        }' bench/README.md
}

lost >"$folder/lost.svg"
speed >"$folder/speed.svg"
conversions >"$folder/conversions.svg"
