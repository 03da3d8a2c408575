#!/usr/bin/env bash
# Translates one large file on many machines: a Slurm job array does a part in each task, and the outputs of the parts,
# one behind the other, are the output of the whole.
#
#   translate_on_cluster.sh PARTS JOB INPUT OUTPUT REPORT [SBATCH-OPTION...]
#
# INPUT, JOB and the folder of OUTPUT are on a file system that all nodes see, and `kvt` is in the PATH of the tasks.
# Tasks that failed are submitted again, and no others. At the end the rows that were read, written and left out are
# added up and compared with what is in OUTPUT.

set -euo pipefail
export LC_ALL=C

die() {
    printf 'translate_on_cluster: %s\n' "$*" >&2
    exit 2
}

[[ $# -ge 5 ]] || die "usage: translate_on_cluster.sh PARTS JOB INPUT OUTPUT REPORT [SBATCH-OPTION...]"
parts=$1 output=$4 report=$5
KVT_JOB=$(realpath -- "$2")
KVT_INPUT=$(realpath -- "$3")
shift 5
[[ $parts =~ ^[1-9][0-9]*$ ]] || die "PARTS is a number from 1"
here=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")")
KVT_FOLDER=$(mktemp -d -- "$(realpath -- "$(dirname -- "$output")")/.kvt-parts-XXXXXX")
KVT_PARTS=$parts
export KVT_JOB KVT_INPUT KVT_FOLDER KVT_PARTS

# The numbers of the parts without an output, with commas between them.
missing() {
    local part numbers=
    for ((part = 1; part <= parts; ++part)); do
        [[ -f $KVT_FOLDER/part-$part.out ]] || numbers+=${numbers:+,}$part
    done
    printf '%s' "$numbers"
}

attempts=3
for ((attempt = 1; attempt <= attempts; ++attempt)); do
    tasks=$(missing)
    [[ -n $tasks ]] || break
    printf 'attempt %s: tasks %s of %s\n' "$attempt" "$tasks" "$parts"
    sbatch --wait --array="$tasks" --export=ALL --output="$KVT_FOLDER/slurm-%a.log" "$@" \
        "$here/translate_part.sh" >/dev/null || true
done
tasks=$(missing)
[[ -z $tasks ]] || die "tasks $tasks failed $attempts times; what they said is in $KVT_FOLDER"

# In the order of the parts, of which there may be more than a command line holds.
for ((part = 1; part <= parts; ++part)); do
    cat -- "$KVT_FOLDER/part-$part.out"
done >"$KVT_FOLDER/whole"
reports=()
for ((part = 1; part <= parts; ++part)); do
    reports+=("$KVT_FOLDER/part-$part.report.jsonl")
done
kvt translate --merge-reports "${reports[@]}" -o "$report"

# "kvt: 12 rows read, 9 written, 3 rejected, 0 skipped; 28 cells changed"
read -r read written rejected skipped < <(
    sed -n 's/^kvt: \([0-9]*\) rows\{0,1\} read, \([0-9]*\) written, \([0-9]*\) rejected, \([0-9]*\) skipped.*/\1 \2 \3 \4/p' \
        "$KVT_FOLDER"/part-*.log |
        awk '{ for (i = 1; i <= 4; ++i) sum[i] += $i } END { printf "%d %d %d %d\n", sum[1], sum[2], sum[3], sum[4] }'
)
[[ $read -eq $((written + rejected + skipped)) ]] || die "the sums of rows contradict each other: $KVT_FOLDER"
mv -- "$KVT_FOLDER/whole" "$output"
rm -rf -- "$KVT_FOLDER"
printf '%s rows read, %s written, %s rejected, %s skipped\n' "$read" "$written" "$rejected" "$skipped"
