#!/usr/bin/env bash
# Shows the kvt command on real text in several encodings: what comes out, and what is lost where.
#
#   examples/demo.sh [PROGRAM | BUILD-FOLDER]     or KVT=PROGRAM examples/demo.sh
#
# The texts are towns and years: of their first mention, their charter, their founding.

set -euo pipefail
export LC_ALL=C.UTF-8 NO_COLOR=1

kvt=${1:-${KVT:-build/release/tools/kvt/kvt}}
if [[ -d $kvt ]]; then
    kvt=$kvt/tools/kvt/kvt
fi
kvt=$(realpath -- "$kvt")
cd -- "$(dirname -- "${BASH_SOURCE[0]}")/data"
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT

say() { printf '\n== %s\n' "$*"; }

# Shows a command and runs it, messages and data together, and tells its exit status.
show() {
    local status=0
    printf '\n$ kvt'
    printf ' %q' "$@"
    printf '\n'
    "$kvt" "$@" 2>&1 || status=$?
    printf '[exit status %s]\n' "$status"
}

say "Text in four encodings comes out as UTF-8"
for file in *.windows-1252.txt *.shift_jis.txt *.koi8-r.txt *.utf-16be.txt; do
    encoding=${file%.txt}
    encoding=${encoding#*.}
    case $encoding in
    shift_jis) encoding=Shift_JIS ;;
    koi8-r) encoding=KOI8-R ;;
    utf-16be) encoding=UTF-16BE ;;
    esac
    show convert --from "$encoding" --to UTF-8 --verify "$file"
done

say "A character that the target does not have stops the conversion, and nothing is written"
show convert --from UTF-16BE --to windows-1252 world.utf-16be.txt -o "$work/world.txt"
[[ ! -e $work/world.txt ]]

say "Which encoding would lose least?"
show convert --from UTF-16BE --dry-run --to windows-1252,ISO-8859-2,KOI8-R,Shift_JIS,UTF-8 world.utf-16be.txt

say "Or it goes on and tells of every loss"
show convert --from UTF-8 --to windows-1252 --on-error report poland.utf-8.txt -o "$work/poland.txt"
say "... of which this is the result, shown as UTF-8 again"
show convert --from windows-1252 --to UTF-8 "$work/poland.txt"

say "Losses as JSON, one on each line, for other programs"
show convert --from windows-1252 --to ISO-8859-1 --report "$work/losses.jsonl" europe.windows-1252.txt -o "$work/europe.txt"
cat "$work/losses.jsonl"

say "Any text in plain ASCII without separators, and back"
show wwjd encode poland.utf-8.txt -o "$work/poland.wwjd"
cat "$work/poland.wwjd"
printf '\n'
show wwjd decode "$work/poland.wwjd"
