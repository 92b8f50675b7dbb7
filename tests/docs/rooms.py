#!/usr/bin/env -S python3 -B
"""The drawing of the rooms has every arrow of the build, and no other.

Usage: rooms.py ARROWS DRAWING
  ARROWS   what CMake tells of the rooms (Arrows.cmake)
  DRAWING  docs/rooms.dot: nodes named after folders; a dashed edge is not a link
"""

import graphlib
import json
import pathlib
import subprocess
import sys


class Arrows:
    """What CMake tells of the rooms. `rooms`: folders; `arrows`: pairs of them, the one that links
    and the one linked."""

    def __init__(self, rooms, arrows):
        self.rooms = set(rooms)
        self.arrows = set(arrows)

    def room(self, path):
        """The room that a file is in; None for what is beside the rooms."""
        return next((room for room in self.rooms if path.startswith(room + "/")), None)


def read_arrows(text):
    """Reads what zr_write_arrows() of Arrows.cmake has written."""
    rooms, arrows = set(), set()
    for line in text.splitlines():
        kind, *folders = line.split()
        if kind == "room" and len(folders) == 1:
            rooms.add(folders[0])
        elif kind == "arrow" and len(folders) == 2:
            arrows.add(tuple(folders))
        else:
            raise ValueError(f"neither a room nor an arrow: {line}")
    return Arrows(rooms, arrows)


def drawn(text):
    """The nodes of a drawing, and its edges that are links."""
    made = subprocess.run(["dot", "-Tjson0"], input=text, capture_output=True, text=True, check=True)
    graph = json.loads(made.stdout)
    # Subgraphs are objects, too; they alone have a list of what is in them.
    names = {node["_gvid"]: node["name"] for node in graph["objects"]}
    nodes = {node["name"] for node in graph["objects"]
             if "nodes" not in node and "subgraphs" not in node}
    edges = {(names[edge["tail"]], names[edge["head"]]) for edge in graph["edges"]
             if edge.get("style") != "dashed"}
    return nodes, edges


def problems(built, nodes, edges):
    """A line for each difference between the build and what is drawn, and one if an
    arrow of the build runs up."""
    lines = [f"not drawn: the room {room}" for room in built.rooms - nodes]
    lines += [f"not in the build: the room {room}" for room in nodes - built.rooms]
    lines += [f"not drawn: {tail} -> {head}" for tail, head in built.arrows - edges]
    lines += [f"not in the build: {tail} -> {head}" for tail, head in edges - built.arrows]
    links = {room: set() for room in built.rooms}
    for tail, head in built.arrows:
        links[tail].add(head)
    try:
        graphlib.TopologicalSorter(links).prepare()
    except graphlib.CycleError as cycle:
        lines.append("rooms link each other: " + ", ".join(cycle.args[1]))
    return sorted(lines)


if __name__ == "__main__":
    found = problems(read_arrows(pathlib.Path(sys.argv[1]).read_text()),
                     *drawn(pathlib.Path(sys.argv[2]).read_text()))
    print("\n".join(found))
    sys.exit(1 if found else 0)
