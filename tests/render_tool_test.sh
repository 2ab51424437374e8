#!/usr/bin/env bash
# The render tool from the outside: the files it writes, where a stop time
# ends them, the chime, bad input, and (with --compare-with, for the Windows
# build under Wine) the same bytes as the native tool.
# Usage: render_tool_test.sh TOOL... [--compare-with NATIVE_TOOL]
set -u
tool=() native=""
while [ $# -gt 0 ]; do
  if [ "$1" = "--compare-with" ]; then native=$2; shift 2; else tool+=("$1"); shift; fi
done
work=$(mktemp -d) && trap 'rm -rf "$work"' EXIT && cd "$work" || exit 1
passed=0 failed=0
check() { if eval "$2"; then passed=$((passed + 1)); else failed=$((failed + 1)); echo "FAIL: $1"; fi; }
render() { "${tool[@]}" "$@" 2>err.txt </dev/null; }
u32() { od -An -tu4 -j "$2" -N4 "$1" | tr -d ' '; }  # FILE OFFSET: the little-endian number there
u16() { od -An -tu2 -j "$2" -N2 "$1" | tr -d ' '; }
peak() { od -An -td2 -v -j 44 "$1" | tr -s ' ' '\n' | tr -d - | sort -n | tail -1; }

render --out a.wav --blocks 3
check "a RIFF WAVE file of 3 blocks" '[ "$(head -c 4 a.wav)$(dd if=a.wav bs=1 skip=8 count=8 2>/dev/null)" = "RIFFWAVEfmt " ] && [ "$(stat -c %s a.wav)" -eq $((44 + 3 * 32768)) ]'
check "its sizes and format fields" '[ "$(u32 a.wav 4) $(u32 a.wav 40) $(u16 a.wav 20)/$(u16 a.wav 22)/$(u32 a.wav 24)/$(u32 a.wav 28)/$(u16 a.wav 32)/$(u16 a.wav 34)" = "$((36 + 3 * 32768)) $((3 * 32768)) 1/2/48000/192000/4/16" ]'
check "the same options give the same bytes, raw PCM is the data" 'render --out b.wav --blocks 3 && cmp -s a.wav b.wav && render --out - --blocks 3 > raw.pcm && cmp -s raw.pcm <(tail -c +45 a.wav) && [ ! -e a.wav.partial ]'
check "--stop-after 1 ends after block 351" 'render --out s.wav --stop-after 1 && [ "$(u32 s.wav 40)" -eq $((352 * 32768)) ]'
check "the curves, a row per bin" 'render --out c.wav --blocks 1 --profile white --curves c.csv && [ "$(head -1 c.csv)" = "bin,hz,profile,eq,bass,subbass,treble,total" ] && [ "$(wc -l < c.csv)" -eq 16385 ] && [ "$(sed -n 8p c.csv)" = "6,17.57812,1,1,1,1,1,1" ]'
check "the chime: 262144 frames peaking at 32766 at volume 255 and 327 at 1" 'render --chime ch.wav --volume 255 && [ "$(u32 ch.wav 40)" -eq $((262144 * 4)) ] && [ "$(peak ch.wav)" -eq 32766 ] && render --chime ch1.wav --volume 1 && [ "$(peak ch1.wav)" -eq 327 ]'
[ -n "$native" ] || check "a named pipe is written to, not replaced" 'mkfifo pipe && { timeout 20 cat pipe > piped.wav & } && render --chime pipe --volume 255 && wait && [ -p pipe ] && cmp -s piped.wav ch.wav'
for bad in "--volume 0" "--chime no/such/dir/c.wav"; do
  # shellcheck disable=SC2086
  "${tool[@]}" --out bad.wav $bad 2>err.txt </dev/null >/dev/null
  check "$bad: exit status 2, one line naming ${bad%% *}, no file" '[ $? -eq 2 ] && [ "$(wc -l < err.txt)" -eq 1 ] && grep -q -- "${bad%% *}" err.txt && [ ! -e bad.wav ] && [ ! -e bad.wav.partial ]'
done
check "--help lists the options" '"${tool[@]}" --help 2>/dev/null | grep -q -- --stop-after'
if [ -n "$native" ]; then
  for args in "--blocks 12" "--blocks 8 --profile brown --volume 255 --hardness 1" "--stop-after 2 --fade-out 1 --profile dogs --treble 1" \
              "--blocks 6 --fade-in 1 --profile music --eq 1,2,3,4,5,6,7,8,9,10,11,12,13,14,15,16,17,18,19,20,21,22,23,24,25,26,27,28,29,30,31"; do
    # shellcheck disable=SC2086
    check "the Windows render equals the native one: $args" 'render --out win.wav $args && "$native" --out nat.wav $args 2>/dev/null && cmp -s win.wav nat.wav'
  done
  check "the Windows chime equals the native one" 'render --chime win.wav --volume 200 && "$native" --chime nat.wav --volume 200 && cmp -s win.wav nat.wav'
fi
echo "render tool: $passed passed, $failed failed"
[ "$failed" -eq 0 ]
