#!/usr/bin/env python3
"""Compares what the sound server recorded while Sombrel.exe played with what
the render tool makes for the same settings.

The program's driver notes in a time line, at each action, how many bytes the
recording held. The last word of a line is always that count; the words
before it are split as a shell splits them:

  begin KIND ['what the test shows'] [render options]   a stretch starts
  set [render options]                                   settings changed while playing
  volume V / profile P                                   the same as set --volume V / --profile P
  end KIND                                               the stretch ends

Render options are those of the render tool (--volume 200, --eq V0,...,V30,
--fade-in 1, --stop-after 1, ...): the settings in force from Play on. For
each stretch this script renders those settings (from block 0, as Play
starts) and finds the runs of consecutive frames that equal a render
exactly. A recording may miss a few frames near the start of the stream, so
the runs are found wherever they are, not by comparing from frame 0.

  plain:    at least 99 % of the frames recorded from 200 ms after the sound
            starts to its end equal the render, and the render never starts
            over (a second Play while playing must not restart the sound);
  changes:  the recording follows the render of the old settings up to the
            change and continues as the render of the new settings from a
            block at most two blocks after the next one the program makes;
  stop:     the settings include --stop-after, so the render ends where the
            program stops by itself: the sound is that render from its start,
            at least 99 % of it after the first 200 ms; every block but the
            last is heard whole, the last as far as the device played it
            before the stop's reset cut it, and silence follows;
  alarm:    as stop, and then the chime (--chime at the same options): at
            least 99 % of its frames after its first 200 ms, in order, up to
            its very last frame, then silence again.

Usage: compare_recording.py CAPTURE.raw TIMELINE RENDER_TOOL
Prints one line per check, "PASS name" or "FAIL name: why", and exits 1 on
any failure.
"""
import os
import shlex
import subprocess
import sys
import tempfile

FRAME = 4                 # bytes: 16-bit left, 16-bit right
BLOCK = 8192              # frames
RATE = 48000
NEEDLE = 64               # frames searched for when no known offset fits


def render(tool, frames, options=()):
    """Raw PCM of the render with `options`, at least `frames` long unless
    a stop time ends it sooner."""
    blocks = frames // BLOCK + 4
    return subprocess.run([tool, '--out', '-', '--blocks', str(blocks)] + list(options),
                          check=True, stdout=subprocess.PIPE).stdout


def render_chime(tool, options=()):
    """Raw PCM of the chime the program queues with `options` in force."""
    with tempfile.TemporaryDirectory() as folder:
        path = os.path.join(folder, 'chime.wav')
        subprocess.run([tool, '--chime', path] + list(options), check=True)
        with open(path, 'rb') as f:
            data = f.read()
    return data[44:]                      # past the RIFF header


def merged(options, changes):
    """The options in force after `changes`: each option given again takes
    its new value (every render option has one value)."""
    out = list(options)
    for i in range(0, len(changes) - 1, 2):
        name, value = changes[i], changes[i + 1]
        if name in out[0::2]:
            out[out[0::2].index(name) * 2 + 1] = value
        else:
            out += [name, value]
    return out


def describe(options, changes):
    """Short words for a change: the option and its value, for --eq the
    bands that moved."""
    words = []
    for i in range(0, len(changes) - 1, 2):
        name, value = changes[i], changes[i + 1]
        if name == '--eq':
            old = dict(zip(options[0::2], options[1::2])).get('--eq', ','.join(['128'] * 31)).split(',')
            new = value.split(',')
            moved = ['band %d %s -> %s' % (k, a, b) for k, (a, b) in enumerate(zip(old, new)) if a != b]
            words.append('eq ' + ', '.join(moved or ['unchanged']))
        else:
            words.append('%s %s' % (name.lstrip('-'), value))
    return '; '.join(words)


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
    """(words, frame) per line: the words split as a shell splits them, the
    frame the recording's size at that moment."""
    events = []
    with open(path) as f:
        for line in f:
            words = shlex.split(line)
            if len(words) >= 2:
                events.append((words[:-1], int(words[-1]) // FRAME))
    return events


def segments(events):
    """(kind, title, options, begin frame, end frame, [(changes, frame), ...])
    per begin/end pair; a begin without its end is dropped when the next
    begin comes (a test that started over)."""
    out = []
    current = None
    for words, frame in events:
        if words[0] == 'begin' and len(words) >= 2:
            rest = words[2:]
            title = rest.pop(0) if rest and not rest[0].startswith('--') else None
            current = [words[1], title, rest, frame, None, []]
        elif words[0] == 'end' and current is not None:
            current[4] = frame
            out.append(tuple(current))
            current = None
        elif current is not None:
            if words[0] == 'set':
                current[5].append((words[1:], frame))
            elif words[0] in ('volume', 'profile') and len(words) == 2:
                current[5].append((['--' + words[0], words[1]], frame))
    return out


def covered(runs, lo, hi):
    """Frames of capture lo..hi-1 inside the runs, and the first frame from
    lo on that is in none of them (None if all are)."""
    matched = sum(max(0, min(p + n, hi) - max(p, lo)) for p, n, _, _ in runs)
    gap = None
    at = lo
    for p, n, _, _ in sorted(runs):
        if p > at:
            break
        at = max(at, p + n)
    if at < hi:
        gap = at
    return matched, gap


def render_covered(runs, lo, hi):
    """Render frames lo..hi-1 that some run holds (wherever in the capture),
    and the first one that none holds (None if all are)."""
    spans = sorted((max(r, lo), min(r + n, hi)) for _, n, _, r in runs if r + n > lo and r < hi)
    count = 0
    gap = None
    at = lo
    for a, b in spans:
        if a > at and gap is None:
            gap = at
        if b > at:
            count += b - max(a, at)
            at = b
    if at < hi and gap is None:
        gap = at
    return count, gap


def check_plain(name, capture, begin, end, options, tool, results):
    first, last = sound_bounds(capture, begin, end)
    if first is None:
        results.append(('FAIL', name, 'the recording is silent between bytes %d and %d' % (begin * 4, end * 4)))
        return
    a = render(tool, last - first + BLOCK, options)
    runs = match_runs(capture, first, last, [a])
    if not runs:
        results.append(('FAIL', name, 'no run of frames equals the render %s' % ' '.join(options)))
        return
    start = runs[0][0] - runs[0][3]            # capture frame of render frame 0
    judged_from = max(first, start + RATE * 200 // 1000)
    judged = last - judged_from
    matched, first_gap = covered(runs, judged_from, last)
    share = matched / judged if judged > 0 else 0.0
    backwards = [(p, r) for (p, n, _, r), (_, pn, _, pr) in zip(runs[1:], runs) if r < pr + pn - 8]
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


def check_changes(name, capture, begin, end, options, events, tool, results):
    first, last = sound_bounds(capture, begin, end)
    if first is None:
        results.append(('FAIL', name, 'the recording is silent'))
        return
    frames = last - first + BLOCK
    settings = [list(options)]
    for changes, _ in events:
        settings.append(merged(settings[-1], changes))
    renders = [render(tool, frames, s) for s in settings]
    runs = match_runs(capture, first, last, renders)
    if not runs or runs[0][2] != 0:
        results.append(('FAIL', name, 'the sound does not start as the render of the start settings'))
        return
    start = runs[0][0] - runs[0][3]
    # Each phase must come in order, and each change be heard within reach.
    for i, (changes, frame) in enumerate(events, start=1):
        what = describe(settings[i - 1], changes)
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


def fragment_at(capture, first, last):
    """The sound from frame `first` up to the next NEEDLE silent frames."""
    zero = b'\0' * FRAME
    f, quiet = first, 0
    while f < last and quiet < NEEDLE:
        quiet = quiet + 1 if capture[f * FRAME:(f + 1) * FRAME] == zero else 0
        f += 1
    return capture[first * FRAME:(f - quiet) * FRAME]


def blocks(frames):
    return '1 block' if frames // BLOCK == 1 else '%d blocks' % (frames // BLOCK)


def check_stop(name, capture, begin, end, options, tool, results, chime=False):
    """The sound is the render that the stop time ends, then silence; with
    `chime`, the chime follows whole and silence after it.

    The stop resets the device at once, so the block it was playing is cut
    where it stood: the recording must hold every block of the render but
    the last, may hold some or all of the last, and nothing after it. When
    the stop comes while Play makes its second block, the last block is the
    only one, and the reset may leave nothing of it at all."""
    rain = render(tool, end - begin + BLOCK, options)
    total = len(rain) // FRAME
    need = max(0, total - BLOCK)                     # render frames that must be heard
    renders = [rain]
    if chime:
        renders.append(render_chime(tool, options))
    first, last = sound_bounds(capture, begin, end)
    if first is None:
        if need == 0 and not chime:
            results.append(('PASS', name, 'the render %s has %s; the reset of the stop cut all of it, '
                            'and nothing was heard after it' % (' '.join(options), blocks(total))))
        else:
            results.append(('FAIL', name, 'the recording is silent between bytes %d and %d: nothing of the '
                            'render %s was heard' % (begin * 4, end * 4, ' '.join(options))))
        return
    runs = match_runs(capture, first, last, renders)
    rain_runs = [r for r in runs if r[2] == 0]
    tune_runs = [r for r in runs if r[2] == 1]
    if not rain_runs:
        # The reset may leave the rain too few frames for the search of
        # match_runs (a needle of NEEDLE frames): look for the sound up to
        # the first silence in the render as it is.
        fragment = fragment_at(capture, first, last)
        at = rain.find(fragment) if fragment else -1
        while at >= 0 and at % FRAME:
            at = rain.find(fragment, at + 1)
        if at >= 0:
            rain_runs = [(first, len(fragment) // FRAME, 0, at // FRAME)]
    if rain_runs:
        start = rain_runs[0][0] - rain_runs[0][3]         # capture frame of render frame 0
        reached = max(p + n for p, n, _, _ in rain_runs)  # capture frame after the last rain frame heard
        heard = max(r + n for _, n, _, r in rain_runs)    # render frame after the last one heard
        judged_from = max(first, start + RATE * 200 // 1000)
        matched, first_gap = covered(rain_runs, judged_from, reached)
        judged = reached - judged_from
        share = matched / judged if judged > 0 else 1.0
        backwards = [(p, r) for (p, n, _, r), (_, pn, _, pr) in zip(rain_runs[1:], rain_runs)
                     if r < pr + pn - 8]
        detail = ('the render %s has %s; the recording follows it to block %d + %d frames '
                  '(%.3f s)' % (' '.join(options), blocks(total), heard // BLOCK, heard % BLOCK, heard / RATE))
        if judged > 0:
            detail += (', %d of %d frames (%.3f %%) after the first 200 ms equal it, first unmatched frame %s'
                       % (matched, judged, 100.0 * share,
                          ('%d (%.2f s into the sound)' % (first_gap - start, (first_gap - start) / RATE))
                          if first_gap is not None else 'none'))
    elif need == 0:
        reached = begin                                   # no rain: anything but the chime is stray
        heard, share, backwards = 0, 1.0, []
        detail = ('the render %s has %s; the reset of the stop cut all of it'
                  % (' '.join(options), blocks(total)))
    else:
        results.append(('FAIL', name, 'no run of frames equals the render %s (%s); the sound starts '
                        'at byte %d' % (' '.join(options), blocks(total), first * 4)))
        return
    # Sound after the rain that is not the chime: the program played on. The
    # chime's whole span counts as the chime (its first frames may be lost,
    # see below); its frames are judged on their own.
    chime_span = (0, 0)
    if tune_runs:
        chime_span = (tune_runs[0][0] - tune_runs[0][3], max(p + n for p, n, _, _ in tune_runs))
    stray = None
    zero = b'\0' * FRAME
    f = reached
    while f < last:
        if chime_span[0] <= f < chime_span[1]:
            f = chime_span[1]
            continue
        if capture[f * FRAME:(f + 1) * FRAME] != zero:
            stray = f
            break
        f += 1
    if share < 0.99:
        results.append(('FAIL', name, detail))
    elif heard < need:
        results.append(('FAIL', name, detail + ('; expected every block up to %d, the last but one, heard '
                                                'whole: the program stopped early' % (need // BLOCK - 1))))
    elif backwards:
        results.append(('FAIL', name, 'the render starts over at capture frame %d (render frame %d): '
                        'the sound restarted' % backwards[0]))
    elif stray is not None:
        results.append(('FAIL', name, detail + ('; but sound goes on after it: a frame that is neither silent '
                                                'nor the chime %.3f s after the last frame of the render, '
                                                'capture byte %d' % ((stray - reached) / RATE, stray * 4))))
    else:
        results.append(('PASS', name, detail + ', then silence'))
    if not chime:
        return
    tune_total = len(renders[1]) // FRAME
    cname = name + ': the chime'
    if not tune_runs:
        results.append(('FAIL', cname, 'no run of frames equals the chime at %s' % ' '.join(options)))
        return
    # A new stream may lose a few frames at its start in the sound server,
    # as the rain's may: the chime is judged from 200 ms in, with the same
    # 1 % allowance for frames the sound server drops under load; its last
    # frame must be heard, in order, and silence follow (checked above).
    tune_start = tune_runs[0][0] - tune_runs[0][3]
    judged_from = RATE * 200 // 1000
    whole, _ = render_covered(tune_runs, 0, tune_total)
    tmatched, tgap = render_covered(tune_runs, judged_from, tune_total)
    tjudged = tune_total - judged_from
    tlast = max(r + n for _, n, _, r in tune_runs)
    tbackwards = [(p, r) for (p, n, _, r), (_, pn, _, pr) in zip(tune_runs[1:], tune_runs) if r < pr + pn - 8]
    tdetail = (('the chime starts %.3f s after the last frame of the rain; ' % ((tune_start - reached) / RATE)
                if heard else 'no rain was heard before the chime; ') +
               ('%d of its %d frames '
               '(%.3f %%) equal the render tool\'s chime, %d of %d (%.3f %%) after its first 200 ms; first '
               'missing frame after them %s; its last frame heard is %d'
               % (whole, tune_total, 100.0 * whole / tune_total, tmatched, tjudged, 100.0 * tmatched / tjudged,
                  ('%d (%.3f s into the chime)' % (tgap, tgap / RATE)) if tgap is not None else 'none', tlast - 1)))
    if tune_start < reached:
        results.append(('FAIL', cname, tdetail + ': it starts before the rain stopped'))
    elif tmatched < 0.99 * tjudged:
        results.append(('FAIL', cname, tdetail))
    elif tlast != tune_total:
        results.append(('FAIL', cname, tdetail + ': the chime was cut before its end (frame %d)' % (tune_total - 1)))
    elif tbackwards:
        results.append(('FAIL', cname, tdetail + ': the chime starts over at capture frame %d (chime frame %d)'
                        % tbackwards[0]))
    else:
        results.append(('PASS', cname, tdetail))


def main():
    if len(sys.argv) != 4:
        print(__doc__)
        return 2
    capture_path, timeline_path, tool = sys.argv[1:]
    with open(capture_path, 'rb') as f:
        capture = f.read()
    results = []
    for kind, title, options, begin, end, events in segments(read_timeline(timeline_path)):
        end = min(end, len(capture) // FRAME)
        if kind == 'plain':
            check_plain(title or 'recording equals the render', capture, begin, end, options, tool, results)
        elif kind == 'changes':
            check_changes(title or 'changes while playing', capture, begin, end, options, events, tool, results)
        elif kind in ('stop', 'alarm'):
            check_stop(title or kind, capture, begin, end, options, tool, results, chime=kind == 'alarm')
        else:
            results.append(('FAIL', title or kind, 'the time line names a stretch of unknown kind "%s"' % kind))
    if not results:
        results.append(('FAIL', 'recording', 'the time line has no recorded stretch'))
    for verdict, name, detail in results:
        print('%s %s: %s' % (verdict, name, detail))
    return 0 if all(v == 'PASS' for v, _, _ in results) else 1


if __name__ == '__main__':
    sys.exit(main())
