#!/bin/sh
# The assembly of a farm job, submitted by submit-slurm.sh to run once every task of the chunks'
# job array has succeeded:
#   sbatch --dependency=afterok:ARRAY_JOB assemble-job.sh ENTRYPOINT PLAN
#SBATCH --job-name=veltrane-assemble
#SBATCH --cpus-per-task=1
#SBATCH --output=veltrane-assemble-%j.log
exec "$1" assemble "$2"
