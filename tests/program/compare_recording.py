#!/usr/bin/env python3
"""Compares what the sound server recorded while Sombrel.exe played with what
the render tool makes for the same settings.

The program's driver notes in a time line, at each action, how many bytes the
recording held ("begin plain 123456", "volume 200 ...", "profile 107 ...",
"end plain ..."). For each stretch between a begin and its end this script
renders the settings in force (from block 0, as Play starts) and finds the
runs of consecutive frames that equal a render exactly. A recording may miss
a few frames near the start of the stream, so the runs are found wherever
they are, not by comparing from frame 0.

  plain:    at least 99 % of the frames recorded from 200 ms after the sound
            starts to its end equal the render, and the render never starts
            over (a second Play while playing must not restart the sound);
  changes:  the recording follows the render of the old settings up to the
            change and continues as the render of the new settings from a
            block at most two blocks after the next one the program makes.

Usage: compare_recording.py CAPTURE.raw TIMELINE RENDER_TOOL
Prints one line per check, "PASS name" or "FAIL name: why", and exits 1 on
any failure.
"""
import subprocess
import sys

FRAME = 4                 # bytes: 16-bit left, 16-bit right
BLOCK = 8192              # frames
RATE = 48000
NEEDLE = 64               # frames searched for when no known offset fits


def render(tool, frames, volume, profile):
    blocks = frames // BLOCK + 4
    out = subprocess.run([tool, '--out', '-', '--blocks', str(blocks), '--volume', str(volume),
                          '--profile', str(profile)], check=True, stdout=subprocess.PIPE).stdout
    return out


def run_length(a, ai, b, bi, limit):
    """Frames from a[ai] and b[bi] on that are equal, at most limit."""
    n = 0
    step = 1024
    while n < limit:
        k = min(step, limit - n)
        if a[(ai + n) * FRAME:(ai + n + k) * FRAME] == b[(bi + n) * FRAME:(bi + n + k) * FRAME]:
            n += k
            continue
        if k == 1:
            break
        step = max(1, k // 8)
    return n


def match_runs(capture, start, end, renders):
    """Runs (capture frame, length, render index, render frame) over capture
    frames start..end-1, against any of the renders."""
    runs = []
    offsets = []                       # (render index, capture frame - render frame)
    p = start
    searched_at = -NEEDLE
    while p < end:
        hit = None
        for ri, off in offsets:
            r = p - off
            total = len(renders[ri]) // FRAME
            if 0 <= r < total and capture[p * FRAME:(p + 1) * FRAME] == renders[ri][r * FRAME:(r + 1) * FRAME]:
                n = run_length(capture, p, renders[ri], r, min(end - p, total - r))
                if n >= 4 and (hit is None or n > hit[1]):
                    hit = (p, n, ri, r)
        if hit is None and p - searched_at >= NEEDLE and p + NEEDLE <= end:
            searched_at = p
            needle = capture[p * FRAME:(p + NEEDLE) * FRAME]
            if needle.count(b'\0') < len(needle):
                for ri, data in enumerate(renders):
                    at = data.find(needle)
                    while at >= 0 and at % FRAME:
                        at = data.find(needle, at + 1)
                    if at >= 0:
                        r = at // FRAME
                        offsets.append((ri, p - r))
                        n = run_length(capture, p, data, r, min(end - p, len(data) // FRAME - r))
                        hit = (p, n, ri, r)
                        break
        if hit is None:
            p += 1
            continue
        runs.append(hit)
        p += hit[1]
    return runs


def sound_bounds(capture, start, end):
    """First and one past the last frame that is not silent."""
    first, last = None, None
    zero = b'\0' * FRAME
    for f in range(start, end):
        if capture[f * FRAME:(f + 1) * FRAME] != zero:
            first = f
            break
    for f in range(end - 1, start - 1, -1):
        if capture[f * FRAME:(f + 1) * FRAME] != zero:
            last = f + 1
            break
    return first, last


def read_timeline(path):
    events = []
    with open(path) as f:
        for line in f:
            words = line.split()
            if len(words) >= 2:
                events.append((' '.join(words[:-1]), int(words[-1]) // FRAME))
    return events


def segments(events):
    """(name, begin frame, end frame, [(event, frame), ...]) per begin/end pair."""
    out = []
    current = None
    for what, frame in events:
        if what.startswith('begin '):
            current = [what[6:], frame, None, []]
        elif what.startswith('end ') and current is not None:
            current[2] = frame
            out.append(tuple(current))
            current = None
        elif current is not None:
            current[3].append((what, frame))
    return out


def check_plain(name, capture, begin, end, tool, results):
    first, last = sound_bounds(capture, begin, end)
    if first is None:
        results.append(('FAIL', name, 'the recording is silent between bytes %d and %d' % (begin * 4, end * 4)))
        return
    a = render(tool, last - first + BLOCK, 128, 104)
    runs = match_runs(capture, first, last, [a])
    if not runs:
        results.append(('FAIL', name, 'no run of frames equals the render'))
        return
    start = runs[0][0] - runs[0][3]            # capture frame of render frame 0
    judged_from = max(first, start + RATE * 200 // 1000)
    judged = last - judged_from
    matched = sum(max(0, min(p + n, last) - max(p, judged_from)) for p, n, _, _ in runs)
    share = matched / judged if judged > 0 else 0.0
    backwards = [(p, r) for (p, n, _, r), (_, pn, _, pr) in zip(runs[1:], runs) if r < pr + pn - 8]
    first_gap = None
    covered = judged_from
    for p, n, _, _ in runs:
        if p > covered and p > judged_from:
            first_gap = covered
            break
        covered = max(covered, p + n)
    detail = ('%d of %d frames (%.3f %%) after the first 200 ms equal the render, in %d runs; '
              'first unmatched frame %s (%.2f s into the sound)'
              % (matched, judged, 100.0 * share, len(runs),
                 first_gap if first_gap is not None else 'none',
                 ((first_gap - start) / RATE) if first_gap is not None else 0.0))
    if judged < RATE * 8:
        results.append(('FAIL', name, 'only %.2f s of sound recorded' % (judged / RATE)))
    elif share < 0.99:
        results.append(('FAIL', name, detail))
    elif backwards:
        results.append(('FAIL', name, 'the render starts over at capture frame %d (render frame %d): '
                        'the sound restarted' % backwards[0]))
    else:
        results.append(('PASS', name, detail))


def check_changes(name, capture, begin, end, events, tool, results):
    first, last = sound_bounds(capture, begin, end)
    if first is None:
        results.append(('FAIL', name, 'the recording is silent'))
        return
    frames = last - first + BLOCK
    settings = [(128, 104)]
    for what, _ in events:
        volume, profile = settings[-1]
        kind, value = what.split()
        settings.append((int(value), profile) if kind == 'volume' else (volume, int(value)))
    renders = [render(tool, frames, v, p) for v, p in settings]
    runs = match_runs(capture, first, last, renders)
    if not runs or runs[0][2] != 0:
        results.append(('FAIL', name, 'the sound does not start as the render of the start settings'))
        return
    start = runs[0][0] - runs[0][3]
    # Each phase must come in order, and each change be heard within reach.
    for i, (what, frame) in enumerate(events, start=1):
        heard = (frame - start) // BLOCK          # block playing when the change was made
        new_runs = [r for r in runs if r[2] == i and r[1] >= BLOCK // 2]
        old_runs = [r for r in runs if r[2] == i - 1]
        if not new_runs:
            results.append(('FAIL', '%s: %s' % (name, what), 'no block of the recording equals the render '
                            'with the new settings'))
            continue
        switch = new_runs[0][3] // BLOCK           # first block heard with the new settings
        last_old = max(r[3] + r[1] for r in old_runs) if old_runs else 0
        # Two blocks are queued when the change is made: the next block the
        # program makes is two after the one playing, and the block after it
        # is the first whose whole frame was made with the new settings (the
        # one before mixes in the overlap of the old frame). Up to two
        # blocks more are allowed for the sound server's latency.
        detail = ('change made while block %d played; the recording continues as the new render '
                  'from block %d; the old render matches up to block %.2f'
                  % (heard, switch, last_old / BLOCK))
        if switch < heard + 1 or switch > heard + 2 + 2:
            results.append(('FAIL', '%s: %s' % (name, what), detail))
        elif last_old < (switch - 1) * BLOCK - BLOCK // 8:
            results.append(('FAIL', '%s: %s' % (name, what), detail + ': the old sound stopped too early'))
        else:
            results.append(('PASS', '%s: %s' % (name, what), detail))
    # After the last change the sound follows the last render to its end.
    p, n, ri, _ = runs[-1]
    if ri != len(settings) - 1 or p + n < last - NEEDLE:
        results.append(('FAIL', name, 'the sound does not end as the render of the last settings '
                        '(last run: render %d, frames %d..%d of %d)' % (ri, p, p + n, last)))


def main():
    if len(sys.argv) != 4:
        print(__doc__)
        return 2
    capture_path, timeline_path, tool = sys.argv[1:]
    with open(capture_path, 'rb') as f:
        capture = f.read()
    results = []
    for name, begin, end, events in segments(read_timeline(timeline_path)):
        end = min(end, len(capture) // FRAME)
        if name == 'plain':
            check_plain('recording equals the render', capture, begin, end, tool, results)
        else:
            check_changes('changes while playing', capture, begin, end, events, tool, results)
    if not results:
        results.append(('FAIL', 'recording', 'the time line has no recorded stretch'))
    for verdict, name, detail in results:
        print('%s %s: %s' % (verdict, name, detail))
    return 0 if all(v == 'PASS' for v, _, _ in results) else 1


if __name__ == '__main__':
    sys.exit(main())
