#!/usr/bin/env bash
#SBATCH --job-name=kvt-translate
#
# One task of a job array: translates the part of the input that has the task's number. translate_on_cluster.sh submits
# it, and says by variables what there is to do:
#
#   KVT_INPUT     the file that is translated
#   KVT_JOB       the job file
#   KVT_PARTS     how many parts there are; an array that is submitted again has fewer tasks
#   KVT_FOLDER    where part-I.out, part-I.report.jsonl and part-I.log go; all nodes see it
#
# An output appears whole or not at all, so that a part whose output is there is done.

set -euo pipefail

part=${SLURM_ARRAY_TASK_ID:?"this is a task of a job array"}
name=$KVT_FOLDER/part-$part
status=0
kvt translate --job "$KVT_JOB" --part "$part/$KVT_PARTS" --threads "${SLURM_CPUS_PER_TASK:-1}" \
    --report "$name.report.jsonl" "$KVT_INPUT" -o "$name.out" 2>"$name.log" || status=$?
# 1 says that some cells failed; the report has them.
[[ $status -le 1 ]]
