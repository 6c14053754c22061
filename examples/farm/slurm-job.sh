#!/bin/sh
# One task of a Slurm job array: renders chunk $SLURM_ARRAY_TASK_ID of the plan given as the
# first argument. Submitted by submit-slurm.sh as
#   sbatch --array=0-(N-1) slurm-job.sh ENTRYPOINT PLAN
# (Slurm runs a copy of this script, so the entry point's path comes as an argument.)
#SBATCH --job-name=veltrane-chunk
#SBATCH --cpus-per-task=1
#SBATCH --output=veltrane-chunk-%A_%a.log
exec "$1" chunk "$2"
