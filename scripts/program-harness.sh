# scripts/program-harness.sh: sourced by scripts/test-program,
# scripts/screenshots and scripts/measure-program. Starts a virtual X
# display, a PulseAudio server with a null sink at 48 000 Hz s16le and a
# throw-away Wine prefix, all under $work, and ends them again by pid when
# the script exits. The sourcing script sets root, work, wine_run and failed
# (a count this file adds to when something cannot be started).
xvfb_pid="" pulse_pid="" parec_pid=""

say() { printf '%s\n' "$*"; }
fail_setup() { say "$(basename "$0"): $*"; failed=$((failed + 1)); }

stop_pid() {  # asks, then after 5 s forces
  [ -n "$1" ] && kill "$1" 2>/dev/null || return 0
  for _ in $(seq 50); do kill -0 "$1" 2>/dev/null || return 0; sleep 0.1; done
  kill -9 "$1" 2>/dev/null
}

cleanup() {
  stop_pid "$parec_pid"
  # The prefix is this run's own: ending its server ends the programs in it.
  if [ -n "${WINEPREFIX:-}" ] && [ -d "$WINEPREFIX" ]; then wineserver -k 2>/dev/null; fi
  stop_pid "$pulse_pid"
  stop_pid "$xvfb_pid"
}
trap cleanup EXIT
trap 'exit 130' INT TERM

start_pulse() {
  mkdir -p -m 700 "$XDG_RUNTIME_DIR"
  pulseaudio -n --daemonize=no --exit-idle-time=-1 --disallow-exit --use-pid-file=no \
    --load="module-null-sink sink_name=capture rate=48000 format=s16le channels=2" \
    --load=module-native-protocol-unix --load=module-always-sink \
    >"$work/pulseaudio.log" 2>&1 &
  pulse_pid=$!
  for _ in $(seq 100); do
    pactl info >/dev/null 2>&1 && { pactl set-default-sink capture; return 0; }
    kill -0 "$pulse_pid" 2>/dev/null || return 1
    sleep 0.1
  done
  return 1
}

# answer_requests PID ON_PICTURE: while PID runs, answers the screenshot
# requests its Windows side leaves ("AREA NAME [REST]" in
# $work/requests/screenshot): AREA of the display goes into $work/NAME.png,
# stripped of the dates ImageMagick would write into it, then ON_PICTURE
# NAME [REST] is called.
answer_requests() {
  local request=$work/requests/screenshot area name rest
  while kill -0 "$1" 2>/dev/null; do
    if [ -e "$request" ]; then
      read -r area name rest <"$request"
      import -window root -crop "$area" +repage -strip "$work/$name.png"
      "$2" "$name" $rest
      mv "$request" "$request.done"
    fi
    sleep 0.1
  done
}

harness_up() {
  rm -rf "$work" && mkdir -p "$work/requests" "$work/runtime"
  export WINEPREFIX=$work/prefix WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml=" XDG_RUNTIME_DIR=$work/runtime
  display=""
  for n in $(seq 90 140); do
    if [ ! -e "/tmp/.X$n-lock" ] && [ ! -e "/tmp/.X11-unix/X$n" ]; then display=$n; break; fi
  done
  [ -n "$display" ] || { fail_setup "no free X display number"; return 1; }
  Xvfb ":$display" -screen 0 1024x768x24 -nolisten tcp >"$work/xvfb.log" 2>&1 &
  xvfb_pid=$!
  export DISPLAY=:$display
  for _ in $(seq 100); do [ -e "/tmp/.X11-unix/X$display" ] && break; sleep 0.1; done
  kill -0 "$xvfb_pid" 2>/dev/null || { fail_setup "Xvfb did not start (see $work/xvfb.log)"; return 1; }

  say "== a new Wine prefix"
  wineboot -i >"$work/wineboot.log" 2>&1
  wineserver -w
  # A virtual desktop gives the windows their frames, as on Windows. The
  # desktop is made when the Wine server starts, so the server that wrote
  # the setting is let go before the tests start a new one.
  "$wine_run" reg add 'HKCU\Software\Wine\Explorer' /v Desktop /d Default /f >/dev/null 2>&1
  "$wine_run" reg add 'HKCU\Software\Wine\Explorer\Desktops' /v Default /d 1024x768 /f >/dev/null 2>&1
  wineserver -w
}
