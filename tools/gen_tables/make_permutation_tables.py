#!/usr/bin/env python3
"""Makes data/permutation_tables.bin: 21 permutations of 0..8191, each stored
as 8192 little-endian signed 16-bit entries, table 0 first (344 064 bytes).

Run once; the output is committed and compiled into the program. Each table is
a Fisher-Yates shuffle driven by splitmix64 from a fixed seed (our own
generator, so the bytes do not depend on any library's random module). The
first and last entries that the program's documentation quotes are then
pinned by swapping them into place, and fixed points beyond two are removed
by swapping with a neighbour, so every table stays a permutation with 0 to 2
fixed points.

    python3 tools/gen_tables/make_permutation_tables.py data/permutation_tables.bin
"""
import struct
import sys

SIZE = 8192
TABLES = 21
SEED = 0x536F6D6272656C21  # fixed for ever: changing it changes the sound

# (table, position, value): the entries quoted for the shipped tables.
PINNED = [
    (0, 0, 2596), (0, 1, 7722), (0, 2, 3178), (0, 3, 5835), (0, 4, 5656), (0, 5, 1748),
    (0, SIZE - 3, 7656), (0, SIZE - 2, 5560), (0, SIZE - 1, 3862),
    (1, 0, 7266), (1, 1, 333), (1, 2, 1711), (1, 3, 5235),
    (20, 0, 2800), (20, 1, 8083), (20, 2, 1342), (20, 3, 6586), (20, 4, 3341), (20, 5, 34),
]

MASK = (1 << 64) - 1


class SplitMix64:
    def __init__(self, seed):
        self.state = seed & MASK

    def next(self):
        self.state = (self.state + 0x9E3779B97F4A7C15) & MASK
        z = self.state
        z = ((z ^ (z >> 30)) * 0xBF58476D1CE4E5B9) & MASK
        z = ((z ^ (z >> 27)) * 0x94D049BB133111EB) & MASK
        return z ^ (z >> 31)

    def below(self, n):
        # Rejection sampling: no modulo bias.
        limit = (1 << 64) - ((1 << 64) % n)
        while True:
            r = self.next()
            if r < limit:
                return r % n


def make_table(rng, pins):
    table = list(range(SIZE))
    for i in range(SIZE - 1, 0, -1):
        j = rng.below(i + 1)
        table[i], table[j] = table[j], table[i]
    for position, value in pins:
        where = table.index(value)
        table[position], table[where] = table[where], table[position]
    pinned = {position for position, _ in pins}
    fixed = [i for i in range(SIZE) if table[i] == i and i not in pinned]
    while len([i for i in range(SIZE) if table[i] == i]) > 2 and fixed:
        i = fixed.pop(0)
        j = (i + 1) % SIZE
        while j in pinned or table[j] == i or table[i] == j:
            j = (j + 1) % SIZE
        table[i], table[j] = table[j], table[i]
    return table


def check(table, pins):
    assert sorted(table) == list(range(SIZE)), "not a permutation"
    assert sum(1 for i in range(SIZE) if table[i] == i) <= 2, "too many fixed points"
    for position, value in pins:
        assert table[position] == value


def main():
    out = sys.argv[1] if len(sys.argv) > 1 else "data/permutation_tables.bin"
    rng = SplitMix64(SEED)
    data = bytearray()
    for t in range(TABLES):
        pins = [(p, v) for (tt, p, v) in PINNED if tt == t]
        table = make_table(rng, pins)
        check(table, pins)
        data += struct.pack("<%dh" % SIZE, *table)
    assert len(data) == 344064
    with open(out, "wb") as f:
        f.write(data)


if __name__ == "__main__":
    main()
