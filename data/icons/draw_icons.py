#!/usr/bin/env python3
"""Draws the program's icons and writes them as .ico files beside this script.

Each icon is one 32 x 32 image in 16 colours (4 bits per pixel, the standard
16-colour palette) with a 1-bit transparency mask. The pictures:
  101 a square of random coloured dots on grey (the application icon)
  102 a red triangle pointing right (Play)
  103 a red square (Stop)
  104 a red question mark (Help)
  105 a small loudspeaker (chime test)
  107 a bank of grey slider tracks with black knobs, framed in red (equaliser)
  108 a red arrow pointing up (close the equaliser)
The dots of 101 come from a fixed seed, so running this again gives the same
bytes. Usage: python3 draw_icons.py [output directory]
"""
import os
import random
import struct
import sys

SIZE = 32

# The standard 16-colour palette, as (red, green, blue).
PALETTE = [
    (0, 0, 0), (128, 0, 0), (0, 128, 0), (128, 128, 0),
    (0, 0, 128), (128, 0, 128), (0, 128, 128), (192, 192, 192),
    (128, 128, 128), (255, 0, 0), (0, 255, 0), (255, 255, 0),
    (0, 0, 255), (255, 0, 255), (0, 255, 255), (255, 255, 255),
]
BLACK, MAROON, SILVER, GREY, RED, WHITE = 0, 1, 7, 8, 9, 15
CLEAR = None  # transparent pixel


def blank():
    return [[CLEAR] * SIZE for _ in range(SIZE)]


def fill(img, x0, y0, x1, y1, colour):
    """Fills columns x0..x1-1 and rows y0..y1-1 (top row is 0)."""
    for y in range(max(0, y0), min(SIZE, y1)):
        for x in range(max(0, x0), min(SIZE, x1)):
            img[y][x] = colour


def noise_square():
    img = blank()
    fill(img, 1, 1, 31, 31, GREY)
    rng = random.Random(101)
    bright = [1, 2, 3, 4, 5, 6, 7, 9, 10, 11, 12, 13, 14, 15]
    for y in range(3, 29):
        for x in range(3, 29):
            if rng.random() < 0.55:
                img[y][x] = rng.choice(bright)
    return img


def play_triangle():
    img = blank()
    for y in range(4, 28):
        half = min(y - 4, 27 - y)  # widest in the middle row
        for x in range(7, 7 + 2 * half + 1):
            if x < 28:
                img[y][x] = RED
    return img


def stop_square():
    img = blank()
    fill(img, 6, 6, 26, 26, RED)
    return img


QUESTION = [
    "..######..",
    ".########.",
    "###....###",
    "###....###",
    ".......###",
    "......###.",
    ".....###..",
    "....###...",
    "....###...",
    "....###...",
    "..........",
    "....###...",
    "....###...",
]


def question_mark():
    img = blank()
    scale = 2
    x0 = (SIZE - len(QUESTION[0]) * scale) // 2
    y0 = (SIZE - len(QUESTION) * scale) // 2
    for row, line in enumerate(QUESTION):
        for col, ch in enumerate(line):
            if ch == '#':
                fill(img, x0 + col * scale, y0 + row * scale,
                     x0 + (col + 1) * scale, y0 + (row + 1) * scale, RED)
    return img


def loudspeaker():
    img = blank()
    fill(img, 5, 12, 11, 20, BLACK)          # the magnet box
    for x in range(11, 19):                  # the cone, widening to the right
        spread = (x - 11) + 4
        fill(img, x, 16 - spread, x + 1, 16 + spread, BLACK)
    fill(img, 6, 13, 10, 19, GREY)
    for x in range(12, 18):
        spread = (x - 12) + 3
        fill(img, x, 16 - spread, x + 1, 16 + spread, GREY)
    for radius in (5, 9):                    # two sound waves
        cx = 19
        for y in range(16 - radius, 16 + radius + 1):
            dy = abs(y - 16)
            x = cx + int(round((radius * radius - dy * dy) ** 0.5))
            if x < SIZE:
                img[y][x] = BLACK
    return img


def slider_bank():
    img = blank()
    fill(img, 0, 0, 32, 32, RED)             # the red frame
    fill(img, 2, 2, 30, 30, SILVER)
    knobs = [20, 12, 8, 15, 22, 17]
    for i, knob in enumerate(knobs):
        x = 4 + i * 4
        fill(img, x + 1, 4, x + 2, 28, GREY)  # the track
        fill(img, x, knob - 1, x + 3, knob + 2, BLACK)  # the knob
    return img


def arrow_up():
    img = blank()
    for y in range(4, 16):                   # the head
        half = y - 4
        fill(img, 16 - half - 1, y, 16 + half + 1, y + 1, RED)
    fill(img, 12, 16, 20, 28, RED)           # the shaft
    return img


ICONS = {
    101: noise_square,
    102: play_triangle,
    103: stop_square,
    104: question_mark,
    105: loudspeaker,
    107: slider_bank,
    108: arrow_up,
}


def ico_bytes(img):
    """One-image .ico: directory, BITMAPINFOHEADER, palette, XOR and AND masks."""
    xor_row = SIZE // 2                      # 4 bits per pixel, 16 bytes, already 4-aligned
    and_row = 4                              # 32 bits, already 4-aligned
    xor = bytearray()
    mask = bytearray()
    for y in reversed(range(SIZE)):          # rows are stored bottom-up
        for x in range(0, SIZE, 2):
            hi = img[y][x] or 0
            lo = img[y][x + 1] or 0
            xor.append((hi << 4) | lo)
        bits = 0
        for x in range(SIZE):
            bits = (bits << 1) | (1 if img[y][x] is None else 0)
        mask += struct.pack('>I', bits)
    assert len(xor) == xor_row * SIZE and len(mask) == and_row * SIZE
    palette = b''.join(struct.pack('<BBBB', b, g, r, 0) for (r, g, b) in PALETTE)
    header = struct.pack('<IiiHHIIiiII', 40, SIZE, SIZE * 2, 1, 4, 0,
                         len(xor) + len(mask), 0, 0, 16, 0)
    image = header + palette + bytes(xor) + bytes(mask)
    directory = struct.pack('<HHH', 0, 1, 1)
    entry = struct.pack('<BBBBHHII', SIZE, SIZE, 16, 0, 1, 4, len(image), 6 + 16)
    return directory + entry + image


def main():
    out = sys.argv[1] if len(sys.argv) > 1 else os.path.dirname(os.path.abspath(__file__))
    for number, draw in ICONS.items():
        with open(os.path.join(out, 'icon%d.ico' % number), 'wb') as f:
            f.write(ico_bytes(draw()))


if __name__ == '__main__':
    main()
