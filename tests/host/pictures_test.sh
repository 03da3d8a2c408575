#!/usr/bin/env bash
# The pictures of data are what their script makes of the data now, also of the table in bench/README.md, and the table in
# docs/scale.md has the figures of its picture.
#
#   pictures_test.sh KVT

set -euo pipefail

kvt=$1
root=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")/../..")
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT

"$root/docs/pictures/make.sh" "$kvt" "$work"
status=0
for picture in lost.svg speed.svg conversions.svg; do
    diff "$root/docs/pictures/$picture" "$work/$picture" || status=1
done
while IFS=$'\t' read -r what rate; do
    what=${what//|/\\|}
    if ! grep -qF "| $what | $rate |" "$root/docs/scale.md"; then
        printf 'docs/scale.md has no row "| %s | %s |"\n' "$what" "$rate"
        status=1
    fi
done <"$root/docs/pictures/speed.tsv"
[[ $(grep -c 'fill="#c0504d"' "$work/lost.svg") -gt 0 ]] || { echo "lost.svg shows nothing lost" && status=1; }
exit $status
