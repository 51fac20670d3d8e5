#!/usr/bin/env python3
"""Writes samples/scans.asc: three scan lines across a half cylinder of
radius 40 mm, as a line scanner would report them, one "G08(n)" ... "G09"
block per scan with "X %f Y %f Z %f" point lines."""
import math
import os
import sys

SCANS = [(0.0, 120), (5.0, 100), (10.0, 80)]  # (y of the scan line, points)


def main():
    root = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
    path = sys.argv[1] if len(sys.argv) > 1 else os.path.join(root, "samples", "scans.asc")
    with open(path, "w", newline="\n") as out:
        for number, (y, count) in enumerate(SCANS, start=1):
            out.write("G08(%d)\n" % number)
            for i in range(count):
                angle = math.pi * i / (count - 1)
                x = 40.0 * math.cos(angle)
                z = 40.0 * math.sin(angle) + 0.002 * (i % 7)  # a little sensor noise
                out.write("X %f Y %f Z %f\n" % (x, y, z))
            out.write("G09\n")


if __name__ == "__main__":
    main()
