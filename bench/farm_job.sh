#!/usr/bin/env bash
# A render farm's job measured on one machine: the 4-way split of scripts/bench-job (200 frames
# of 1080p from four clips, H.264 CRF 18, the first clip's sound) rendered whole, then as the 8
# chunks of a plan rendered one after another and their assembly; once with the clips as
# scripts/bench-job makes them (one keyframe in their 8 s) and once with a keyframe every second.
# Prints the CPU time of the chunks against the whole render's, the assembly's share of its
# time, what a chunk's start costs (module and panel, GL context and shaders, the clips' seeks)
# and the wall time the job would take on 1, 2, 4, 8 and 16 machines like this one. Inputs go to
# $BENCH_JOB_DIR (a fresh temporary folder by default; a folder given is kept and reused).
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
build_dir=${BUILD_DIR:-$root/build}
"$root/scripts/deps"
BUILD_DIR=$build_dir BUILD_TARGETS="veltrane veltrane_cli" "$root/scripts/build" >/dev/null
chunks=8

source "$root/bench/whole_jobs.sh"
enter_work_folder
make_quad_job
export VELTRANE_PLUGIN=$build_dir/lib/veltrane.so
veltrane=$build_dir/bin/veltrane
# The same clips with a keyframe every second (FFmpeg's test sources make one in 8 s): a chunk
# starting mid-clip decodes from the keyframe before it, so the clips' GOPs set its seeks' cost.
for i in 0 1 2 3; do
  [[ -f gop$i.mp4 ]] || ffmpeg -v error -i in$i.mp4 -map 0 -c:a copy "${encode[@]}" -g 25 gop$i.mp4
done
sed -e 's/in\([0-9]\)\.mp4/gop\1.mp4/g' quad.json >gop.json

sum() { printf "%s\n" "$@" | awk '{ s += $1 } END { printf "%.2f", s }'; }
percent() { awk -v a="$1" -v b="$2" 'BEGIN { printf "%+.1f %%", (a / b - 1) * 100 }'; }
share() { awk -v a="$1" -v b="$2" 'BEGIN { printf "%.1f %%", a / b * 100 }'; }

# farm_run NAME SCENE: the whole render, the chunks one after another and the assembly, with a
# 1-frame render at the start and at frame 150 (after the clips' seeks); prints the figures and
# the wall time on N machines: the plan's chunks handed out in order to the machine free first
# (as a job array runs them) then the assembly, and for a plan of N chunks one start (the
# 1-frame render at frame 150 less a frame of the whole render) plus an N-th of the frames each.
farm_run() {
  local name=$1 scene=$2 i machines
  echo "== $name: the whole job, $chunks chunks one after another, the assembly" >&2
  measure "$name-whole" "$veltrane" render "$scene" -o "$name-whole.mp4" --quiet
  rm -f "$name".chunk* "$name.mp4.plan.json"
  "$veltrane" plan "$scene" --chunks $chunks -o "$name.mp4" >/dev/null 2>&1
  local walls=() cpus=()
  for ((i = 0; i < chunks; i++)); do
    measure "$name-chunk$i" "$veltrane" render --plan "$name.mp4.plan.json" --chunk $i --quiet
    walls+=("${wall[$name-chunk$i]}")
    cpus+=("${cpu[$name-chunk$i]}")
  done
  measure "$name-assembly" "$veltrane" assemble "$name.mp4.plan.json"
  measure "$name-first" "$veltrane" render "$scene" -o "$name-first.mp4" --frame 0 --quiet
  measure "$name-seeked" "$veltrane" render "$scene" -o "$name-seeked.mp4" --frame 150 --quiet
  local whole=${wall[$name-whole]} assembly=${wall[$name-assembly]}
  local frame start
  frame=$(awk -v w="$whole" 'BEGIN { printf "%.3f", w / 200 }')
  start=$(awk -v f="${wall[$name-seeked]}" -v r="$frame" 'BEGIN { printf "%.2f", f - r }')
  printf "\n%s\n%-22s %8s %8s\n" "$name" "" "wall s" "cpu s"
  printf "%-22s %8s %8s\n" "whole render" "$whole" "${cpu[$name-whole]}"
  printf "%-22s %8s %8s\n" "$chunks chunks (sum)" "$(sum "${walls[@]}")" "$(sum "${cpus[@]}")"
  printf "%-22s %8s %8s\n" "assembly" "$assembly" "${cpu[$name-assembly]}"
  echo "each chunk, wall s: ${walls[*]}"
  echo "each chunk, cpu s: ${cpus[*]}"
  echo "chunks' CPU against the whole render's: $(percent "$(sum "${cpus[@]}")" \
    "${cpu[$name-whole]}") (wall $(percent "$(sum "${walls[@]}")" "$whole")); assembly:" \
    "$(share "$assembly" "$whole") of the whole render's wall time"
  echo "1-frame renders, wall/cpu s: frame 0 ${wall[$name-first]}/${cpu[$name-first]}," \
    "frame 150 ${wall[$name-seeked]}/${cpu[$name-seeked]}; a frame of the whole render ${frame} s"
  printf "%-9s %-26s %-26s\n" machines "wall s, the $chunks-chunk plan" "wall s, a plan of N chunks"
  for machines in 1 2 4 8 16; do
    printf "%-9s %-26s %-26s\n" "$machines" "$(printf "%s\n" "${walls[@]}" | awk -v n=$machines \
      -v a="$assembly" '{ for (m = 0; m < n; m++) if (m == 0 || free[m] < free[best]) best = m
                          free[best] += $1 }
      END { for (m = 0; m < n; m++) if (free[m] > last) last = free[m]; printf "%.1f", last + a }')" \
      "$(awk -v n=$machines -v s="$start" -v r="$frame" -v a="$assembly" \
        'BEGIN { printf "%.1f", s + r * 200 / n + a }')"
  done
}

measure module "$veltrane" info
farm_run clips quad.json
farm_run gop gop.json
echo
echo "loading the module and declaring its panel (veltrane info): ${wall[module]} s"
echo "$(nproc) cores, load average $(cut -d' ' -f1-3 /proc/loadavg) at the end"
