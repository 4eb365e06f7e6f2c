#!/usr/bin/env python3
"""Cuts a crop out of an 8-bit RGB or RGBA PNG and writes it as raw pixel words.

The output is width x height 32-bit words 0xAARRGGBB, each stored little-endian, row after row:
the same layout the library takes, readable by the tests on any platform without an image
library. Only the standard library is used.

usage: make_crop.py IN.png X Y W H OUT.argb
"""
import struct
import sys
import zlib


def read_png(path):
    with open(path, "rb") as f:
        data = f.read()
    if data[:8] != b"\x89PNG\r\n\x1a\n":
        raise SystemExit(f"{path}: not a PNG file")
    pos, idat = 8, b""
    while pos < len(data):
        length, kind = struct.unpack(">I4s", data[pos:pos + 8])
        body = data[pos + 8:pos + 8 + length]
        if kind == b"IHDR":
            width, height, depth, colour, _, _, interlace = struct.unpack(">IIBBBBB", body)
            if depth != 8 or colour not in (2, 6) or interlace:
                raise SystemExit(f"{path}: only 8-bit RGB/RGBA non-interlaced PNG is supported")
        elif kind == b"IDAT":
            idat += body
        pos += 12 + length
    bpp = 3 if colour == 2 else 4
    raw, stride = zlib.decompress(idat), width * bpp
    rows, prev, i = [], bytearray(stride), 0
    for _ in range(height):
        kind, line = raw[i], bytearray(raw[i + 1:i + 1 + stride])
        i += 1 + stride
        for x in range(stride):
            a = line[x - bpp] if x >= bpp else 0
            b = prev[x]
            c = prev[x - bpp] if x >= bpp else 0
            if kind == 1:
                line[x] = (line[x] + a) & 255
            elif kind == 2:
                line[x] = (line[x] + b) & 255
            elif kind == 3:
                line[x] = (line[x] + (a + b) // 2) & 255
            elif kind == 4:
                p = a + b - c
                pa, pb, pc = abs(p - a), abs(p - b), abs(p - c)
                pred = a if pa <= pb and pa <= pc else (b if pb <= pc else c)
                line[x] = (line[x] + pred) & 255
        rows.append(bytes(line))
        prev = line
    return width, height, bpp, rows


def main():
    if len(sys.argv) != 7:
        raise SystemExit(__doc__)
    path, x0, y0, w, h, out = sys.argv[1], *map(int, sys.argv[2:6]), sys.argv[6]
    width, height, bpp, rows = read_png(path)
    if x0 < 0 or y0 < 0 or x0 + w > width or y0 + h > height:
        raise SystemExit("crop outside the image")
    words = []
    for y in range(y0, y0 + h):
        for x in range(x0, x0 + w):
            px = rows[y][x * bpp:(x + 1) * bpp]
            alpha = px[3] if bpp == 4 else 255
            words.append(alpha << 24 | px[0] << 16 | px[1] << 8 | px[2])
    with open(out, "wb") as f:
        f.write(struct.pack(f"<{len(words)}I", *words))


if __name__ == "__main__":
    main()
