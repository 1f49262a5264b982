#!/usr/bin/python3
"""Draws the module's two 32x32 pictures and writes them as 8-bit bitmap files.

Usage: gen_bitmaps.py OUTDIR   (writes OUTDIR/bitmap400.bmp and OUTDIR/bitmap401.bmp)

Bitmap 400 is one honeycomb cell with a key on it; bitmap 401 is a cluster of three smaller
cells with a smaller key in front. The output depends on nothing but this file; the static
checker of the built module holds the SHA-256 of each picture's bytes.
"""

import math
import os
import struct
import sys

SIZE = 32
PALETTE_ENTRIES = 256

# Palette indices; entries past the last named colour stay black and unused.
BACKGROUND, CELL_EDGE, HONEY, HONEY_LIGHT, HONEY_DARK, KEY_EDGE, KEY, KEY_LIGHT = range(8)
COLOURS = {  # (red, green, blue)
    BACKGROUND: (255, 255, 255),
    CELL_EDGE: (110, 62, 8),
    HONEY: (242, 178, 40),
    HONEY_LIGHT: (252, 216, 112),
    HONEY_DARK: (204, 134, 18),
    KEY_EDGE: (52, 54, 64),
    KEY: (196, 200, 212),
    KEY_LIGHT: (240, 242, 248),
}

SQRT3 = math.sqrt(3.0)


# Pointy-top hexagon of circumradius r around (cx, cy): the honeycomb cell outline.
def in_hexagon(x, y, cx, cy, r):
    dx, dy = abs(x - cx), abs(y - cy)
    return dx <= r * SQRT3 / 2 and dy <= r - dx / SQRT3


# Horizontal key whose bow is centred at (ox, oy), shaft pointing right, teeth down.
def in_key(x, y, ox, oy, s):
    u, v = (x - ox) / s, (y - oy) / s
    d = math.hypot(u, v)
    if d <= 1.8:  # the hole in the bow
        return False
    if d <= 4.6:
        return True
    if 3.5 <= u <= 13.0 and -1.3 <= v <= 1.3:
        return True
    return (8.8 <= u <= 10.4 and 1.3 <= v <= 4.2) or (11.4 <= u <= 13.0 and 1.3 <= v <= 3.2)


# Grid of palette indices, row 0 at the top.
def blank():
    return [[BACKGROUND] * SIZE for _ in range(SIZE)]


# Paints every pixel whose centre lies in the shape.
def fill(grid, inside, index):
    for row in range(SIZE):
        for col in range(SIZE):
            if inside(col + 0.5, row + 0.5):
                grid[row][col] = index


# Paints the pixels just outside the shape (8-neighbourhood) that are not in it.
def outline(grid, inside, index):
    mask = [[inside(c + 0.5, r + 0.5) for c in range(SIZE)] for r in range(SIZE)]
    for row in range(SIZE):
        for col in range(SIZE):
            if mask[row][col]:
                continue
            near = any(0 <= row + dr < SIZE and 0 <= col + dc < SIZE and mask[row + dr][col + dc]
                       for dr in (-1, 0, 1) for dc in (-1, 0, 1))
            if near:
                grid[row][col] = index


# One bevelled honeycomb cell: dark edge, light upper-left rim, darker lower-right rim.
def draw_cell(grid, cx, cy, r):
    fill(grid, lambda x, y: in_hexagon(x, y, cx, cy, r), CELL_EDGE)
    rim = max(1.0, r / 6)
    for row in range(SIZE):
        for col in range(SIZE):
            x, y = col + 0.5, row + 0.5
            if not in_hexagon(x, y, cx, cy, r - 1.2):
                continue
            if in_hexagon(x, y, cx, cy, r - 1.2 - rim * 1.6):
                grid[row][col] = HONEY
            else:
                grid[row][col] = HONEY_LIGHT if (x - cx) + (y - cy) < 0 else HONEY_DARK


# A key with a dark edge and a highlight along the top of its bow and shaft.
def draw_key(grid, ox, oy, s):
    def shape(x, y):
        return in_key(x, y, ox, oy, s)

    # Only upper edges catch the light: the rim below the bow's hole stays plain.
    def lit(x, y):
        return y < oy and shape(x, y) and not shape(x, y - 1.0)
    outline(grid, shape, KEY_EDGE)
    fill(grid, shape, KEY)
    fill(grid, lit, KEY_LIGHT)


# Bitmap 400: one large cell with a key across it.
def draw_cell_with_key():
    grid = blank()
    draw_cell(grid, 16.0, 16.0, 15.6)
    draw_key(grid, 10.5, 14.5, 1.0)
    return grid


# Bitmap 401: three touching cells with a smaller key in front.
def draw_honeycomb_with_key():
    grid = blank()
    r = 8.6
    w = r * SQRT3  # distance between the centres of touching cells
    for cx, cy in ((16.0 - w / 2, 9.5), (16.0 + w / 2, 9.5), (16.0, 9.5 + 1.5 * r)):
        draw_cell(grid, cx, cy, r)
    draw_key(grid, 9.0, 24.0, 0.85)
    return grid


DRAWINGS = {400: draw_cell_with_key, 401: draw_honeycomb_with_key}


# The resource form of a picture: BITMAPINFOHEADER, colour table and bottom-up pixel rows.
def dib(resource_id):
    grid = DRAWINGS[resource_id]()
    header = struct.pack('<IiiHHIIiiII', 40, SIZE, SIZE, 1, 8, 0, SIZE * SIZE, 0, 0,
                         PALETTE_ENTRIES, 0)
    table = bytearray(4 * PALETTE_ENTRIES)
    for index, (red, green, blue) in COLOURS.items():
        table[4 * index:4 * index + 4] = bytes((blue, green, red, 0))
    pixels = b''.join(bytes(row) for row in reversed(grid))
    return header + bytes(table) + pixels


# The file form: a 14-byte BITMAPFILEHEADER in front of the resource form.
def bmp_file(resource_id):
    body = dib(resource_id)
    offset = 14 + 40 + 4 * PALETTE_ENTRIES
    return struct.pack('<2sIHHI', b'BM', 14 + len(body), 0, 0, offset) + body


# Writes both bitmap files into the folder named on the command line.
def main(argv):
    if len(argv) != 2:
        sys.stderr.write('usage: gen_bitmaps.py OUTDIR\n')
        return 2
    os.makedirs(argv[1], exist_ok=True)
    for resource_id in sorted(DRAWINGS):
        path = os.path.join(argv[1], 'bitmap%d.bmp' % resource_id)
        with open(path, 'wb') as out:
            out.write(bmp_file(resource_id))
    return 0


if __name__ == '__main__':
    sys.exit(main(sys.argv))
