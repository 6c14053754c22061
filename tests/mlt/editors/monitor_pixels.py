#!/usr/bin/env python3
"""Finds the effect's picture in a screenshot of an editor's window: the pure colours of the
clips in the area right of the project bin, where both editors put their monitor, and where
each colour's pixels lie against the others'.

  monitor_pixels.py SHOT.ppm diagonal|grid

diagonal: the Shotcut project, blue (V2) above and left of red (V1) along the diagonal.
grid: the Kdenlive project, blue top left, red top right, green bottom left, white bottom right.
Exits 0 when the picture is there, 1 (saying what it found) when not."""
import sys

COLOURS = {
    "blue": lambda r, g, b: b > 200 and r < 40 and g < 40,
    "red": lambda r, g, b: r > 200 and g < 40 and b < 40,
    "green": lambda r, g, b: g > 100 and r < 40 and b < 40,
    "white": lambda r, g, b: r > 250 and g > 250 and b > 250,
}
# A quarter of the picture at the monitor's size in a 1600x1000 window is some 25000 pixels.
ENOUGH = 5000
LEFT = 600  # the project bin and clip thumbnails lie left of this


def read_ppm(path):
    with open(path, "rb") as file:
        data = file.read()
    fields, at = [], 0
    while len(fields) < 4:
        while data[at:at + 1].isspace():
            at += 1
        start = at
        while not data[at:at + 1].isspace():
            at += 1
        fields.append(data[start:at])
    width, height = int(fields[1]), int(fields[2])
    return width, height, data[at + 1:]


def main():
    width, height, pixels = read_ppm(sys.argv[1])
    layout = sys.argv[2]
    wanted = ["blue", "red"] + (["green", "white"] if layout == "grid" else [])
    sums = {name: [0, 0, 0] for name in wanted}
    for y in range(height):
        row = y * width * 3
        for x in range(LEFT, width):
            at = row + x * 3
            r, g, b = pixels[at], pixels[at + 1], pixels[at + 2]
            for name in wanted:
                if COLOURS[name](r, g, b):
                    sums[name][0] += 1
                    sums[name][1] += x
                    sums[name][2] += y
    found = {name: (s[1] / s[0], s[2] / s[0]) for name, s in sums.items() if s[0] >= ENOUGH}
    counts = {name: s[0] for name, s in sums.items()}
    if len(found) < len(wanted):
        print(f"colours missing from the monitor: {counts}")
        return 1
    if layout == "diagonal":
        (bx, by), (rx, ry) = found["blue"], found["red"]
        ok = bx < rx and by < ry
    else:
        (bx, by), (rx, ry) = found["blue"], found["red"]
        (gx, gy), (wx, wy) = found["green"], found["white"]
        ok = bx < rx and gx < wx and by < gy and ry < wy
    if not ok:
        print(f"colours in the wrong places: {found}")
        return 1
    print(f"the split is in the monitor: {found}")
    return 0


sys.exit(main())
