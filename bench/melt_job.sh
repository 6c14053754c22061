#!/usr/bin/env bash
# The diagonal 2-way job of scripts/bench-job (two 8-second 1080p inputs, one Local cut from
# corner to corner, 200 frames, H.264 CRF 18 preset fast, no sound) made by melt through the
# MLT bridge, by `veltrane render` of the same scene, and by melt with MLT's own rectangular
# transitions (`composite`, `qtblend`: the left half of the upper track over the lower one, the
# nearest they come to a split). melt runs with one render thread (real_time=-1, every frame
# kept) and with two (real_time=-2: the bridge then runs an engine per thread). Prints the
# median wall and CPU seconds and peak resident MB of RUNS runs each.
# Then, at 640x360 (100 frames, four 8-second clips with a keyframe every 2 seconds, two render
# threads): the two tracks with no shift and with a 25-frame shift forward and back on the own
# region, and a 2x2 grid of four tracks from one composition (layout grid-2x2, pictures
# framed), each against `veltrane render` of the same scene (the grid as `veltrane split`
# makes it).
# Usage: bench/melt_job.sh [RUNS] [all|tracks] (default 3 all; tracks runs the 640x360 rows
# only). Inputs are made in $BENCH_JOB_DIR when given (kept and reused, and shared with
# scripts/bench-job), else in a temporary folder.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
build_dir=${BUILD_DIR:-$root/build}
runs=${1:-3}
rows=${2:-all}
BUILD_DIR=$build_dir BUILD_TARGETS="veltrane veltrane_cli mltveltrane" "$root/scripts/build" \
  >/dev/null
export MLT_REPOSITORY=$build_dir/mlt/repository MLT_DATA=$build_dir/mlt/data

source "$root/bench/whole_jobs.sh"
enter_work_folder
encode=(-c:v libx264 -crf 18 -preset fast -pix_fmt yuv420p)
[[ -f in0.mp4 || $rows != all ]] || ffmpeg -v error -y -f lavfi -i "testsrc2=size=1920x1080:rate=25" \
  -f lavfi -i "sine=frequency=440:sample_rate=48000" -c:a aac -t 8 "${encode[@]}" in0.mp4
[[ -f in1.mp4 || $rows != all ]] || ffmpeg -v error -y -f lavfi -i "testsrc=size=1920x1080:rate=25" -t 8 \
  "${encode[@]}" in1.mp4

# in0 above the cut (the own source, the upper track), in1 below (a layer, the lower track).
cat >melt-diagonal.json <<EOF
{"width": 1920, "height": 1080, "fps": 25, "duration": 200, "source": {"file": "in0.mp4"},
 "layers": [{"guid": "b0000000-0000-4000-8000-000000000001", "name": "in1", "source": {"file": "in1.mp4"}}],
 "params": {"numberOfCuts": 1, "cutType": "Local", "borderWidth": 0,
  "cutPosition_0": [0, 0], "cutDirection_0": -60.642246,
  "inputLayer1": "b0000000-0000-4000-8000-000000000001"}}
EOF
document() {  # SERVICE PROPERTIES: both inputs on two tracks with the transition between them
  cat <<EOF
<?xml version="1.0"?>
<mlt>
  <profile width="1920" height="1080" frame_rate_num="25" frame_rate_den="1"
           sample_aspect_num="1" sample_aspect_den="1" display_aspect_num="16"
           display_aspect_den="9" progressive="1" colorspace="709"/>
  <producer id="lower"><property name="resource">in1.mp4</property></producer>
  <producer id="upper"><property name="resource">in0.mp4</property></producer>
  <playlist id="track0"><entry producer="lower" in="0" out="199"/></playlist>
  <playlist id="track1"><entry producer="upper" in="0" out="199"/></playlist>
  <tractor in="0" out="199">
    <track producer="track0"/>
    <track producer="track1"/>
    <transition>
      <property name="mlt_service">$1</property>
      <property name="a_track">0</property>
      <property name="b_track">1</property>
      $2
    </transition>
  </tractor>
</mlt>
EOF
}
document veltrane '<property name="numberOfCuts">1</property>
      <property name="cutType">Local</property>
      <property name="borderWidth">0</property>
      <property name="cutPosition_0">0 0</property>
      <property name="cutDirection_0">-60.642246</property>
      <property name="inputLayer1">lower</property>' >melt-veltrane.mlt
document composite '<property name="geometry">0 0 960 1080 100</property>' >melt-composite.mlt
document qtblend '<property name="rect">0 0 960 1080 1</property>' >melt-qtblend.mlt

declare -A wall cpu memory
# measure NAME OUTPUT COMMAND...: one run; its figures are appended to the name's lists.
measure() {
  local name=$1 output=$2
  shift 2
  /usr/bin/time -f "%e %U %S %M" -o "$name.time" "$@" </dev/null >"$name.log" 2>&1 ||
    { tail -20 "$name.log" >&2; exit 1; }
  local frames
  frames=$(ffprobe -v error -count_frames -select_streams v -show_entries stream=nb_read_frames \
    -of csv=p=0 "$output")
  [[ $frames == "${measure_frames:-200}" ]] ||
    { echo "$name made $frames frames, not ${measure_frames:-200}" >&2; exit 1; }
  read -r w u s m <"$name.time"
  wall[$name]+="$w "
  cpu[$name]+="$(awk -v u="$u" -v s="$s" 'BEGIN { printf "%.2f", u + s }') "
  memory[$name]+="$((m / 1024)) "
}
median() { tr ' ' '\n' <<<"$1" | sed '/^$/d' | sort -g | awk '{ v[NR] = $1 } END { print v[int((NR + 1) / 2)] }'; }
melt_h264=(vcodec=libx264 crf=18 preset=fast pix_fmt=yuv420p an=1)

names=()
if [[ $rows == all ]]; then
names=(melt-veltrane-1 melt-veltrane-2 render melt-composite-1 melt-qtblend-1)
for run in $(seq "$runs"); do
  echo "== run $run of $runs" >&2
  measure melt-veltrane-1 mv1.mp4 melt melt-veltrane.mlt -consumer avformat:mv1.mp4 \
    real_time=-1 "${melt_h264[@]}"
  measure melt-veltrane-2 mv2.mp4 melt melt-veltrane.mlt -consumer avformat:mv2.mp4 \
    real_time=-2 "${melt_h264[@]}"
  measure render render.mp4 "$build_dir/bin/veltrane" render -y --plugin "$build_dir/lib/veltrane.so" \
    melt-diagonal.json -o render.mp4 --no-audio --quiet
  measure melt-composite-1 mc.mp4 melt melt-composite.mlt -consumer avformat:mc.mp4 \
    real_time=-1 "${melt_h264[@]}"
  measure melt-qtblend-1 mq.mp4 melt melt-qtblend.mlt -consumer avformat:mq.mp4 \
    real_time=-1 "${melt_h264[@]}"
done

# How far melt's picture through the bridge is from veltrane render's (PSNR, all planes).
psnr=$(ffmpeg -v info -i mv1.mp4 -i render.mp4 -lavfi psnr -f null - 2>&1 |
  sed -n 's/.*average:\([0-9.inf]*\).*/\1/p' | tail -1)
fi
source "$root/bench/melt_tracks.sh"

printf "\n%-28s %8s %8s %8s\n" "medians of $runs" "wall s" "cpu s" "peak MB"
for name in "${names[@]}"; do
  printf "%-28s %8s %8s %8s\n" "$name" "$(median "${wall[$name]}")" "$(median "${cpu[$name]}")" \
    "$(median "${memory[$name]}")"
done
ratio() { awk -v a="$(median "${wall[$1]}")" -v b="$(median "${wall[$2]}")" \
  'BEGIN { printf "%.2f", a / b }'; }
if [[ $rows == all ]]; then
  for name in melt-veltrane-1 melt-veltrane-2; do
    echo "$name / render: $(ratio "$name" render)x wall"
  done
  echo "melt through the bridge against veltrane render: PSNR $psnr dB"
fi
echo "melt, 25-frame shift forward / no shift: $(ratio melt-shift+25 melt-shift0)x wall"
echo "melt, 25-frame shift back / no shift: $(ratio melt-shift-25 melt-shift0)x wall"
echo "melt / render, 25-frame shift forward: $(ratio melt-shift+25 render-shift+25)x wall"
echo "melt / render, four-track grid: $(ratio melt-grid-4 render-grid-4)x wall"
echo "$(nproc) cores, load average $(cut -d' ' -f1-3 /proc/loadavg) at the end"
