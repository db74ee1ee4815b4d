#!/usr/bin/python3
"""Checks that a screenshot shows something: decodes a PNG (8-bit RGB or RGBA,
standard library only) and fails when it has fewer distinct colours or a
smaller share of non-white pixels than asked.

usage: png_colours.py IMAGE --min-colours N --min-inked FRACTION
"""
import argparse
import struct
import sys
import zlib


def pixels(path):
    data = open(path, 'rb').read()
    if data[:8] != b'\x89PNG\r\n\x1a\n':
        sys.exit(f'{path}: not a PNG')
    at, compressed = 8, b''
    while at < len(data):
        length, kind = struct.unpack('>I4s', data[at:at + 8])
        body = data[at + 8:at + 8 + length]
        at += 12 + length
        if kind == b'IHDR':
            width, height, depth, colour = struct.unpack('>IIBB', body[:10])
            if depth != 8 or colour not in (2, 6):
                sys.exit(f'{path}: only 8-bit RGB or RGBA PNGs are read')
        elif kind == b'IDAT':
            compressed += body
    size = 3 if colour == 2 else 4
    raw, stride = zlib.decompress(compressed), width * size
    previous = bytearray(stride)
    for y in range(height):
        start = y * (stride + 1)
        kind, line = raw[start], bytearray(raw[start + 1:start + 1 + stride])
        # Undo the row's filter (none, sub, up, average, Paeth).
        for x in range(stride):
            left = line[x - size] if x >= size else 0
            up, corner = previous[x], previous[x - size] if x >= size else 0
            if kind == 1:
                line[x] = (line[x] + left) & 255
            elif kind == 2:
                line[x] = (line[x] + up) & 255
            elif kind == 3:
                line[x] = (line[x] + (left + up) // 2) & 255
            elif kind == 4:
                guess = left + up - corner
                a, b, c = abs(guess - left), abs(guess - up), abs(guess - corner)
                line[x] = (line[x] + (left if a <= b and a <= c else up if b <= c else corner)) & 255
        yield from (bytes(line[x:x + 3]) for x in range(0, stride, size))
        previous = line


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument('image')
    parser.add_argument('--min-colours', type=int, required=True)
    parser.add_argument('--min-inked', type=float, required=True)
    arguments = parser.parse_args()
    colours, inked, total = set(), 0, 0
    for pixel in pixels(arguments.image):
        colours.add(pixel)
        inked += pixel != b'\xff\xff\xff'
        total += 1
    share = inked / max(total, 1)
    print(f'{arguments.image}: {len(colours)} colours, {100 * share:.1f} % of the pixels not white')
    if len(colours) < arguments.min_colours or share < arguments.min_inked:
        sys.exit(f'{arguments.image}: looks blank (at least {arguments.min_colours} colours and '
                 f'{100 * arguments.min_inked:.0f} % inked pixels expected)')


main()
