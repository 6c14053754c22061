#!/bin/sh
# Submits a farm job to Slurm: a job array with one task a chunk of the plan, and the assembly as
# a job that starts when every task has succeeded. Prints the two job ids.
#   submit-slurm.sh PLAN [sbatch options...]
# The plan comes from `veltrane plan SCENE --chunks N -o FINAL`; its paths are relative to its
# own folder, which every node must reach (a shared file system). The tasks find the command line
# as $VELTRANE or veltrane on the PATH (sbatch passes the environment on).
set -eu
plan=${1:?"usage: submit-slurm.sh PLAN [sbatch options...]"}
shift
here=$(cd "$(dirname "$0")" && pwd)
folder=$(cd "$(dirname "$plan")" && pwd)
plan=$folder/$(basename "$plan")
# The plan lists one "frames" entry a chunk, and one for the whole job.
chunks=$(($(grep -o '"frames"' "$plan" | wc -l) - 1))
if [ "$chunks" -lt 1 ]; then
  echo "submit-slurm.sh: $plan lists no chunks" >&2
  exit 2
fi
array=$(sbatch --parsable --array=0-$((chunks - 1)) --chdir="$folder" "$@" \
  "$here/slurm-job.sh" "$here/entrypoint.sh" "$plan")
array=${array%%;*}
assembly=$(sbatch --parsable --dependency=afterok:"$array" --kill-on-invalid-dep=yes \
  --chdir="$folder" "$@" "$here/assemble-job.sh" "$here/entrypoint.sh" "$plan")
echo "$array ${assembly%%;*}"
