"""What the pictures of figures are drawn with: shapes and texts of an SVG, how wide a text
will be, and costs against sizes as curves. It reads and writes no file."""

import html
import math

# A picture has a ground of its own, so that it can be read on a dark page, too.
GROUND, INK, GRID, FONT = "#ffffff", "#222222", "#dddddd", "Helvetica, Arial, sans-serif"
COLORS = ["#0b6e99", "#d9730d", "#0f7b6c", "#ad1a72", "#6940a5", "#e03e3e", "#64473a", "#9b9a97",
          "#dfab01", "#1f4e5f", "#7a9e35", "#b5651d", "#4361ee", "#2d3142"]
LINE = 18

# Advances in thousandths of the size of the font, as the widest of the common fonts without
# serifs has them (which one a reader has is not known); 640 for all others.
ADVANCES = {advance: characters for advance, characters in (
    (300, "iIjl'|"), (340, " \u00a0,.:;!f"), (420, "rt()[]-/"), (520, "_szc"), (720, "ABCEFHKPRSTVXYZ"),
    (790, "DGNOQU"), (860, "Mw"), (1000, "mW%@"))}
ADVANCE = {character: advance for advance, characters in ADVANCES.items()
           for character in characters}


def text_width(words, size, bold=False):
    """How wide a text is at most, in the units of the size of its font."""
    return sum(ADVANCE.get(each, 640) for each in words) * size / 1000 * (1.12 if bold else 1)


class Drawing:
    """The parts of a picture, from the one below to the one on top."""

    def __init__(self):
        self.parts = []

    def text(self, x, y, words, size=12, color=INK, anchor="start", bold=False):
        weight = ' font-weight="bold"' if bold else ""
        self.parts.append(f'<text x="{x:.1f}" y="{y:.1f}" font-size="{size}" fill="{color}" '
                          f'text-anchor="{anchor}"{weight}>{html.escape(str(words))}</text>')

    def box(self, x, y, width, height, color, stroke="none", corner=3):
        self.parts.append(f'<rect x="{x:.1f}" y="{y:.1f}" width="{width:.1f}" height="{height:.1f}" '
                          f'rx="{corner}" fill="{color}" stroke="{stroke}"/>')

    def line(self, points, color, width=1):
        text = " ".join(f"{x:.1f},{y:.1f}" for x, y in points)
        self.parts.append(f'<polyline points="{text}" fill="none" stroke="{color}" '
                          f'stroke-width="{width}"/>')

    def svg(self, width, height, ground=GROUND):
        return "\n".join([f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 {width} {height}" '
                          f'font-family="{FONT}">',
                          f'<rect width="{width}" height="{height}" fill="{ground}"/>',
                          *self.parts, "</svg>", ""])


def readable(nanoseconds):
    for unit, factor in (("s", 1e9), ("ms", 1e6), ("us", 1e3)):
        if nanoseconds >= factor:
            return f"{nanoseconds / factor:.3g} {unit}"
    return f"{nanoseconds:.3g} ns"


def legend(drawing, left, top, width, names):
    """The color of each name, in as many columns as there is room for; returns its height."""
    size, swatch = 12, 16
    column = swatch + max(text_width(name, size) for name in names) + 20
    columns = max(1, int((width + 20) // column))
    rows = math.ceil(len(names) / columns)
    for index, name in enumerate(names):
        x, y = left + index // rows * column, top + index % rows * LINE
        drawing.box(x, y, 10, 10, COLORS[index % len(COLORS)], corner=0)
        drawing.text(x + swatch, y + 10, name, size)
    return rows * LINE


def plot(found, title, axis):
    """Costs in nanoseconds against sizes, both logarithmic, as the text of an SVG.
    found: {name: {size: cost}}; the legend is in the order of the curves' right ends."""
    width, left, right, top, bottom = 900, 70, 30, 40, 370
    points = [(size, cost) for costs in found.values() for size, cost in costs.items()]
    x_low, x_high = (math.log10(f(size for size, _ in points)) for f in (min, max))
    y_low = math.floor(math.log10(min(cost for _, cost in points)))
    y_high = max(y_low + 1, math.ceil(math.log10(max(cost for _, cost in points))))

    def x(size):
        return left + (math.log10(size) - x_low) / (x_high - x_low) * (width - left - right)

    def y(cost):
        return bottom - (math.log10(cost) - y_low) / (y_high - y_low) * (bottom - top)

    drawing = Drawing()
    drawing.text(left, 22, title, 15)
    for power in range(y_low, y_high + 1):
        drawing.line([(left, y(10 ** power)), (width - right, y(10 ** power))], GRID)
        drawing.text(left - 6, y(10 ** power) + 4, readable(10 ** power), anchor="end")
    end = 0
    for size in sorted({size for size, _ in points}):
        half = text_width(f"{size:,}", 12) / 2
        if x(size) - half > end:
            drawing.text(x(size), bottom + 18, f"{size:,}", anchor="middle")
            end = x(size) + half + 4
    drawing.text((left + width - right) / 2, bottom + 38, axis, anchor="middle")
    ordered = sorted(found.items(), key=lambda item: -item[1][max(item[1])])
    for index, (_, costs) in enumerate(ordered):
        drawing.line([(x(size), y(cost)) for size, cost in sorted(costs.items())],
                     COLORS[index % len(COLORS)], 2)
    below = legend(drawing, left, bottom + 56, width - left - right, [name for name, _ in ordered])
    return drawing.svg(width, bottom + 56 + below + 8)
