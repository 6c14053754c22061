# The tracks rows of bench/melt_job.sh (sourced there, in its working folder, with its
# `measure`, `melt_h264`, `build_dir`, `runs` and `names`): small clips, so that decoding a
# shifted track from a keyframe (what seeking the track would cost) shows against the
# effect's own passes.
small=(-c:v libx264 -crf 18 -preset fast -pix_fmt yuv420p -g 50)
patterns=(testsrc2 testsrc smptebars rgbtestsrc)
for i in 0 1 2 3; do
  [[ -f small$i.mp4 ]] || ffmpeg -v error -y -f lavfi -i "${patterns[$i]}=size=640x360:rate=25" \
    -t 8 "${small[@]}" small$i.mp4
done

# small_document TRACKS PROPERTIES: clips small(TRACKS-1) .. small0 on tracks 0 .. TRACKS-1
# (small0 on top, the own source), the transition between the top two with PROPERTIES.
small_document() {
  local tracks=$1 i
  echo "<?xml version=\"1.0\"?><mlt><profile width=\"640\" height=\"360\" frame_rate_num=\"25\""
  echo " frame_rate_den=\"1\" sample_aspect_num=\"1\" sample_aspect_den=\"1\""
  echo " display_aspect_num=\"16\" display_aspect_den=\"9\" progressive=\"1\" colorspace=\"601\"/>"
  for ((i = 0; i < tracks; ++i)); do
    echo "<producer id=\"c$i\"><property name=\"resource\">small$((tracks - 1 - i)).mp4</property></producer>"
    echo "<playlist id=\"t$i\"><entry producer=\"c$i\" in=\"0\" out=\"99\"/></playlist>"
  done
  echo "<tractor in=\"0\" out=\"99\">"
  for ((i = 0; i < tracks; ++i)); do echo "<track producer=\"t$i\"/>"; done
  echo "<transition><property name=\"mlt_service\">veltrane</property>"
  echo "<property name=\"a_track\">$((tracks - 2))</property>"
  echo "<property name=\"b_track\">$((tracks - 1))</property>$2</transition></tractor></mlt>"
}

for shift in 0 25 -25; do
  small_document 2 "<property name=\"numberOfCuts\">1</property>
    <property name=\"borderWidth\">0</property>
    <property name=\"cutDirection_0\">-60.642246</property>
    <property name=\"inputLayer1\">lower</property>
    <property name=\"inputFrameShift0\">$shift</property>" >small-shift$shift.mlt
  cat >small-shift$shift.json <<EOF
{"width": 640, "height": 360, "fps": 25, "duration": 100, "source": {"file": "small0.mp4"},
 "layers": [{"guid": "b0000000-0000-4000-8000-000000000002", "name": "s1",
   "source": {"file": "small1.mp4"}}],
 "params": {"numberOfCuts": 1, "borderWidth": 0, "cutDirection_0": -60.642246,
  "inputLayer1": "b0000000-0000-4000-8000-000000000002", "inputFrameShift0": $shift}}
EOF
done
# The grid: split numbers its pictures from the last region (own, lower, then tracks 1 and 0).
small_document 4 "<property name=\"layout\">grid-2x2</property>
    <property name=\"frame_pictures\">1</property>
    <property name=\"inputLayer2\">lower</property>
    <property name=\"inputLayer1\">track:1</property>
    <property name=\"inputLayer0\">track:0</property>" >small-grid.mlt
"$build_dir/bin/veltrane" split --plugin "$build_dir/lib/veltrane.so" small0.mp4 small1.mp4 \
  small2.mp4 small3.mp4 --layout grid-2x2 --border 2,black --save-scene small-grid.json \
  >/dev/null
sed -i 's/"duration": *[0-9.]*/"duration": 100/' small-grid.json

for run in $(seq "$runs"); do
  echo "== tracks run $run of $runs" >&2
  for shift in 0 +25 -25; do
    measure_frames=100 measure melt-shift$shift ms.mp4 melt small-shift${shift#+}.mlt \
      -consumer avformat:ms.mp4 real_time=-2 "${melt_h264[@]}"
  done
  for shift in 0 +25; do
    measure_frames=100 measure render-shift$shift rs.mp4 "$build_dir/bin/veltrane" render -y \
      --plugin "$build_dir/lib/veltrane.so" small-shift${shift#+}.json -o rs.mp4 --no-audio --quiet
  done
  measure_frames=100 measure melt-grid-4 mg.mp4 melt small-grid.mlt -consumer avformat:mg.mp4 \
    real_time=-2 "${melt_h264[@]}"
  measure_frames=100 measure render-grid-4 rg.mp4 "$build_dir/bin/veltrane" render -y \
    --plugin "$build_dir/lib/veltrane.so" small-grid.json -o rg.mp4 --no-audio --quiet
done
names+=(melt-shift0 melt-shift+25 melt-shift-25 render-shift0 render-shift+25 melt-grid-4
  render-grid-4)
