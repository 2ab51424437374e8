#!/usr/bin/python3
"""compare_recording.py CAPTURE.raw TIMELINE RENDER_TOOL: what the sound
server recorded while the program played against what the render tool makes
for the same settings, frame for frame. The time line, written by the sound
test of app_test.cpp, says what was played: "play OPTIONS", "set BLOCK
OPTIONS" for each change, "stop BLOCK", "chime OPTIONS", "end", each line
ending with the recording's size in bytes at that moment. A block mixes its
neighbours' frames (overlap-add), so the two blocks after a change are not
compared, nor the first 200 ms, which the device may lose, nor the blocks
Stop cuts; silence follows Stop, then the chime whole. Frames are found in
order, so a gap a late refill leaves shifts nothing; at least 99 % must be
found."""
import shlex, subprocess, sys, tempfile
import numpy as np

BLOCK, SKIP, CHUNK, REACH = 8192, 9600, 512, 10 * 48000
CAPTURE = np.fromfile(sys.argv[1], np.uint32)
TOOL = sys.argv[3]

def find(pos, frames):  # where `frames` stand in the capture from pos on (within REACH), or -1
    window = CAPTURE[pos:pos + REACH + len(frames)]
    for at in np.flatnonzero(window[:REACH] == frames[0]):
        if np.array_equal(window[at:at + len(frames)], frames):
            return pos + at
    return -1


def follow(pos, expected):  # how many frames of `expected` stand in order from pos on, and where they end
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
    print(('PASS ' if ok else 'FAIL ') + what)


lines = [shlex.split(line) for line in open(sys.argv[2])]
if [line[0] for line in lines if line[0] != 'set'] != ['play', 'stop', 'chime', 'end']:
    sys.exit(report(False, 'recording: the time line is not play, set..., stop, chime, end'))
stop = int(lines[-3][1])
segments = [(0, lines[0][1:-1])] + [(int(line[1]), line[2:-1]) for line in lines if line[0] == 'set'] + [(stop - 2, [])]
pos = -1
for (first, options), (last, _) in zip(segments, segments[1:]):
    out = subprocess.run([TOOL, '--out', '-', '--blocks', str(last + 4)] + options, check=True, stdout=subprocess.PIPE).stdout
    sound = np.frombuffer(out, np.uint32)
    for at in range(SKIP, SKIP + 12 * BLOCK, BLOCK) if pos < 0 else []:  # where the render's frame 0 lies
        pos = find(int(lines[0][-1]) // 4, sound[at:at + 16]) - at
        if pos >= 0:
            break
    if pos < 0:
        sys.exit(report(False, 'recording: the sound is not in the recording'))
    begin = SKIP if first == 0 else (first + 2) * BLOCK
    found, after = follow(pos + begin, sound[begin:last * BLOCK])
    share = 100.0 * found / max(last * BLOCK - begin, 1)
    report(share >= 99, 'recording, blocks %d to %d: %.2f %% of the frames equal the render' % (begin // BLOCK, last - 1, share))
    pos = after - last * BLOCK
with tempfile.TemporaryDirectory() as folder:
    subprocess.run([TOOL, '--chime', folder + '/c.wav'] + lines[-2][1:-1], check=True)
    ring = np.fromfile(folder + '/c.wav', np.uint32, offset=44)
at = find(pos + stop * BLOCK, ring[SKIP:SKIP + 16]) - SKIP
found, after = follow(at + SKIP, ring[SKIP:]) if at >= 0 else (0, 0)
share = 100.0 * found / (len(ring) - SKIP)
report(share >= 99 and np.array_equal(CAPTURE[after - 16:after], ring[-16:]), 'recording: the chime, %.2f %% of it, to its last frame' % share)
loud = int(np.count_nonzero(CAPTURE[pos + stop * BLOCK:max(at, 0)])) + int(np.count_nonzero(CAPTURE[after:int(lines[-1][-1]) // 4]))
report(loud == 0, 'recording: silence after the stop and after the chime (%d frames not silent)' % loud)
