#!/usr/bin/env bash
# The render tool from the outside: options, errors, file format, stopping,
# determinism. Usage: render_tool_test.sh TOOL... [--compare-with NATIVE_TOOL]
# TOOL may be several words (e.g. a Wine wrapper and the .exe). With
# --compare-with, the tool's output must equal that tool's byte for byte.
set -u
tool=()
native=""
while [ $# -gt 0 ]; do
  if [ "$1" = "--compare-with" ]; then native=$2; shift 2; else tool+=("$1"); shift; fi
done
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cd "$work"
passed=0
failed=0
ok() { passed=$((passed + 1)); }
bad() { failed=$((failed + 1)); echo "FAIL: $*"; }
render() { "${tool[@]}" "$@" 2>err.txt </dev/null; }
# Little-endian fields of a file: u32 at an offset.
u32() { od -An -tu4 -j "$2" -N4 "$1" | tr -d ' '; }
u16() { od -An -tu2 -j "$2" -N2 "$1" | tr -d ' '; }

# A plain render: RIFF PCM, 48 kHz, 16-bit, two channels, whole blocks.
if render --out a.wav --blocks 3; then
  size=$(stat -c %s a.wav)
  [ "$size" -eq $((44 + 3 * 32768)) ] && ok || bad "3 blocks: file of $size bytes, expected $((44 + 3 * 32768))"
  [ "$(head -c 4 a.wav)" = "RIFF" ] && [ "$(dd if=a.wav bs=1 skip=8 count=8 2>/dev/null)" = "WAVEfmt " ] && ok || bad "no RIFF/WAVE header"
  [ "$(u32 a.wav 4)" -eq $((size - 8)) ] && ok || bad "RIFF size $(u32 a.wav 4), expected $((size - 8))"
  [ "$(u16 a.wav 20)/$(u16 a.wav 22)/$(u32 a.wav 24)/$(u32 a.wav 28)/$(u16 a.wav 32)/$(u16 a.wav 34)" = "1/2/48000/192000/4/16" ] \
    && ok || bad "format fields $(u16 a.wav 20)/$(u16 a.wav 22)/$(u32 a.wav 24)/$(u32 a.wav 28)/$(u16 a.wav 32)/$(u16 a.wav 34)"
  [ "$(u32 a.wav 40)" -eq $((3 * 32768)) ] && ok || bad "data size $(u32 a.wav 40)"
else
  bad "render --out a.wav --blocks 3 failed: $(cat err.txt)"
fi

# The same options give the same bytes; raw output is the WAV's data.
render --out b.wav --blocks 3 && cmp -s a.wav b.wav && ok || bad "two renders with the same options differ"
render --out - --blocks 3 > raw.pcm && cmp -s raw.pcm <(tail -c +45 a.wav) && ok || bad "--out - is not the WAV's data"
[ ! -e a.wav.partial ] && ok || bad "a .partial file was left behind"

# Default is 30 blocks; --seconds rounds up to whole blocks.
render --out d.wav && [ "$(u32 d.wav 40)" -eq $((30 * 32768)) ] && ok || bad "default length is not 30 blocks"
render --out s.wav --seconds 1 && [ "$(u32 s.wav 40)" -eq $((6 * 32768)) ] && ok || bad "--seconds 1 is not 6 blocks"
render --out s.wav --seconds 0.3413 && [ "$(u32 s.wav 40)" -eq $((2 * 32768)) ] && ok || bad "--seconds 0.3413 is not 2 blocks"

# Settings change the sound; names and numbers of profiles agree.
render --out p1.wav --blocks 2 --profile dogs && render --out p2.wav --blocks 2 --profile 107 && cmp -s p1.wav p2.wav \
  && ok || bad "--profile dogs differs from --profile 107"
render --out p3.wav --blocks 2 --profile traffic && ! cmp -s p1.wav p3.wav && ok || bad "traffic sounds like dogs"
render --out t.wav --blocks 2 --profile talking && render --out t2.wav --blocks 2 && cmp -s t.wav t2.wav \
  && ok || bad "the default profile is not talking"
flat=$(printf '128,%.0s' $(seq 30))128
render --out e1.wav --blocks 2 --eq "$flat" && cmp -s e1.wav t.wav && ok || bad "--eq all 128 differs from the default"
render --out e2.wav --blocks 2 --eq "1,${flat#128,}" && ! cmp -s e2.wav t.wav && ok || bad "--eq band 0 at 1 changed nothing"
render --out v.wav --blocks 2 --volume 255 --hardness 1 --bass 255 --sub-bass 1 --treble 200 && ! cmp -s v.wav t.wav \
  && ok || bad "the sliders changed nothing"

# The stop rule ends the render without the stopping block: one minute is
# blocks 0..351; the current minute is block 0 alone.
render --out stop.wav --stop-after 1 && [ "$(u32 stop.wav 40)" -eq $((352 * 32768)) ] && ok \
  || bad "--stop-after 1 gave $(u32 stop.wav 40) bytes of data, expected $((352 * 32768))"
render --out stop0.wav --stop-after 0 --blocks 10 && [ "$(u32 stop0.wav 40)" -eq 32768 ] && ok || bad "--stop-after 0 is not one block"
render --out fo.wav --stop-after 2 --fade-out 1 && [ "$(u32 fo.wav 40)" -eq $((704 * 32768)) ] && ok || bad "--stop-after 2 --fade-out 1: blocks 0..703 expected"
render --out fi.wav --blocks 4 --fade-in 1 && ! cmp -s fi.wav <(head -c $((44 + 4 * 32768)) d.wav | tail -c +1) && ok || bad "--fade-in changed nothing"

# Across the wrap: block 524289 is made as block 0 (without the ramp), so a
# stop time counts from there.
render --out w.wav --blocks 3 --start-index 524287 && ok || bad "--start-index 524287 failed"
render --out w2.wav --stop-after 2 --start-index 524289 && [ "$(u32 w2.wav 40)" -eq $((704 * 32768)) ] && ok \
  || bad "--stop-after 2 from index 524289 gave $(u32 w2.wav 40) bytes of data, expected $((704 * 32768))"

# The curves file: a header and one row per bin.
if render --out c.wav --blocks 1 --profile white --curves c.csv; then
  [ "$(head -1 c.csv)" = "bin,hz,profile,eq,bass,subbass,treble,total" ] && ok || bad "curves header: $(head -1 c.csv)"
  [ "$(wc -l < c.csv)" -eq 16385 ] && ok || bad "curves rows: $(wc -l < c.csv)"
  [ "$(sed -n 8p c.csv | tr -d '\r')" = "6,17.57812,1,1,1,1,1,1" ] && ok || bad "curves bin 6: $(sed -n 8p c.csv)"
else
  bad "--curves failed: $(cat err.txt)"
fi

# The chime alone: 262 144 frames, its largest sample the volume's peak.
peak_of() { od -An -td2 -v -j 44 "$1" | awk '{for (i = 1; i <= NF; i++) { v = $i < 0 ? -$i : $i; if (v > m) m = v }} END {print m}'; }
if render --chime ch.wav --volume 255; then
  [ "$(u32 ch.wav 40)" -eq $((262144 * 4)) ] && ok || bad "chime data $(u32 ch.wav 40) bytes, expected $((262144 * 4))"
  [ "$(peak_of ch.wav)" -eq 32766 ] && ok || bad "chime at volume 255 peaks at $(peak_of ch.wav), expected 32766"
  render --chime ch1.wav --volume 1 && [ "$(peak_of ch1.wav)" -eq 327 ] && ok || bad "chime at volume 1 peaks at $(peak_of ch1.wav), expected 327"
else
  bad "--chime failed: $(cat err.txt)"
fi

# Something that is not a regular file is written to, never replaced.
if [ -z "$native" ]; then
  mkfifo pipe && { timeout 20 cat pipe > piped.wav & } && render --chime pipe --volume 255 && wait && [ -p pipe ] && cmp -s piped.wav ch.wav \
    && ok || bad "--chime into a named pipe: the pipe was replaced or the chime differs"
fi

# Bad input: exit status 2, a one-line message naming the option, no file.
expect_error() {
  local option=$1; shift
  rm -f bad.wav bad.wav.partial
  "${tool[@]}" "$@" 2>err.txt </dev/null >/dev/null
  local rc=$?
  if [ $rc -ne 2 ]; then bad "$*: exit $rc, expected 2"; return; fi
  if [ "$(wc -l < err.txt)" -ne 1 ] || ! grep -q -- "$option" err.txt; then bad "$*: message '$(cat err.txt)' does not name $option on one line"; return; fi
  if [ -e bad.wav ] || [ -e bad.wav.partial ]; then bad "$*: left an output file"; return; fi
  ok
}
expect_error --volume --out bad.wav --volume 0
expect_error --volume --out bad.wav --volume 256
expect_error --bass --out bad.wav --bass 12x
expect_error --treble --out bad.wav --treble
expect_error --profile --out bad.wav --profile purple
expect_error --profile --out bad.wav --profile 108
expect_error --eq --out bad.wav --eq 1,2,3
expect_error --eq --out bad.wav --eq "${flat},128"
expect_error --eq --out bad.wav --eq "0,${flat#128,}"
expect_error --eq --out bad.wav --eq "${flat%,128},"
expect_error --fade-in --out bad.wav --fade-in 16
expect_error --fade-out --out bad.wav --fade-out 5
expect_error --stop-after --out bad.wav --stop-after 1440
expect_error --blocks --out bad.wav --blocks 0
expect_error --seconds --out bad.wav --seconds 30000
expect_error --stop-after --out bad.wav --stop-after 1439
expect_error --seconds --out bad.wav --seconds -1
expect_error --start-index --out bad.wav --start-index 524290
expect_error --frobnicate --out bad.wav --frobnicate 3
expect_error --out --blocks 3
expect_error --out --out no/such/dir/x.wav
expect_error --curves --out bad.wav --curves no/such/dir/c.csv
expect_error --chime --chime no/such/dir/c.wav
"${tool[@]}" --help 2>/dev/null | grep -q -- "--stop-after" && ok || bad "--help does not list the options"

# The Windows build's tool must write exactly what the native tool writes.
if [ -n "$native" ]; then
  for args in "--blocks 12" "--blocks 8 --profile brown --volume 255 --hardness 1" \
              "--blocks 6 --fade-in 1 --profile music --eq 1,2,3,4,5,6,7,8,9,10,11,12,13,14,15,16,17,18,19,20,21,22,23,24,25,26,27,28,29,30,31" \
              "--stop-after 2 --fade-out 1 --profile dogs --treble 1"; do
    # shellcheck disable=SC2086
    render --out win.wav $args && "$native" --out nat.wav $args 2>/dev/null
    if cmp -s win.wav nat.wav; then ok; else
      bad "Windows and native renders differ for '$args': $(cmp win.wav nat.wav 2>&1 | head -1)"
    fi
  done
fi

if [ -n "$native" ]; then
  render --chime win.wav --volume 200 && "$native" --chime nat.wav --volume 200
  cmp -s win.wav nat.wav && ok || bad "Windows and native chimes differ: $(cmp win.wav nat.wav 2>&1 | head -1)"
fi

echo "render tool: $passed passed, $failed failed"
[ $failed -eq 0 ]
