#!/usr/bin/env bash
# Breaks the library and the command in stated ways, one at a time, and looks whether the tests notice.
#
#   mutate.sh run [NAME-PATTERN...]     all, or those whose names match, such as 'codec.*'; results go to results.tsv
#   mutate.sh run --new                 those that have no result yet, as when a run was stopped
#   mutate.sh report                    writes what docs/trust.md shows, to tests/trust; a run does that at its end
#   mutate.sh check                     says whether the tables still fit the sources, and the results the tables
#
# The tables are the .txt files here. A break looks like this, with a blank line behind it, and its name is that of its
# table, a dot, and its own:
#
#   negative-zero: the sign of a negative zero is lost
#   kvt/codec/float_text.cpp
#   @ a line before it, where what is broken stands more than once: the first one behind that is meant
#   - what stands there, in one line of the file
#   + what stands there instead
#   ? the test program that has to notice, and the filter of its tests, where it need not run all
#   = why no test can notice, where none can
#
# It works on a copy of the repository in build/mutate, so that it can be stopped at any time.

set -euo pipefail
shopt -s nullglob
export LC_ALL=C.UTF-8

here=$(cd -- "$(dirname -- "${BASH_SOURCE[0]}")" && pwd)
repository=$(cd -- "$here/../.." && pwd)
results=$here/results.tsv
trust=$repository/tests/trust
copy=$repository/build/mutate
preset=dev
build=$copy/build/$preset
limit=300 # seconds for one test program: a break may never end

die() {
    printf 'mutate: %s\n' "$*" >&2
    exit 2
}

# ---- The tables

# Calls `$1` for each break, with its fields in variables of these names.
name='' title='' file='' behind='' old='' new='' reason=''
tests=() filter='' failing=''
for_each_break() {
    local table line
    for table in "$here"/*.txt; do
        name=''
        while IFS= read -r line || [[ -n $line ]]; do
            case $line in
            '#'*) ;;
            '')
                [[ -z $name ]] || "$1"
                name=''
                ;;
            '@ '*) behind=${line:2} ;;
            '- '*) old=${line:2} ;;
            '+') new='' ;;
            '+ '*) new=${line:2} ;;
            '? '*) tests+=("${line:2}") ;;
            '= '*) reason=${line:2} ;;
            *': '*)
                [[ -z $name ]] || die "$table: a blank line is missing before: $line"
                name=$(basename "$table" .txt).${line%%: *} title=${line#*: }
                file='' behind='' old='' new='' reason='' tests=()
                ;;
            *) file=$line ;;
            esac
        done <"$table"
        [[ -z $name ]] || "$1"
    done
}

# Writes the file of the break, below the folder $1, with the break in it. Fails where what it breaks does not stand there
# exactly once.
broken() {
    behind=$behind old=$old new=$new awk '
        BEGIN { behind = ENVIRON["behind"]; old = ENVIRON["old"]; open = behind == "" }
        !open && index($0, behind) { open = 1 }
        open && (at = index($0, old)) && !(behind != "" && found) {
            found += 1 + (index(substr($0, at + 1), old) > 0)
            $0 = substr($0, 1, at - 1) ENVIRON["new"] substr($0, at + length(old))
        }
        { print }
        END { exit found != 1 }' "$1/$file"
}

# ---- Checking

complaints=0
complain() {
    printf '%s: %s\n' "$name" "$*"
    complaints=$((complaints + 1))
}

declare -A seen=() result=()
noticed=0
check_break() {
    [[ -z ${seen[$name]:-} ]] || complain "the name is there twice"
    seen[$name]=yes
    [[ -f $repository/$file ]] || { complain "there is no file $file" && return; }
    [[ ${#tests[@]} -gt 0 && -n $old && $old != "$new" ]] || complain "something is missing"
    broken "$repository" >/dev/null || complain "what it breaks does not stand in $file once: $old"
    case ${result[$name]:-} in
    '') ;; # not tried yet
    noticed)
        noticed=$((noticed + 1))
        [[ -z $reason ]] || complain "it was noticed, and there is a reason why it cannot be"
        ;;
    *) [[ -n $reason ]] || complain "it was not noticed, and there is no reason why" ;;
    esac
}

# What docs/trust.md shows: the breaks of each table and how many of them were noticed; those that were not, and why.
declare -A breaks_of=() tried_of=() noticed_of=()
missed=''
count_break() {
    local table=${name%%.*}
    breaks_of[$table]=$((${breaks_of[$table]:-0} + 1))
    [[ -n ${result[$name]:-} ]] || return 0
    tried_of[$table]=$((${tried_of[$table]:-0} + 1))
    if [[ ${result[$name]} == noticed ]]; then
        noticed_of[$table]=$((${noticed_of[$table]:-0} + 1))
    else
        missed+="$name"$'\t'"$title"$'\t'"$reason"$'\n'
    fi
}

list_missed() {
    printf 'break\twhat it does\twhy no test notices\n%s' "$missed"
}

summarise() {
    local table breaks=0 tried=0 noticed=0
    printf 'folder\tbreaks\ttried\tnoticed\n'
    for table in $(printf '%s\n' "${!breaks_of[@]}" | sort); do
        printf '%s\t%s\t%s\t%s\n' "$table" "${breaks_of[$table]}" "${tried_of[$table]:-0}" "${noticed_of[$table]:-0}"
        breaks=$((breaks + ${breaks_of[$table]}))
        tried=$((tried + ${tried_of[$table]:-0}))
        noticed=$((noticed + ${noticed_of[$table]:-0}))
    done
    printf 'all\t%s\t%s\t%s\n' "$breaks" "$tried" "$noticed"
}

read_results() {
    local outcome rest
    result=() breaks_of=() tried_of=() noticed_of=() missed=''
    while IFS=$'\t' read -r name outcome rest; do
        result[$name]=$outcome
    done <"$results"
    for_each_break count_break
}

command_report() {
    read_results
    summarise >"$trust/mutations.tsv"
    rm -f "$trust/breaks_that_nothing_notices.tsv"
    [[ -z $missed ]] || list_missed >"$trust/breaks_that_nothing_notices.tsv"
}

command_check() {
    read_results
    for_each_break check_break
    for name in "${!result[@]}"; do
        [[ -n ${seen[$name]:-} ]] || complain "there is a result, and no such break"
    done
    name=all
    [[ ${#seen[@]} -ge 150 ]] || complain "there are fewer than 150 breaks"
    [[ $((noticed * 100)) -ge $((${#result[@]} * 97)) ]] || complain "fewer than 97 of 100 are noticed"
    cmp -s "$trust/mutations.tsv" <(summarise) || complain "$trust/mutations.tsv is of other results"
    [[ -z $missed ]] || cmp -s "$trust/breaks_that_nothing_notices.tsv" <(list_missed) || complain "$trust/breaks_that_nothing_notices.tsv is of other results"
    summarise
    [[ $complaints -eq 0 ]]
}

# ---- Running

# Brings the copy up to date. What differs gets a new time, so that it is built again.
update_copy() {
    local path changed=no
    mkdir -p "$copy"
    while IFS= read -r -d '' path; do
        [[ -f $repository/$path ]] || continue
        if ! cmp -s "$repository/$path" "$copy/$path"; then
            mkdir -p "$copy/$(dirname "$path")"
            cp --no-preserve=timestamps "$repository/$path" "$copy/$path"
            changed=yes
        fi
    done < <(git -C "$repository" -c safe.directory="$repository" ls-files -z --cached --others --exclude-standard)
    if [[ -d $repository/.deps && ! -e $copy/.deps ]]; then
        ln -s "$repository/.deps" "$copy/.deps"
    fi
    cat >"$copy/launcher" <<'SCRIPT'
#!/usr/bin/env bash
# Compiles the broken file quickly, and all others as ever.
[[ ${*: -1} != "$(cat "$(dirname "$0")/broken_file")" ]] || exec "$@" -O0 -g0 -U_FORTIFY_SOURCE
! command -v ccache >/dev/null || set -- env CCACHE_SLOPPINESS=pch_defines,time_macros ccache "$@"
exec "$@"
SCRIPT
    chmod +x "$copy/launcher"
    : >"$copy/broken_file"
    if [[ $changed == yes || ! -f $build/build.ninja ]]; then
        (cd "$copy" && cmake --preset "$preset" --log-level=WARNING -D CMAKE_CXX_COMPILER_LAUNCHER="$copy/launcher" \
            -D CMAKE_LINK_DEPENDS_NO_SHARED=ON >/dev/null)
    fi
}

# Where the program of a test is run, and what it is; then its tests that match, up to the first that fails.
run_program() {
    local path
    path=$(find "$build" -name "$1" -type f -perm -u+x | head -n 1)
    [[ -n $path ]] || die "there is no program $1"
    (cd "$(dirname "$path")" && timeout "$limit" "$path" --gtest_filter="$2" --gtest_fail_fast --gtest_brief=1) \
        >"$copy/test.log" 2>&1
}

build_tests() {
    cmake --build "$build" --target "${tests[@]%% *}" >"$copy/build.log" 2>&1
}

# What notices the break, if anything does: a test that fails, by its name, or a program that crashes or does not end.
found=''
seek_failure() {
    local test program status
    found=''
    for test in "${tests[@]}"; do
        program=${test%% *} filter='*' status=0
        [[ $test != *' '* ]] || filter=${test#* }
        run_program "$program" "$filter" || status=$?
        if [[ $status -ne 0 ]]; then
            found=$(sed -n 's/^\[  FAILED  \] \([^ ,]*\).*/\1/p' "$copy/test.log" | head -n 1)
            [[ -z $found ]] || filter=$found
            [[ $status -ne 124 ]] || found="$program, which does not end"
            [[ -n $found ]] || found="$program, which dies"
            failing=$program
            return
        fi
    done
}

# What failed has to succeed without the break, or it says nothing. That is looked at once for each test.
declare -A failures=()
verify() {
    local entry
    [[ ${#failures[@]} -gt 0 ]] || return 0
    for entry in "${!failures[@]}"; do
        cmake --build "$build" --target "${entry%% *}" >"$copy/build.log" 2>&1 ||
            die "$entry cannot be built; see $copy/build.log"
        if ! run_program "${entry%% *}" "${entry#* }"; then
            for name in ${failures[$entry]}; do
                note invalid "since $entry fails although nothing is broken"
            done
        fi
    done
}

patterns=()
is_wanted() {
    local pattern
    [[ ${#patterns[@]} -gt 0 ]] || return 0
    if [[ ${patterns[0]} == --new ]]; then
        [[ -z ${result[$name]:-} ]]
        return
    fi
    for pattern in "${patterns[@]}"; do
        # shellcheck disable=SC2053 # it is a pattern
        [[ $name != $pattern ]] || return 0
    done
    return 1
}

note() {
    local kept
    kept=$(awk -F '\t' -v name="$name" '$1 != name' "$results")
    { [[ -z $kept ]] || printf '%s\n' "$kept" && printf '%s\t%s\t%s\n' "$name" "$@"; } | sort >"$results"
    printf '%-50s %s\t%s\n' "$name" "$@"
}

run_break() {
    is_wanted || return 0
    broken "$repository" >"$copy/broken" || die "$name: what it breaks does not stand in $file once"
    cp "$copy/broken" "$copy/$file"
    echo "$copy/$file" >"$copy/broken_file"
    if build_tests; then
        seek_failure
        [[ -z $found ]] || failures[$failing $filter]+=" $name"
    else
        found="the compiler"
        failures[${tests[0]%% *} -*]+=" $name"
    fi
    cp --no-preserve=timestamps "$repository/$file" "$copy/$file"
    : >"$copy/broken_file"
    if [[ -n $found ]]; then
        note noticed "by $found"
    else
        note missed "$reason"
    fi
}

command_run() {
    patterns=("$@")
    [[ -e $results ]] || : >"$results"
    read_results
    update_copy
    for_each_break run_break
    verify
    command_report
}

command=${1:-}
[[ $# -eq 0 ]] || shift
case $command in
run | report | check) "command_$command" "$@" ;;
*) die "usage: mutate.sh run [--new | NAME-PATTERN...] | report | check" ;;
esac
