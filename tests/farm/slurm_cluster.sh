#!/usr/bin/env bash
# Runs a farm job on a real Slurm cluster of one node started here: munged with a key made for
# the run, slurmctld and slurmd with a configuration written for it (processes tracked through
# /proc), all in a scratch folder. Submits a four-chunk plan with examples/farm/submit-slurm.sh
# (a job array and the dependent assembly), waits for both, and checks that the assembled
# video's frames and sound equal a single render's. Every daemon it started is stopped, also on
# failure. Fails, saying why, when the daemons cannot start.
#   slurm_cluster.sh VELTRANE MODULE EXAMPLES_FARM_FOLDER
set -euo pipefail
veltrane=$1 module=$2 farm=$3
scratch=$(mktemp -d)
daemons=()

fail() {
  echo "FAIL: $*" >&2
  for log in "$scratch"/*.log "$scratch"/job/*.log; do
    [[ -f $log ]] && { echo "--- $log" >&2; tail -n 15 "$log" >&2; }
  done
  exit 1
}

stop_daemons() {
  [[ -n ${SLURM_CONF:-} ]] && scancel --quiet --user="$(id -un)" 2>/dev/null || true
  local pid
  for pid in "${daemons[@]}"; do kill "$pid" 2>/dev/null || true; done
  for pid in "${daemons[@]}"; do
    for _ in $(seq 50); do kill -0 "$pid" 2>/dev/null || break; sleep 0.1; done
    kill -9 "$pid" 2>/dev/null || true
  done
  rm -rf "$scratch"
}
trap stop_daemons EXIT
trap "exit 1" TERM INT HUP

# started NAME PIDFILE: the daemon's process id once its pid file holds it.
started() {
  for _ in $(seq 100); do
    if [[ -s $2 ]]; then daemons+=("$(cat "$2")"); return 0; fi
    sleep 0.1
  done
  fail "$1 did not start"
}

for program in munged slurmctld slurmd sbatch squeue sinfo; do
  command -v "$program" >/dev/null || fail "$program is not installed (scripts/deps installs slurm-wlm and munge)"
done
[[ $(id -u) -eq 0 ]] || fail "slurmd runs jobs as their users and needs root; run this as root"

mkdir -m 700 "$scratch/munge"
head -c 1024 /dev/urandom >"$scratch/munge/munge.key"
chmod 400 "$scratch/munge/munge.key"
socket=$scratch/munge/munge.socket
munged --force --key-file="$scratch/munge/munge.key" --socket="$socket" \
  --pid-file="$scratch/munged.pid" --log-file="$scratch/munged.log" \
  --seed-file="$scratch/munge/seed" || fail "munged did not start"
started munged "$scratch/munged.pid"

# Two ports nobody listens on, for the controller and the node.
read -r control_port node_port < <(/usr/bin/python3 -c '
import socket
held = [socket.socket() for _ in range(2)]
for s in held: s.bind(("127.0.0.1", 0))
print(*[s.getsockname()[1] for s in held])')
host=$(hostname -s)
mkdir "$scratch/state" "$scratch/spool" "$scratch/job"
export SLURM_CONF=$scratch/slurm.conf
cat >"$SLURM_CONF" <<EOF
ClusterName=veltranefarm
SlurmctldHost=$host(127.0.0.1)
SlurmctldPort=$control_port
SlurmdPort=$node_port
SlurmUser=root
SlurmdUser=root
AuthType=auth/munge
AuthInfo=socket=$socket
CredType=cred/munge
StateSaveLocation=$scratch/state
SlurmdSpoolDir=$scratch/spool
SlurmctldPidFile=$scratch/slurmctld.pid
SlurmdPidFile=$scratch/slurmd.pid
SlurmctldLogFile=$scratch/slurmctld.log
SlurmdLogFile=$scratch/slurmd.log
ProctrackType=proctrack/linuxproc
TaskPlugin=task/none
JobAcctGatherType=jobacct_gather/none
AccountingStorageType=accounting_storage/none
SelectType=select/cons_tres
SelectTypeParameters=CR_Core
MpiDefault=none
MailProg=/bin/true
ReturnToService=2
NodeName=farmnode NodeHostname=$host NodeAddr=127.0.0.1 CPUs=$(nproc) State=UNKNOWN
PartitionName=farm Nodes=farmnode Default=YES MaxTime=INFINITE State=UP
EOF
slurmctld -i -f "$SLURM_CONF" || fail "slurmctld did not start"
started slurmctld "$scratch/slurmctld.pid"
slurmd -f "$SLURM_CONF" -N farmnode || fail "slurmd did not start"
started slurmd "$scratch/slurmd.pid"
for _ in $(seq 60); do
  [[ $(sinfo -h -n farmnode -o %T 2>/dev/null) == idle* ]] && break
  sleep 0.5
done
[[ $(sinfo -h -n farmnode -o %T 2>/dev/null) == idle* ]] || fail "the node did not come up"

# The job: a video source with sound shown 7 frames back and 9 ahead, and a layer whose clip
# starts at frame 23, so that shifted frames cross the chunks' boundaries.
cd "$scratch/job"
ffmpeg -v error -f lavfi -i testsrc=size=96x54:rate=25:duration=3 \
  -f lavfi -i sine=frequency=440:duration=3 -c:v libx264 -g 30 -c:a aac a.mp4
ffmpeg -v error -f lavfi -i testsrc2=size=96x54:rate=25:duration=3 -c:v libx264 -g 30 b.mp4
cat >scene.json <<'EOF'
{"width": 96, "height": 54, "fps": 25, "duration": 48, "source": {"file": "a.mp4"},
 "layers": [{"guid": "bbbbbbbb-0000-4000-8000-000000000002", "name": "B", "firstFrame": 23,
             "source": {"file": "b.mp4"}}],
 "params": {"numberOfCuts": 2, "cutPosition_0": [-12, 0], "cutDirection_0": 10,
            "cutPosition_1": [18, 0], "cutDirection_1": 100, "inputFrameShift0": -7,
            "inputFrameShift1": 9, "inputLayer2": "bbbbbbbb-0000-4000-8000-000000000002"}}
EOF
export VELTRANE=$veltrane VELTRANE_PLUGIN=$module
"$veltrane" plan scene.json --chunks 4 -o job.mkv --codec ffv1 >/dev/null 2>&1 ||
  fail "veltrane plan failed"
read -r array assembly < <("$farm/submit-slurm.sh" job.mkv.plan.json --time=5) ||
  fail "sbatch refused the jobs"
for _ in $(seq 240); do
  [[ -z $(squeue -h -j "$array,$assembly" 2>/dev/null) ]] && break
  sleep 0.5
done
[[ -z $(squeue -h -j "$array,$assembly" 2>/dev/null) ]] && [[ -f job.mkv ]] ||
  fail "the job array $array and the assembly $assembly did not finish with job.mkv in 2 minutes"

"$veltrane" render scene.json -o single.mkv --codec ffv1 --quiet >/dev/null
digest() { ffmpeg -v error -i "$1" -map "0:$2" -c:a copy -f "${3:-framemd5}" - | grep -v '^#'; }
[[ $(digest job.mkv v) == "$(digest single.mkv v)" ]] || fail "the assembled frames differ"
[[ $(digest job.mkv a md5) == "$(digest single.mkv a md5)" ]] || fail "the assembled sound differs"
echo "job $array (4 chunks) and assembly $assembly: frames and sound equal a single render's"
