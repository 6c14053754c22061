#!/bin/sh
# The entry point of a farm task, the same in a container and on a batch node:
#   entrypoint.sh chunk PLAN       renders one chunk of the plan: the index comes from the
#                                  scheduler ($JOB_COMPLETION_INDEX in a Kubernetes Indexed Job,
#                                  $SLURM_ARRAY_TASK_ID in a Slurm job array) or $CHUNK_INDEX
#   entrypoint.sh assemble PLAN    joins the chunks into the final video
# $VELTRANE names the command line (default: veltrane on the PATH); $VELTRANE_PLUGIN the module.
set -eu
veltrane=${VELTRANE:-veltrane}
task=${1:?"usage: entrypoint.sh chunk|assemble PLAN"}
plan=${2:?"usage: entrypoint.sh chunk|assemble PLAN"}
case $task in
chunk)
  index=${JOB_COMPLETION_INDEX:-${SLURM_ARRAY_TASK_ID:-${CHUNK_INDEX:-}}}
  if [ -z "$index" ]; then
    echo "entrypoint.sh: no chunk index: set JOB_COMPLETION_INDEX, SLURM_ARRAY_TASK_ID or CHUNK_INDEX" >&2
    exit 2
  fi
  exec "$veltrane" render --plan "$plan" --chunk "$index" --quiet
  ;;
assemble)
  exec "$veltrane" assemble "$plan"
  ;;
*)
  echo "entrypoint.sh: expected chunk or assemble, got '$task'" >&2
  exit 2
  ;;
esac
