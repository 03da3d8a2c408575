#!/usr/bin/env bash
# Performs the tutorial and the story in docs, on the same data, with the kvt command as it was built.
#
#   examples/demo.sh [PROGRAM | BUILD-FOLDER]     or KVT=PROGRAM examples/demo.sh
#
# The commands stand in these two pages and nowhere else. Each is shown as it stands there and run in a folder that is gone
# afterwards. What it really prints follows, and its exit status if that is not 0.

set -euo pipefail
export LC_ALL=C.UTF-8 NO_COLOR=1

kvt=${1:-${KVT:-build/release/tools/kvt/kvt}}
if [[ -d $kvt ]]; then
    kvt=$kvt/tools/kvt/kvt
fi
kvt=$(realpath -- "$kvt")
repository=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")/..")
work=$(mktemp -d)
trap 'rm -rf -- "$work"' EXIT

mkdir -p "$work/bin" "$work/story/examples"
ln -s "$kvt" "$work/bin/kvt"
ln -s "$repository/examples/data" "$work/story/examples/data"
export PATH=$work/bin:$PATH
cd "$work/story"

# perform COMMAND, which has a prompt before each line.
perform() {
    local status=0
    printf '%s\n' "$1"
    bash -c "$(sed 's/^[$>] //' <<<"$1")" </dev/null 2>&1 || status=$?
    if [[ $status -ne 0 ]]; then
        printf '[exit status %s]\n' "$status"
    fi
}

count=0
inside=no
while IFS= read -r line; do
    case $inside:$line in
    no:'## '*) printf '\n== %s\n' "${line#'## '}" ;;
    no:'```console')
        printf '\n'
        inside=yes
        ;;
    yes:'```') inside=no ;;
    yes:'$ '*)
        command=$line
        while [[ $command == *\\ ]] && IFS= read -r line; do
            command+=$'\n'$line
        done
        perform "$command"
        count=$((count + 1))
        ;;
    esac
done < <(cat -- "$repository/docs/tutorial.md" "$repository/docs/story.md")

if [[ $count -eq 0 ]]; then
    echo "demo: there is nothing to perform in $repository/docs" >&2
    exit 2
fi
