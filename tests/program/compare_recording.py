#!/usr/bin/python3
"""Compares what the sound server recorded while the program played with what
the render tool makes for the same settings, frame for frame.

The tests write a time line, each line ending with the recording's size in
bytes at that moment:
  play OPTIONS        Play pressed; the render tool's OPTIONS in force from block 0
  set BLOCK OPTIONS   OPTIONS in force from block BLOCK on
  stop BLOCK          Stop pressed after BLOCK blocks were made
  chime OPTIONS       the alarm chime started
  end
A block mixes the frames of its neighbours (overlap-add), so the two blocks
after a change are not compared, nor the first 200 ms, which the device may
lose. A stop (the Stop button, or --stop-after ending the render) cuts the
blocks still queued; silence follows, then the chime whole if one started.
Frames are found in order, so a gap that a late refill leaves in the
recording shifts nothing; at least 99 % must be found.
Usage: compare_recording.py CAPTURE.raw TIMELINE RENDER_TOOL
"""
import os, shlex, subprocess, sys, tempfile
import numpy as np

BLOCK, SKIP, CHUNK, REACH = 8192, 9600, 512, 10 * 48000


def render(options, blocks):
    extra = [] if '--stop-after' in options else ['--blocks', str(blocks)]
    out = subprocess.run([TOOL, '--out', '-'] + options + extra, check=True, stdout=subprocess.PIPE).stdout
    return np.frombuffer(out, np.uint32)


def chime(options):
    with tempfile.TemporaryDirectory() as folder:
        subprocess.run([TOOL, '--chime', os.path.join(folder, 'c.wav')] + options, check=True)
        return np.fromfile(os.path.join(folder, 'c.wav'), np.uint32, offset=44)


def find(pos, frames):
    """Where `frames` stand in the capture from pos on (within REACH), or -1."""
    window = CAPTURE[pos:pos + REACH + len(frames)]
    for at in np.flatnonzero(window[:REACH] == frames[0]):
        if np.array_equal(window[at:at + len(frames)], frames):
            return pos + at
    return -1


def follow(pos, expected):
    """The frames of `expected` found in order from capture position pos on,
    and the capture position after the last of them."""
    found = 0
    for first in range(0, len(expected), CHUNK):
        chunk = expected[first:first + CHUNK]
        if not np.array_equal(CAPTURE[pos:pos + len(chunk)], chunk):
            at = find(pos, chunk[:16])
            pos = at if at >= 0 else pos
        hits = int(np.sum(CAPTURE[pos:pos + len(chunk)] == chunk))
        found += hits
        pos += len(chunk) if hits > len(chunk) // 2 else 0
    return found, pos


def report(ok, what):
    print('%s %s' % ('PASS' if ok else 'FAIL', what))


def stretch(lines, name):
    play = lines[0]
    segments = [(0, play[1:-1])] + [(int(s[1]), s[2:-1]) for s in lines if s[0] == 'set']
    stops = [int(s[1]) for s in lines if s[0] == 'stop']
    pos = None
    for n, (first, options) in enumerate(segments):
        last = segments[n + 1][0] if n + 1 < len(segments) else (stops[0] - 2 if stops else None)
        sound = render(options, (last or 0) + 4)
        made = len(sound) // BLOCK if not stops else stops[0]
        last = made - 1 if last is None else last     # the block a stop cuts is not compared
        for at in ([] if pos is not None else range(SKIP, SKIP + 12 * BLOCK, BLOCK)):  # where the render's frame 0 lies
            pos = find(int(play[-1]) // 4, sound[at:at + 16]) - at
            if pos >= 0:
                break
        if pos < 0:
            return report(False, '%s: the sound is not in the recording' % name)
        begin = SKIP if n == 0 else (first + 2) * BLOCK
        found, after = follow(pos + begin, sound[begin:last * BLOCK])
        share = 100.0 * found / max(last * BLOCK - begin, 1)
        report(share >= 99, '%s, blocks %d to %d: %.2f %% of the frames equal the render' % (name, begin // BLOCK, last - 1, share))
        pos = after - last * BLOCK
    quiet = [pos + made * BLOCK, int(lines[-1][-1]) // 4]   # silent stretches, from, to, ...
    for bell in [s for s in lines if s[0] == 'chime']:
        ring = chime(bell[1:-1])
        at = find(quiet[0], ring[SKIP:SKIP + 16]) - SKIP
        found, after = follow(at + SKIP, ring[SKIP:]) if at >= 0 else (0, 0)
        share = 100.0 * found / (len(ring) - SKIP)
        whole = np.array_equal(CAPTURE[after - 16:after], ring[-16:])
        report(share >= 99 and whole, '%s: the chime, %.2f %% of it, to its last frame' % (name, share))
        quiet[1:1] = [at, after]
    loud = sum(int(np.count_nonzero(CAPTURE[a:b])) for a, b in zip(quiet[0::2], quiet[1::2]))
    report(loud == 0, '%s: silence after the stop (%d frames not silent)' % (name, loud))


CAPTURE = np.fromfile(sys.argv[1], np.uint32)
TOOL = sys.argv[3]
LINES = [shlex.split(line) for line in open(sys.argv[2])]
starts = [i for i, line in enumerate(LINES) if line[0] == 'play']
if not starts:
    report(False, 'recording: the time line has no Play')
for i in starts:
    end = next(j for j in range(i, len(LINES)) if LINES[j][0] == 'end')
    stretch(LINES[i:end + 1], ' '.join(LINES[i][1:-1])[:70])
