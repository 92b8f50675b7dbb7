#!/usr/bin/env -S python3 -B
"""Draws the fleet's part of the dashboard from what a Prometheus has responded to its queries:
  tests/packaging/monitoring.sh PROGRAM packaging/monitoring docs/sample-machine.json answers.json
  docs/figures/dashboard.py answers.json docs/figures/dashboard.svg
"""

import json
import sys

from drawing import Drawing

WIDTH, ROW = 960, 22
STATES = {"bound": "#4d8a3c", "renewing": "#86b36f", "rebinding": "#b08030", "asking": "#c06030",
          "expired": "#a03030", "no_link": "#777777", "off": "#bbbbbb", "unknown": "#7050a0"}


class Panels(Drawing):
    def panel(self, x, y, width, height, title):
        self.box(x, y, width, height, "#ffffff", "#cccccc")
        self.text(x + 10, y + 18, title, bold=True)


def number(result):
    return float(result["value"][1])


def duration(seconds):
    for size, unit in ((86400, "d"), (3600, "h"), (60, "min")):
        if seconds >= size:
            return f"{seconds / size:.0f} {unit}"
    return f"{seconds:.0f} s"


def bars(drawing, x, y, width, rows):
    """A bar for each of (name, value, color), as long as its value is large."""
    most = max(value for _, value, _ in rows) or 1
    for index, (name, value, color) in enumerate(rows):
        top = y + index * ROW
        drawing.text(x + 90, top + 12, name, anchor="end")
        length = (width - 150) * value / most
        drawing.box(x + 98, top, max(length, 1), ROW - 7, color)
        drawing.text(x + 104 + length, top + 12, f"{value:.0f}")


def draw(answers):
    drawing = Panels()
    leases = sum(number(each) for each in answers["Leases"][0])
    tiles = [("Machines", f"{number(answers['Machines'][0][0]):.0f}", "#3050a0"),
             ("Silent machines", f"{number(answers['Silent machines'][0][0]):.0f}", "#4d8a3c"),
             ("Leases", f"{leases:.0f}", "#3050a0"),
             ("Next lease to end", duration(number(answers["Next lease to end"][0][0])), "#b08030")]
    for index, (title, words, color) in enumerate(tiles):
        x = 10 + index * 237.5
        drawing.panel(x, 10, 227.5, 80, title)
        drawing.text(x + 113, 70, words, size=34, color=color, anchor="middle", bold=True)
    states = {each["metric"]["state"]: number(each) for each in answers["Clients by state"][0]}
    shown = [(state, states.get(state, 0), color) for state, color in STATES.items()]
    drawing.panel(10, 100, 464, 215, "Clients by state")
    bars(drawing, 10, 130, 464, shown)
    names = ["below 5 min", "below 1 h", "below 1 d", "longer"]
    colors = ["#a03030", "#b08030", "#86b36f", "#4d8a3c"]
    left = [(name, number(result[0]), color) for name, result, color
            in zip(names, answers["Leases by remaining time"], colors)]
    drawing.panel(484, 100, 466, 215, "Leases by remaining time")
    bars(drawing, 484, 130, 466, left)
    for x, title, label in ((10, "Servers seen", "server"), (484, "Client programs", "client")):
        rows = sorted(answers[title][0], key=number, reverse=True)
        drawing.panel(x, 325, 464 if x == 10 else 466, 125, title)
        for index, each in enumerate(rows[:4]):
            top = 365 + index * ROW
            drawing.text(x + 20, top, each["metric"].get(label, "not known"))
            drawing.text(x + 440, top, f"{number(each):.0f}", anchor="end")
    return drawing.svg(WIDTH, 460, "#f4f4f0")


if __name__ == "__main__":
    with open(sys.argv[1]) as source:
        picture = draw(json.load(source))
    with open(sys.argv[2], "w") as target:
        target.write(picture)
