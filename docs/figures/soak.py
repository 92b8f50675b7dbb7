#!/usr/bin/env -S python3 -B
"""Draws what a process held while it served more and more requests:
  docs/figures/soak.py build/release/soak.json build/release/soak.svg
"""

import json
import math
import sys

from drawing import GRID, INK, Drawing

WIDTH, HEIGHT = 900, 420
LEFT, RIGHT, TOP, BOTTOM = 90, 830, 50, 360
STEPS = 4


def ceiling(highest):
    """A round number above all values, so that a curve is not at the edge."""
    step = 10 ** math.floor(math.log10(max(highest, 1)))
    return (highest // step + 1) * step


def draw(samples):
    """samples: [{"requests", "residentKiB", "descriptors"}], in their order."""
    drawing = Drawing()
    last = max(samples[-1]["requests"], 1)
    for step in range(STEPS + 1):
        x, y = (LEFT + (RIGHT - LEFT) * step / STEPS, BOTTOM - (BOTTOM - TOP) * step / STEPS)
        drawing.line([(LEFT, y), (RIGHT, y)], GRID)
        drawing.text(x, BOTTOM + 20, f"{last * step // STEPS:,}", anchor="middle")
    drawing.text((LEFT + RIGHT) / 2, HEIGHT - 14, "requests", anchor="middle")
    for key, title, color, side, anchor, gap in (
            ("residentKiB", "resident memory, KiB", "#1f5fa8", LEFT, "end", -8),
            ("descriptors", "open descriptors", "#b85c00", RIGHT, "start", 8)):
        highest = ceiling(max(each[key] for each in samples))
        drawing.text(side, 28, title, 13, color, "start" if side == LEFT else "end")
        for step in range(STEPS + 1):
            drawing.text(side + gap, BOTTOM - (BOTTOM - TOP) * step / STEPS + 4,
                         f"{highest * step / STEPS:,.10g}", color=color, anchor=anchor)
        drawing.line([(LEFT + (RIGHT - LEFT) * each["requests"] / last,
                       BOTTOM - (BOTTOM - TOP) * each[key] / highest) for each in samples], color, 2)
    drawing.line([(LEFT, TOP), (LEFT, BOTTOM), (RIGHT, BOTTOM), (RIGHT, TOP)], INK)
    return drawing.svg(WIDTH, HEIGHT)


if __name__ == "__main__":
    with open(sys.argv[1]) as source:
        picture = draw(json.load(source))
    with open(sys.argv[2], "w") as target:
        target.write(picture)
