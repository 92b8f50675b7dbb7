#!/usr/bin/env -S python3 -B
"""The tables of docs/formats.md and docs/command-line.md name what the program reads and
writes: every member, type, column and word, and none that it does not have.

Usage: formats.py SOURCE_DIRECTORY CIMDHCP
"""

import json
import pathlib
import re
import subprocess
import sys
import tempfile

failures = []


def compare(what, page, program):
    """Both as sets of words."""
    for word in sorted(set(page) - set(program)):
        failures.append(f"{what}: the page names {word}, the program does not have it")
    for word in sorted(set(program) - set(page)):
        failures.append(f"{what}: the program has {word}, which the page does not name")


def tables(page):
    """The tables of a page by the heading of their first column: rows of cells."""
    found, rows = {}, None
    for line in page.read_text().splitlines():
        if not line.startswith("|"):
            rows = None
            continue
        cells = [cell.strip() for cell in line.strip("|").split(" | ")]
        if rows is None:
            rows = found.setdefault(cells[0], [])
        elif not line.startswith("|---"):
            rows.append(cells)
    return found


def words(cell):
    return re.findall(r"`([^`]+)`", cell)


def table(source, pattern):
    """What a pattern finds in a source, which may not be nothing."""
    found = re.findall(pattern, source.read_text())
    if not found:
        sys.exit(f"{source}: nothing like {pattern}")
    return found


class Program:
    def __init__(self, path, tree):
        self.path, self.tree = path, tree

    def run(self, *arguments):
        return subprocess.run([self.path, "--tree", self.tree, *arguments], text=True, check=False,
                              capture_output=True)

    def json(self, *arguments):
        done = self.run("--format", "json", *arguments)
        if not done.stdout:
            sys.exit(f"{arguments}: {done.stderr}")
        return json.loads(done.stdout)


def told_types(program, properties, directory):
    """The type that the program asks of each property: it tells so of one that is an object.
    Of one tree it tells sixteen slips at most."""
    names, types = list(properties), {}
    for begin in range(0, len(names), 16):
        slips = {name: {} for name in names[begin:begin + 16]}
        tree = pathlib.Path(directory, "types.json")
        tree.write_text(json.dumps({"nodes": [{"type": "x", "properties": slips}]}))
        told = Program(program.path, str(tree)).run("tree").stderr
        types |= dict(re.findall(r'"(\w+)" must be (.*)', told))
    return {name: types.get(name, "") for name in names}


def first_words(rows):
    return [words(row[0])[0] for row in rows]


def check_tree(source, page, program, directory):
    zrclient = source / "platform/zrclient"
    lexicon = zrclient / "include/zrclient/NodeLexicon.h"
    compare("members of a node", first_words(page["member of a node"]),
            table(zrclient / "src/sources/JsonTree.cpp", r'\{"(\w+)", Slot::'))
    compare("types of nodes", first_words(page["type of a node"]),
            table(lexicon, r'\{NodeType::\w+, "(\w+)"\}'))
    rows = {words(row[0])[0]: row[2] for row in page["property"]}
    compare("properties", rows, table(lexicon, r'\{Properties::\w+, "(\w+)"\}'))
    for name, told in told_types(program, rows, directory).items():
        if rows[name] != told:
            failures.append(f"{name}: the page says {rows[name]}, the program {told}")


def members(value):
    """The names of all members, below lists, too; a property of an instance has a name of
    its class."""
    if isinstance(value, list):
        return set().union(*map(members, value))
    if not isinstance(value, dict):
        return set()
    names = set(value)
    for name, each in value.items():
        if name == "properties" and isinstance(each, dict):
            names |= set().union(*map(members, each.values()))
        else:
            names |= members(each)
    return names


CAPABILITIES = 'QVXZR_DHCPCapabilities.InstanceID="eth0"'
COMMANDS = {
    "classes": [["classes"]],
    "describe": [["describe", "QVXZR_DHCPLease"]],
    "profiles": [["profiles"]],
    "check": [["check"]],
    "rename": [["rename", "eth0", "name", "--create"]],
    "instances": [["instances", "QVXZR_DHCPCapabilities"], ["names", "QVXZR_DHCPCapabilities"],
                  ["get", CAPABILITIES], ["associators", CAPABILITIES],
                  ["references", CAPABILITIES], ["references", CAPABILITIES, "--names"]],
}


def check_json(text, page, program, directory):
    interface = first_words(page["member of an interface"])
    [leases] = [words(row[2]) for row in page["member of an interface"] if row[0] == "`leases`"]
    [shown] = program.json("show")["interfaces"][:1]
    compare("an interface", interface, shown)
    compare("a lease", leases, shown["leases"][0])
    compare("a moment", ["seconds", "time"], shown["expires"])
    [added] = re.findall(r"`show INTERFACE` adds ([^.]*)\.", text)
    [detailed] = program.json("show", "eth0")["interfaces"]
    compare("an interface alone", [*interface, *words(added)], detailed)
    compare("a count", ["count"], program.json("show", "--count"))
    documented = {words(row[0])[0]: words(row[1]) for row in page["command"]}
    compare("commands with JSON", documented, [*COMMANDS, "show"])
    values = {"good", "notable", "bad"}
    for command, lines in COMMANDS.items():
        seen = set()
        for line in lines:
            seen |= members(program.json("--data-dir", directory, *line))
        compare(f"JSON of {command}", set(documented[command]) - values, seen)


def check_show(source, page, program):
    header = program.run("--format", "tsv", "show").stdout.split("\n")[0].split("\t")
    compare("columns of show", first_words(page["column"]), header)
    states = table(source / "cimdhcp/client/InterfaceState.h",
                   r'\{InterfaceState::\w+,\s*"([^"]+)",\s*"([^"]+)"\}')
    compare("states", [f"{words(row[0])[0]}: {row[1]}" for row in page["state"]],
            [f"{word}: {meaning}" for word, meaning in states])
    units = table(source / "cimdhcp/text/Times.cpp", r'\{\d+, \d+, "(\w+)"\}')
    [told] = re.findall(r"A time has the unit ([^.]*)\.",
                        (source / "docs/command-line.md").read_text())
    compare("units of times", words(told), units)


def main(source, cimdhcp):
    source = pathlib.Path(source)
    program = Program(cimdhcp, str(source / "docs/sample-machine.json"))
    formats = tables(source / "docs/formats.md")
    with tempfile.TemporaryDirectory() as directory:
        check_tree(source, formats, program, directory)
        check_json((source / "docs/formats.md").read_text(), formats, program, directory)
    check_show(source, tables(source / "docs/command-line.md"), program)
    print("\n".join(failures))
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main(*sys.argv[1:]))
