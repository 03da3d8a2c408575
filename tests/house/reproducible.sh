#!/usr/bin/env bash
# Whether two builds of the last commit, in two folders and without ccache, give the same packages, byte by byte.
#
#   reproducible.sh FOLDER
#
# It takes two builds as for release, and writes what was compared to tests/trust/reproducible_builds.tsv.

set -euo pipefail
export LC_ALL=C.UTF-8
cd -- "$(dirname -- "${BASH_SOURCE[0]}")/../.."

folder=$PWD/$1
commit=$(git -c safe.directory="$PWD" rev-parse HEAD) # of now, whatever is committed meanwhile
SOURCE_DATE_EPOCH=$(git -c safe.directory="$PWD" log -1 --format=%ct "$commit")
export SOURCE_DATE_EPOCH CCACHE_DISABLE=1

# The names of the folders differ in length, too.
for copy in first the_second_one; do
    rm -rf "${folder:?}/$copy"
    mkdir -p "$folder/$copy"
    git -c safe.directory="$PWD" archive "$commit" | tar -x -C "$folder/$copy"
    [[ ! -d .deps ]] || cp -r .deps "$folder/$copy/.deps"
    (
        cd "$folder/$copy"
        cmake --preset package --log-level=WARNING
        cmake --build --preset package
        cd build/package && cpack -G DEB
    ) >&2
done

status=0
{
    printf 'file\tbytes\tin both folders\n'
    cd "$folder/first/build/package"
    for file in libkvt.so tools/kvt/kvt *.deb; do
        verdict="the same"
        cmp -s "$file" "$folder/the_second_one/build/package/$file" || verdict="different"
        printf '%s\t%s\t%s\n' "$file" "$(stat -L -c %s "$file")" "$verdict"
    done
} | tee tests/trust/reproducible_builds.tsv
! grep -q different tests/trust/reproducible_builds.tsv || status=1
exit "$status"
