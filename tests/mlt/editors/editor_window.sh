#!/usr/bin/env bash
# Opens a project with the split-screen effect in a real editor under Xvfb and checks the
# picture in its monitor: Kdenlive on a four-track project (a 2x2 grid from one composition),
# Shotcut on a two-track project (the filter on its Output track), each made from the tests'
# fixtures with clips of one colour each. The editor runs in a private home with the module and
# its descriptions from the build tree; screenshots are taken until the picture is there or a
# minute has passed. The last screenshot stays in OUT when the check fails; with `panel`, OUT
# gets a picture of the window with the effect's panel open once the check passes (for the
# docs: scripts/editor-screenshot).
#   editor_window.sh kdenlive|shotcut MLT_REPOSITORY MLT_DATA OUT [panel]
set -euo pipefail
editor=$1 repository=$2 data=$3 out=$4 panel=${5:-}
here=$(cd "$(dirname "$0")" && pwd)
fixtures=$here/../data
for tool in "$editor" Xvfb xdotool import convert ffmpeg python3; do
  command -v "$tool" >/dev/null || { echo "$tool is not installed (scripts/deps)" >&2; exit 1; }
done

work=$(mktemp -d)
xvfb= app=
cleanup() {
  if [[ -n $app ]]; then
    kill "$app" 2>/dev/null || true
    for _ in $(seq 20); do kill -0 "$app" 2>/dev/null || break; sleep 0.2; done
    kill -9 "$app" 2>/dev/null || true
  fi
  [[ -n $xvfb ]] && kill "$xvfb" 2>/dev/null
  wait 2>/dev/null
  rm -rf "$work"
}
trap cleanup EXIT

for colour in red blue green white; do
  ffmpeg -v error -y -f lavfi -i "color=c=$colour:size=640x360:rate=25" -frames:v 20 \
    -c:v png "$work/$colour.mov"
done
# The fixtures at 640x360, so that the monitor shows each region large enough to find.
sized=(-e 's/width="160" height="90"/width="640" height="360"/' -e 's/160x90 25fps/640x360 25fps/'
  -e 's/0 0 160 90 1.000000/0 0 640 360 1.000000/g' -e "s#root=\"/tmp\"#root=\"$work\"#")
if [[ $editor == kdenlive ]]; then
  project=$work/grid.kdenlive
  sed "${sized[@]}" -e "s#@UPPER@#$work/blue.mov#" -e "s#@LOWER@#$work/red.mov#" \
    -e "s#@THIRD@#$work/green.mov#" -e "s#@FOURTH@#$work/white.mov#" \
    "$fixtures/kdenlive_grid.kdenlive" >"$project"
  layout=grid
  mkdir -p "$work/share/kdenlive/transitions"
  cp "$data/veltrane/veltrane.xml" "$work/share/kdenlive/transitions/"
else
  project=$work/split.mlt
  # Every setting as the panel gives a new filter.
  properties=$(sed -n "s/.*{name: '\([A-Za-z_0-9]*\)'.*fallback: '\([^']*\)'.*/<property name=\"\1\">\2<\/property>/p" \
    "$data/veltrane/ui.qml" | tr -d '\n')
  sed "${sized[@]}" -e "s#@UPPER@#$work/blue.mov#" -e "s#@LOWER@#$work/red.mov#" \
    -e "s|@PROPERTIES@|$properties|" "$fixtures/shotcut_split.mlt" >"$project"
  layout=diagonal
  # Shotcut finds its filters only in share/shotcut beside its program: a copy of the program
  # in a folder of ours, with Shotcut's own share linked in and the filter added.
  mkdir -p "$work/bin" "$work/share/shotcut/qml/filters/veltrane"
  cp "$(command -v shotcut)" "$work/bin/shotcut"
  for entry in /usr/share/shotcut/* /usr/share/shotcut/qml/* /usr/share/shotcut/qml/filters/*; do
    link=$work/share/${entry#/usr/share/}
    [[ -e $link ]] || ln -s "$entry" "$link"
  done
  cp "$data/veltrane/meta.qml" "$data/veltrane/ui.qml" "$work/share/shotcut/qml/filters/veltrane/"
fi

mkdir -p "$work/home" "$work/tmp"
chmod 700 "$work/home"
export HOME=$work/home XDG_CONFIG_HOME=$work/home/.config XDG_DATA_HOME=$work/home/.local/share
export XDG_CACHE_HOME=$work/home/.cache XDG_RUNTIME_DIR=$work/home TMPDIR=$work/tmp
export XDG_DATA_DIRS=$work/share:/usr/local/share:/usr/share
export MLT_REPOSITORY=$repository MLT_DATA=$data
Xvfb -displayfd 3 -screen 0 1600x1000x24 -nolisten tcp 3>"$work/display" 2>/dev/null &
xvfb=$!
for _ in $(seq 100); do [[ -s $work/display ]] && break; sleep 0.1; done
export DISPLAY=:$(head -1 "$work/display")

if [[ $editor == kdenlive ]]; then
  dbus-run-session -- bash -c 'echo $$ >"$1"; exec kdenlive "$2"' _ "$work/app.pid" "$project" \
    >"$work/editor.log" 2>&1 &
else
  bash -c 'echo $$ >"$1"; exec "$2" "$3"' _ "$work/app.pid" "$work/bin/shotcut" "$project" \
    >"$work/editor.log" 2>&1 &
fi
for _ in $(seq 100); do [[ -s $work/app.pid ]] && break; sleep 0.1; done
app=$(cat "$work/app.pid")

# The window at the screen's size, the effect selected and its panel shown: Kdenlive's
# composition on the timeline and its Effect/Composition Stack, Shotcut's Output track and its
# Filters panel. The places clicked are those of each editor's first layout at 1600x1000.
show_panel() {
  local window
  window=$(xdotool search --onlyvisible --class "$editor" 2>/dev/null | tail -1)
  xdotool windowmove --sync "$window" 0 0 windowsize --sync "$window" 1600 1000
  sleep 3
  if [[ $editor == shotcut ]]; then
    xdotool mousemove "${SHOTCUT_OUTPUT_X:-30}" "${SHOTCUT_OUTPUT_Y:-796}" click 1
    sleep 1
    xdotool mousemove "${SHOTCUT_FILTERS_X:-795}" "${SHOTCUT_FILTERS_Y:-52}" click 1
  else
    xdotool mousemove "${KDENLIVE_COMPOSITION_X:-175}" "${KDENLIVE_COMPOSITION_Y:-568}" click 1
    sleep 1
    xdotool mousemove "${KDENLIVE_STACK_X:-1362}" "${KDENLIVE_STACK_Y:-952}" click 1
  fi
  sleep 4
  import -window root "$out"
}

for _ in $(seq 30); do
  sleep 2
  kill -0 "$app" 2>/dev/null || { tail -20 "$work/editor.log" >&2; exit 1; }
  # A first start of Kdenlive may greet with a dialog of optional packages; Alt+O answers it.
  for window in $(xdotool search --onlyvisible --class "$editor" 2>/dev/null || true); do
    [[ $(xdotool getwindowname "$window" 2>/dev/null) == *" / "* ]] || [[ $editor != kdenlive ]] ||
      xdotool key --window "$window" alt+o 2>/dev/null || true
  done
  import -window root "$work/shot.png" 2>/dev/null || continue
  convert "$work/shot.png" "$work/shot.ppm"
  if python3 "$here/monitor_pixels.py" "$work/shot.ppm" "$layout"; then
    [[ -n $panel ]] && show_panel
    exit 0
  fi
done
cp "$work/shot.png" "$out"
echo "the split never showed in $editor's monitor; the last screenshot is $out" >&2
exit 1
