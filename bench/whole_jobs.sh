# What the whole-job benchmarks (scripts/bench-job, bench/farm_job.sh) share, sourced by them:
# their work folder, the 4-way split job (make_quad_job: four 8-second 1080p inputs made with FFmpeg's test sources,
# the first with a tone, and quad.json, 200 frames in which each quadrant shows its own input;
# in the current folder, keeping the inputs it finds there) and the measurement of a command.

# Goes into $BENCH_JOB_DIR (made when missing, and kept) or a fresh temporary folder that goes
# when the script ends.
enter_work_folder() {
  if [[ -n ${BENCH_JOB_DIR:-} ]]; then
    work=$BENCH_JOB_DIR
    mkdir -p "$work"
  else
    work=$(mktemp -d)
    trap 'rm -rf "$work"' EXIT
  fi
  cd "$work"
}

encode=(-c:v libx264 -crf 18 -preset fast -pix_fmt yuv420p)
sources=(
  "testsrc2=size=1920x1080:rate=25"
  "testsrc=size=1920x1080:rate=25"
  "mandelbrot=size=1920x1080:rate=25"
  "cellauto=size=1920x1080:rate=25:rule=110:scroll=1"
)
tone=(-f lavfi -i "sine=frequency=440:sample_rate=48000" -c:a aac)

# Regions of the split as the effect numbers them: 0 bottom right, 1 bottom left, 2 top left
# (the own source, in0), 3 top right.
layer() { echo "{\"guid\": \"b0000000-0000-4000-8000-00000000000$1\", \"name\": \"in$1\", \"source\": {\"file\": \"in$1.mp4\"}}"; }

make_quad_job() {
  local i sound
  for i in 0 1 2 3; do
    [[ -f in$i.mp4 ]] && continue
    sound=()
    if ((i == 0)); then sound=("${tone[@]}"); fi
    echo "generating in$i.mp4 (${sources[$i]%%=*}, 8 s)" >&2
    ffmpeg -v error -y -f lavfi -i "${sources[$i]}" "${sound[@]}" -t 8 "${encode[@]}" "in$i.mp4"
  done
  cat >quad.json <<EOF
{"width": 1920, "height": 1080, "fps": 25, "duration": 200, "source": {"file": "in0.mp4"},
 "layers": [$(layer 1), $(layer 2), $(layer 3)],
 "params": {"numberOfCuts": 3, "cutType": "Local", "borderWidth": 0,
  "cutPosition_0": [0, 0], "cutDirection_0": 0,
  "cutPosition_1": [-480, 0], "cutDirection_1": 90,
  "cutPosition_2": [480, 0], "cutDirection_2": 90,
  "inputLayer0": "b0000000-0000-4000-8000-000000000003",
  "inputLayer1": "b0000000-0000-4000-8000-000000000002",
  "inputLayer3": "b0000000-0000-4000-8000-000000000001"}}
EOF
}

# measure NAME COMMAND...: wall seconds, CPU seconds (user + system) and peak resident MB.
declare -A wall cpu memory
measure() {
  local name=$1
  shift
  /usr/bin/time -f "%e %U %S %M" -o "$name.time" "$@" >"$name.log" 2>&1 ||
    { cat "$name.log" >&2; exit 1; }
  read -r w u s m <"$name.time"
  wall[$name]=$w
  cpu[$name]=$(awk -v u="$u" -v s="$s" 'BEGIN { printf "%.2f", u + s }')
  memory[$name]=$((m / 1024))
}
