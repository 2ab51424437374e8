# scripts/program-harness.sh: sourced by scripts/test-program and
# scripts/measure-program. Starts a virtual X display, a PulseAudio server
# with a null sink at 48 000 Hz s16le and a throw-away Wine prefix, all
# under $work, and ends them again by pid when the script exits.
# The sourcing script sets root, work, wine_run and failed (a count this
# file adds to when something cannot be started); harness_up returns
# non-zero when something did not start.

xvfb_pid=""
pulse_pid=""
parec_pid=""

say() { printf '%s\n' "$*"; }
fail_setup() { say "$(basename "$0"): $*"; failed=$((failed + 1)); }

stop_pid() {
  local pid=$1
  [ -n "$pid" ] || return 0
  kill "$pid" 2>/dev/null || return 0
  for _ in $(seq 50); do kill -0 "$pid" 2>/dev/null || return 0; sleep 0.1; done
  kill -9 "$pid" 2>/dev/null
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
    if pactl info >/dev/null 2>&1; then
      pactl set-default-sink capture
      return 0
    fi
    kill -0 "$pulse_pid" 2>/dev/null || break
    sleep 0.1
  done
  return 1
}

stop_pulse() {
  stop_pid "$pulse_pid"
  pulse_pid=""
}

harness_up() {
  rm -rf "$work"
  mkdir -p "$work/requests" "$work/runtime"
  export WINEPREFIX=$work/prefix
  export WINEDEBUG=-all
  export WINEDLLOVERRIDES="mscoree,mshtml="
  export XDG_RUNTIME_DIR=$work/runtime

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
