#!/usr/bin/env bash
# Frame rate of `veltrane view` while a cut's handle is dragged (each frame rendered again) and
# while the pointer only slides along a cut (the overlay redrawn over the same frame), at
# 1280x720 and 1920x1080: a private Xvfb, real X input from xdotool at about 100 moves a second,
# and the viewer's own --stats. Usage: bench/viewer_drag.sh [SECONDS] (default 3 per gesture).
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
veltrane=${BUILD_DIR:-$root/build}/bin/veltrane
seconds=${1:-3}
moves=$((seconds * 100))
work=$(mktemp -d)
xvfb=
trap '[[ -n $xvfb ]] && kill "$xvfb" 2>/dev/null; rm -rf "$work"' EXIT

Xvfb -displayfd 3 -screen 0 1600x1000x24 -nolisten tcp 3>"$work/display" 2>/dev/null &
xvfb=$!
for _ in $(seq 100); do [[ -s $work/display ]] && break; sleep 0.1; done
export DISPLAY=:$(head -1 "$work/display")

scene() {  # WIDTH HEIGHT: three Local cuts over the counter, bars and a checkerboard
  cat >"$work/scene.json" <<EOF
{"width": $1, "height": $2, "fps": 25, "duration": 50, "source": {"pattern": "counter"},
 "layers": [{"guid": "d3e00000-0000-4000-8000-000000000001", "name": "Bars", "source": {"pattern": "bars"}},
            {"guid": "d3e00000-0000-4000-8000-000000000002", "name": "Checker", "source": {"pattern": "checker"}}],
 "params": {"numberOfCuts": 3, "cutDirection_0": 0, "cutPosition_1": [$(($1 / 4)), 0],
            "cutDirection_1": 90, "cutPosition_2": [-$(($1 / 4)), $(($2 / 8))], "cutDirection_2": 80,
            "inputLayer1": "d3e00000-0000-4000-8000-000000000001",
            "inputLayer2": "d3e00000-0000-4000-8000-000000000002", "borderWidth": 4}}
EOF
}

# GESTURE (drag or hover): runs the viewer, makes the gesture on the first cut, which passes
# through the middle of the picture area, and prints the viewer's statistics line.
session() {
  "$veltrane" view "$work/scene.json" --stats >"$work/stats" 2>&1 &
  local viewer=$!
  xdotool search --sync --onlyvisible --name "veltrane view" >/dev/null
  sleep 1
  local steps=() x=440
  [[ $1 == drag ]] && steps+=(mousemove 440 300 mousedown 1)
  [[ $1 == hover ]] && steps+=(mousemove 440 200)
  for _ in $(seq "$moves"); do
    if [[ $1 == drag ]]; then x=$((x + 1)); steps+=(mousemove "$x" 300 sleep 0.01); fi
    if [[ $1 == hover ]]; then steps+=(mousemove_relative 0 1 sleep 0.01); fi
  done
  [[ $1 == drag ]] && steps+=(mouseup 1)
  local begin end
  begin=$(date +%s.%N)
  xdotool "${steps[@]}"
  end=$(date +%s.%N)
  xdotool key ctrl+q
  wait "$viewer" || true
  echo "$(cat "$work/stats") [gesture $(echo "$end - $begin" | bc) s]"
}

echo "machine load before: $(cut -d' ' -f1-3 /proc/loadavg)"
for size in "1280 720" "1920 1080"; do
  scene $size
  echo "== ${size/ /x}, dragging the first cut's position handle"
  session drag
  echo "== ${size/ /x}, sliding along the first cut (overlay only)"
  session hover
done
echo "machine load after: $(cut -d' ' -f1-3 /proc/loadavg)"
