#!/usr/bin/env python3
"""Writes the demo's small samples beside samples/scans.asc (see
make_sample_scans.py):
  samples/knob.stl      a binary STL mesh: a closed, rounded knob of 900 triangles
  samples/panel.surf    a fringe-projection measurement: one 48 x 32 raster patch
                        of a gently curved panel, with a few unmeasured pixels
  samples/N46E007.hgt   a terrain tile: 121 x 121 big-endian heights of two hills
"""
import math
import os
import struct

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))


def knob(path, rings=16, segments=30):
    """A surface of revolution closed at both poles: radius r(t) along z."""
    def point(i, j):
        t = i / rings
        r = 20 * math.sin(math.pi * t) * (1 + 0.15 * math.cos(6 * math.pi * t))
        z = -25 * math.cos(math.pi * t)
        a = 2 * math.pi * j / segments
        return (r * math.cos(a), r * math.sin(a), z)

    triangles = []
    for i in range(rings):
        for j in range(segments):
            a, b = point(i, j), point(i, j + 1)
            c, d = point(i + 1, j), point(i + 1, j + 1)
            if i > 0:
                triangles.append((a, c, b))
            if i < rings - 1:
                triangles.append((b, c, d))
    with open(path, "wb") as out:
        out.write(b"knob made by make_samples.py".ljust(80, b" "))
        out.write(struct.pack("<I", len(triangles)))
        for tri in triangles:
            out.write(struct.pack("<3f", 0, 0, 0))
            for v in tri:
                out.write(struct.pack("<3f", *v))
            out.write(b"\0\0")


def panel(path, columns=48, rows=32):
    """The binary measurement layout: header, one patch descriptor at 512, then
    40-byte records x, y, z, pixel column, pixel row, quality."""
    records = []
    for r in range(rows):
        for c in range(columns):
            if (c - 30) ** 2 + (r - 10) ** 2 < 6:  # a glint: no measurement
                continue
            x, y = 2.0 * c, 2.0 * r
            z = 0.004 * (x - 48) ** 2 + 0.002 * (y - 32) ** 2
            records.append(struct.pack("<3d2Id", x, y, z, c, r, 0.9))
    header = b"%ATOSBIN" + b"v4.4.3" + struct.pack("<H3I", 1, 1, 76, 40)
    data = bytearray(header.ljust(512, b"\0"))
    start = 512 + 76
    descriptor = struct.pack("<7I", start, 0, rows, 0, len(records), 1, 1)
    data += descriptor.ljust(76, b"\0")
    for record in records:
        data += record
    with open(path, "wb") as out:
        out.write(data)


def tile(path, side=121):
    heights = []
    for r in range(side):
        for c in range(side):
            h = 900 + 600 * math.exp(-((c - 40) ** 2 + (r - 50) ** 2) / 400.0)
            h += 350 * math.exp(-((c - 85) ** 2 + (r - 80) ** 2) / 250.0)
            heights.append(int(h))
    with open(path, "wb") as out:
        out.write(struct.pack(">%dh" % len(heights), *heights))


def main():
    samples = os.path.join(ROOT, "samples")
    knob(os.path.join(samples, "knob.stl"))
    panel(os.path.join(samples, "panel.surf"))
    tile(os.path.join(samples, "N46E007.hgt"))


if __name__ == "__main__":
    main()
