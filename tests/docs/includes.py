#!/usr/bin/env -S python3 -B
"""Includes run downward: along the arrows between rooms, within a room along the order
of its folders, and never in a circle.

Usage: includes.py ARROWS SOURCE_DIRECTORY BUILD_DIRECTORY
  ARROWS           what CMake tells of the rooms (Arrows.cmake)
  BUILD_DIRECTORY  its compile_commands.json says where each file looks for headers
"""

import graphlib
import json
import os
import pathlib
import re
import sys

from rooms import read_arrows

# The folders of a room, lowest first; folders of one level may include each other's files.
# A header of the room's include/ stands as high as the folder of its source, or, if it has
# none, as what it includes.
ORDERS = {
    "platform/linux": [["formats"], ["kernel", "ipmi"], ["facts"],
                       ["clients", "configuration"], ["."]],
    "provider": [["include"], ["Lindows"], ["CMPI"], ["."]],
    "cimom": [["model"], ["mof"], ["query"], ["broker", "broker/objects"], ["manager"], ["interop"]],
    "wbem/server": [["metrics"], ["operations"], ["http"]],
    "cimdhcp": [["text"], ["client"], ["arguments"],
                ["commands", "commands/check", "commands/classes", "commands/rename"], ["."]],
}

# Includes that are wrong, and links that no include needs, until they are mended: pairs of
# files or rooms. One that is mended has to leave the list. The library of the gateway is
# made of the objects of all providers, which know each other by their factories alone: so
# these links stay.
EXCEPTIONS = {("gateway", "provider"), ("gateway", "neighbours"), ("gateway", "extensions")}

INCLUDE = re.compile(r'^[ \t]*#[ \t]*include[ \t]*["<]([^">]+)[">]', re.MULTILINE)
DIRECTORY = re.compile(r"(?:-I|-isystem )(\S+)")


def included_files(source, build, commands):
    """Which file of the tree includes which: each command is followed as its compiler
    would, conditions aside. What the build has made is followed, and left out."""
    source, build = os.path.abspath(source), os.path.abspath(build)
    edges, names, seen = {}, {}, set()

    def inside(path):
        path = os.path.normpath(path)
        return os.path.relpath(path, source) if path.startswith(source + "/") else None

    def find(name, directories):
        paths = (os.path.normpath(os.path.join(directory, name)) for directory in directories)
        # What compiles a folder as one names its sources absolutely.
        paths = (inside(path) or path for path in paths)
        return next((path for path in paths if os.path.isfile(os.path.join(source, path))), None)

    for command in commands:
        directories = tuple(inside(path) or path for path in DIRECTORY.findall(command["command"]))
        to_read = [inside(command["file"]) or command["file"]]
        while to_read:
            path = to_read.pop()
            if (path, directories) in seen:
                continue
            seen.add((path, directories))
            if path not in names:
                text = pathlib.Path(source, path).read_text(errors="replace")
                names[path] = INCLUDE.findall(text)
            for name in names[path]:
                other = find(name, (os.path.dirname(path), *directories))
                if other and not os.path.isabs(other):
                    edges.setdefault(path, set()).add(other)
                    to_read.append(other)
    return {path: others for path, others in edges.items()
            if not os.path.join(source, path).startswith(build + "/")}


def circles(edges):
    """A line for each circle of files, until none is left."""
    edges = {path: set(others) for path, others in edges.items()}
    lines = []
    while True:
        try:
            graphlib.TopologicalSorter(edges).prepare()
            return lines
        except graphlib.CycleError as error:
            # The sorter follows arrows backward.
            circle = error.args[1][::-1]
            lines.append("files include each other: " + " -> ".join(circle))
            edges[circle[0]].discard(circle[1])


class Folders:
    """How high a file stands in its room."""

    def __init__(self, orders, edges):
        self.edges = edges
        self.levels = {room: {folder: level for level, folders in enumerate(order)
                              for folder in folders} for room, order in orders.items()}
        self.sources = {}
        for path in edges:
            if path.endswith((".cpp", ".c")):
                self.sources.setdefault(pathlib.PurePath(path).stem, []).append(path)

    def level(self, room, path, above=()):
        """The level of the file's folder, None for a folder without a place in the order.
        `above`: the headers whose level this one decides."""
        folder = os.path.dirname(os.path.relpath(path, room)) or "."
        if folder in self.levels[room] or folder.split("/")[0] != "include":
            return self.levels[room].get(folder)
        sources = [source for source in self.sources.get(pathlib.PurePath(path).stem, ())
                   if source.startswith(room + "/")]
        below = sources or [other for other in self.edges.get(path, ())
                            if other.startswith(room + "/") and other not in above]
        levels = [self.level(room, other, (*above, path)) for other in below]
        return max((level for level in levels if level is not None), default=0)


def problem_between_rooms(built, path, other):
    """What is wrong with an include of another room's file, or None."""
    tail, head = built.room(path), built.room(other)
    if not tail:
        return None
    if not head:
        return "a room includes what stands beside the rooms"
    if (tail, head) not in built.arrows:
        return f"{tail} does not link {head}"
    # The headers of CMPI are all there is in their room.
    if head != "platform/cmpi" and not other.startswith(head + "/include/"):
        return f"a private header of {head}"
    return None


def problem_between_suites(path, other):
    """What is wrong with an include of a file that a test brings, or None."""
    if not other.startswith("tests/") or other.startswith("tests/kit/"):
        return None
    if not path.startswith("tests/"):
        return "only tests/kit/ is shared"
    # A suite's folders share what stands above them.
    if not path.startswith(os.path.dirname(other) + "/"):
        return "another suite's; only tests/kit/ is shared"
    return None


def problem_within_room(folders, room, path, other):
    """What is wrong with an include in one room, or None."""
    low, high = folders.level(room, path), folders.level(room, other)
    if low is None or high is None:
        return f"a folder without a place in the order of {room}"
    return "runs upward" if low < high else None


def problems(built, edges, orders, exceptions=frozenset()):
    """A line for each include that is wrong, each link that no include needs, and each
    exception that nothing needs any more."""
    folders = Folders(orders, edges)
    lines, used, crossed = circles(edges), set(), set()
    for path, other in ((path, other) for path, others in edges.items() for other in others):
        room = built.room(path)
        if room and room == built.room(other):
            wrong = problem_within_room(folders, room, path, other) if room in orders else None
        else:
            crossed.add((room, built.room(other)))
            wrong = problem_between_rooms(built, path, other) or problem_between_suites(path, other)
        if wrong and (path, other) in exceptions:
            used.add((path, other))
        elif wrong:
            lines.append(f"{path} includes {other}: {wrong}")
    for tail, head in built.arrows - crossed:
        if (tail, head) in exceptions:
            used.add((tail, head))
        else:
            lines.append(f"{tail} links {head} and includes nothing of it")
    lines += [f"no longer an exception: {pair}" for pair in exceptions - used]
    return sorted(lines)


def main(arrows, source, build):
    """Checks a tree, and returns the exit status."""
    commands = json.loads(pathlib.Path(build, "compile_commands.json").read_text())
    edges = included_files(source, build, commands)
    found = problems(read_arrows(pathlib.Path(arrows).read_text()), edges, ORDERS, EXCEPTIONS)
    print(f"{len(edges)} files include others")
    print("\n".join(found))
    return 1 if found else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
