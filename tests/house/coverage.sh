#!/usr/bin/env bash
# Which lines and branches of the library and the command no test runs.
#
#   coverage.sh           builds preset `coverage`, runs all tests there, and reports
#   coverage.sh report    reports on what has been run in that build so far
#
# Writes to build/coverage:
#
#   coverage.txt    a row for each file, with the lines that are left out
#   coverage.csv    the same as data
#   lines.tsv       each line that is left out: its file, its number, and what stands there
#
# and to tests/trust/coverage.tsv lines and branches, run and in all, of kvt/ and of tools/.
#
# Branches that the compiler adds for exceptions are not counted: they stand in no source.

set -euo pipefail
export LC_ALL=C.UTF-8
cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.."

folder=build/coverage
if [[ ${1:-} != report ]]; then
    cmake --preset coverage --log-level=WARNING >&2
    cmake --build --preset coverage >&2
    find "$folder" -name '*.gcda' -delete
    ctest --preset coverage -j "$(nproc)" --output-log "$folder/ctest.log" >&2 || echo "coverage: some tests fail" >&2
fi

gcovr --root . --filter 'kvt/' --filter 'tools/' --exclude-throw-branches --exclude-unreachable-branches \
    --object-directory "$folder" --txt "$folder/coverage.txt" --csv "$folder/coverage.csv" --json "$folder/coverage.json" \
    -j "$(nproc)" >&2

# filename,line_total,line_covered,line_percent,branch_total,branch_covered,...
awk -F , -v OFS='\t' '
    NR > 1 {
        part = substr($1, 1, index($1, "/"))
        lines[part] += $2; run[part] += $3; branches[part] += $5; taken[part] += $6
    }
    END {
        print "part", "lines", "run", "of 100 lines", "branches", "taken", "of 100 branches"
        for (part in lines) {
            print part, lines[part], run[part], sprintf("%.2f", 100 * run[part] / lines[part]), branches[part],
                taken[part], sprintf("%.2f", 100 * taken[part] / branches[part])
        }
    }' "$folder/coverage.csv" | { read -r head && echo "$head" && sort; } >tests/trust/coverage.tsv

python3 - "$folder/coverage.json" >"$folder/lines.tsv" <<'PYTHON'
import json
import sys

for file in json.load(open(sys.argv[1]))["files"]:
    source = open(file["file"], encoding="utf-8").read().split("\n")
    for line in file["lines"]:
        if line["count"] == 0 and not line.get("gcovr/noncode"):
            print(file["file"], line["line_number"], source[line["line_number"] - 1].strip(), sep="\t")
PYTHON
cat tests/trust/coverage.tsv
