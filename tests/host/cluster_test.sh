#!/usr/bin/env bash
# examples/cluster at work: a Slurm controller and three node daemons on this machine translate a file in seven tasks.
# One of them is killed in its middle, and has to be the only one that is submitted again. The same parts by GNU
# parallel. What was started is stopped.
#
#   cluster_test.sh KVT
#
# Ends with 77, which is a test that was left out, where Slurm or parallel is not installed or its daemons do not start.

set -euo pipefail
export LC_ALL=C

kvt=$(realpath -- "$1")
repository=$(realpath -- "$(dirname -- "${BASH_SOURCE[0]}")/../..")
work=$(mktemp -d "${TMPDIR:-/tmp}/kvt-cluster-XXXXXX")

leave_out() {
    printf 'left out: %s\n' "$*"
    exit 77
}
fail() {
    printf 'FAILED: %s\n' "$*"
    tail -n 20 "$work"/log/*.log 2>/dev/null || true
    exit 1
}

stop() {
    local file
    for file in "$work"/run/slurmd-*.pid "$work"/run/slurmctld.pid "$work"/run/munged.pid; do
        [[ -f $file ]] && kill "$(<"$file")" 2>/dev/null
    done
    sleep 1
    rm -rf -- "$work"
    return 0
}
trap stop EXIT

for program in slurmctld slurmd sbatch munged parallel; do
    command -v "$program" >/dev/null || leave_out "$program is not installed"
done
[[ $(id -u) -eq 0 ]] || leave_out "the daemons want to be root"

# ---- A cluster of its own

free_port() {
    local port
    for ((port = $1; port < $1 + 2000; port += 10)); do
        if ! (exec 3<>"/dev/tcp/127.0.0.1/$port") 2>/dev/null; then
            printf '%s' "$port"
            return
        fi
    done
}

mkdir -p "$work"/{state,spool,log,run,bin,data}
chmod 755 "$work" "$work/run"
host=$(hostname -s)
controller_port=$(free_port 16817)
node_port=$(free_port $((controller_port + 4)))
export SLURM_CONF=$work/slurm.conf
cat >"$SLURM_CONF" <<CONF
ClusterName=kvt
SlurmctldHost=$host(127.0.0.1)
SlurmUser=root
SlurmdUser=root
AuthType=auth/munge
AuthInfo=socket=$work/run/munge.socket
CryptoType=crypto/munge
StateSaveLocation=$work/state
SlurmdSpoolDir=$work/spool/%n
SlurmctldPidFile=$work/run/slurmctld.pid
SlurmdPidFile=$work/run/slurmd-%n.pid
SlurmctldPort=$controller_port
ProctrackType=proctrack/linuxproc
TaskPlugin=task/none
SwitchType=switch/none
MpiDefault=none
ReturnToService=2
SelectType=select/cons_tres
SelectTypeParameters=CR_CPU
AccountingStorageType=accounting_storage/none
JobCompType=jobcomp/none
JobAcctGatherType=jobacct_gather/none
SchedulerType=sched/backfill
NodeName=n[1-3] NodeHostname=$host NodeAddr=127.0.0.1 Port=[$node_port-$((node_port + 2))] CPUs=1 State=UNKNOWN
PartitionName=all Nodes=ALL Default=YES MaxTime=INFINITE State=UP OverSubscribe=NO
CONF
dd if=/dev/urandom bs=1 count=1024 of="$work/run/munge.key" 2>/dev/null
chmod 400 "$work/run/munge.key"
munged --force --socket="$work/run/munge.socket" --key-file="$work/run/munge.key" --pid-file="$work/run/munged.pid" \
    --log-file="$work/log/munged.log" --seed-file="$work/run/munged.seed" 2>/dev/null ||
    leave_out "munged does not start"
slurmctld -L "$work/log/slurmctld.log" || leave_out "slurmctld does not start"
for node in n1 n2 n3; do
    mkdir -p "$work/spool/$node"
    slurmd -N "$node" -L "$work/log/$node.log" || leave_out "slurmd does not start: $(tail -n 1 "$work/log/$node.log")"
done
idle=0
for ((wait = 0; wait < 60 && idle < 3; ++wait)); do
    idle=$(sinfo -h -N -o '%t' 2>/dev/null | grep -c '^idle$' || true)
    sleep 0.5
done
[[ $idle -eq 3 ]] || leave_out "the nodes do not come up"

# ---- Data, and the whole in one piece

awk 'BEGIN {
    printf "id;born;paid;note\r\n"
    for (i = 1; i <= 60000; ++i)
        printf "%d;%02d.%02d.%04d;%d,%02d;%s\r\n", i, i % 31 + 1, i % 12 + 1, 1950 + i % 70, i % 1000, i % 100,
            i % 7 ? "M\374ller" : "\"a\r\nb;c\""
}' >"$work/data/members.csv"
cat >"$work/data/job.toml" <<'TOML'
[input]
encoding = "windows-1252"
delimiter = ";"
[failures]
on-error = "keep"
[[step]]
do = "date"
column = "born"
format = "%d.%m.%Y"
[[step]]
do = "number"
column = "paid"
language = "de"
TOML
status=0
"$kvt" translate --job "$work/data/job.toml" --report "$work/data/whole.jsonl" "$work/data/members.csv" \
    -o "$work/data/whole.csv" 2>"$work/data/whole.log" || status=$?
[[ $status -eq 1 ]] || fail "the whole ends with $status: $(<"$work/data/whole.log")"

# ---- Slurm: the fourth task waits when it comes for the first time, and is killed then

ln -s "$kvt" "$work/bin/kvt-itself"
cat >"$work/bin/kvt" <<KVT
#!/usr/bin/env bash
if [[ "\$*" == *'--part 4/7'* && ! -e $work/run/waited ]]; then
    touch $work/run/waited
    sleep 600
fi
exec $work/bin/kvt-itself "\$@"
KVT
chmod 755 "$work/bin/kvt"
export PATH=$work/bin:$PATH
"$repository/examples/cluster/translate_on_cluster.sh" 7 "$work/data/job.toml" "$work/data/members.csv" \
    "$work/data/parts.csv" "$work/data/parts.jsonl" >"$work/log/driver.log" 2>&1 &
driver=$!
for ((wait = 0; wait < 240; ++wait)); do
    [[ -e $work/run/waited ]] && break
    sleep 0.5
done
[[ -e $work/run/waited ]] || fail "the fourth task does not come"
task=$(squeue -h -t running -o '%i %K' | awk '$2 == 4 { print $1 }')
[[ -n $task ]] || fail "the fourth task does not run"
scancel "$task"
wait "$driver" || fail "the driver failed: $(<"$work/log/driver.log")"

cmp "$work/data/whole.csv" "$work/data/parts.csv" || fail "the parts are not the whole"
cmp "$work/data/whole.jsonl" "$work/data/parts.jsonl" || fail "the reports of the parts are not that of the whole"
printf 'attempt 1: tasks 1,2,3,4,5,6,7 of 7\nattempt 2: tasks 4 of 7\n60000 rows read, 60000 written, 0 rejected, 0 skipped\n' |
    diff - "$work/log/driver.log" || fail "the driver says something else"

# ---- GNU parallel

cd "$work/data"
parallel --will-cite -j 2 "$work/bin/kvt-itself" translate --job job.toml --part {}/7 --threads 1 \
    members.csv -o 'p{}.csv' ::: 1 2 3 4 5 6 7 2>/dev/null || true
for part in 1 2 3 4 5 6 7; do
    cat "p$part.csv"
done | cmp whole.csv - || fail "the parts by parallel are not the whole"

printf 'a cluster of three nodes translates as one machine does\n'
