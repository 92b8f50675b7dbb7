#!/usr/bin/env -S python3 -B
"""What rooms.py and includes.py refuse: drawings and trees that differ in one place from
good ones.

Usage: rooms_test.py ARROWS DRAWING, those of the tree
"""

import pathlib
import sys
import tempfile
import unittest

import includes
import rooms
from rooms import Arrows, read_arrows

ARROWS, DRAWING = (pathlib.Path(argument) for argument in sys.argv[1:])


class Drawings(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.built = read_arrows(ARROWS.read_text())
        cls.drawing = DRAWING.read_text()
        cls.nodes, cls.edges = rooms.drawn(cls.drawing)

    def drawn_with(self, line):
        return rooms.drawn(self.drawing.rstrip().removesuffix("}") + line + "\n}\n")

    def test_that_of_the_tree_is_right(self):
        self.assertEqual(rooms.problems(self.built, self.nodes, self.edges), [])

    def test_an_arrow_too_many(self):
        self.assertEqual(rooms.problems(self.built, *self.drawn_with('"cimom" -> "wbem/server"')),
                         ["not in the build: cimom -> wbem/server"])

    def test_an_arrow_too_few(self):
        self.assertGreater(len(self.edges), 20)
        for tail, head in self.edges:
            self.assertEqual(rooms.problems(self.built, self.nodes, self.edges - {(tail, head)}),
                             [f"not drawn: {tail} -> {head}"])

    def test_an_arrow_that_runs_the_other_way(self):
        edges = self.edges - {("cimom", "platform/cmpi")} | {("platform/cmpi", "cimom")}
        self.assertEqual(rooms.problems(self.built, self.nodes, edges),
                         ["not drawn: cimom -> platform/cmpi",
                          "not in the build: platform/cmpi -> cimom"])

    def test_a_dashed_edge_is_not_a_link(self):
        self.assertEqual(self.drawn_with('"wbem/server" -> "provider" [style=dashed]'),
                         (self.nodes, self.edges))

    def test_rooms_of_one_side_alone(self):
        more = Arrows(self.built.rooms | {"cellar"}, self.built.arrows)
        self.assertEqual(rooms.problems(more, *self.drawn_with('"attic"')),
                         ["not drawn: the room cellar", "not in the build: the room attic"])

    def test_rooms_that_link_each_other(self):
        both = Arrows({"a", "b"}, {("a", "b"), ("b", "a")})
        found = rooms.problems(both, both.rooms, both.arrows)
        self.assertEqual(len(found), 1)
        self.assertIn("rooms link each other", found[0])


class Includes(unittest.TestCase):
    BUILT = Arrows({"low", "high", "other"}, {("high", "low")})
    ORDERS = {"high": [["below"], ["beside", "above"], ["."]]}
    TREE = {
        "low/include/low/Low.h": "",
        "low/Private.h": "",
        "other/include/other/Other.h": "",
        "high/include/high/High.h": "",
        "high/below/Ground.h": "",
        "high/beside/Beside.h": '#include "below/Ground.h"\n',
        "high/above/High.cpp": '#include "high/High.h"\n#include "below/Ground.h"\n'
                               '#include "beside/Beside.h"\n#include <low/Low.h>\n',
        "high/main.cpp": '#include "high/High.h"\n',
        "tests/kit/Kit.h": "",
        "tests/high/HighSupport.h": "",
        "tests/high/above/HighTest.cpp": '#include "kit/Kit.h"\n#include "high/HighSupport.h"\n',
        "tests/low/LowTest.cpp": '#include "kit/Kit.h"\n',
        "bench/Bench.cpp": '  #  include "kit/Kit.h"\n',
    }

    def problems(self, changes, exceptions=frozenset()):
        """Those of the tree in which the named files have another text."""
        tree = self.TREE | changes
        with tempfile.TemporaryDirectory() as source:
            for path, text in tree.items():
                file = pathlib.Path(source, path)
                file.parent.mkdir(parents=True, exist_ok=True)
                file.write_text(text)
            directories = ["high", "high/include", "low", "low/include", "other/include", "tests"]
            options = " ".join(f"-I{source}/{directory}" for directory in directories)
            commands = [{"file": f"{source}/{path}", "command": f"c++ {options} -c {path}"}
                        for path in tree if path.endswith(".cpp")]
            edges = includes.included_files(source, f"{source}/build", commands)
        return includes.problems(self.BUILT, edges, self.ORDERS, exceptions)

    def test_a_good_tree(self):
        self.assertEqual(self.problems({}), [])

    def test_two_files_that_include_each_other(self):
        self.assertEqual(len(self.problems({
            "low/include/low/Low.h": '#include "low/Twin.h"\n',
            "low/include/low/Twin.h": '#include "low/Low.h"\n'})), 1)

    def test_a_circle_of_three(self):
        found = self.problems({
            "low/include/low/Low.h": '#include "low/Second.h"\n',
            "low/include/low/Second.h": '#include "low/Third.h"\n',
            "low/include/low/Third.h": '#include "low/Low.h"\n'})
        self.assertEqual(len(found), 1)
        self.assertTrue(found[0].startswith("files include each other: "))
        self.assertEqual(found[0].count(" -> "), 3)

    def test_a_room_that_is_not_linked(self):
        self.assertEqual(self.problems({"high/beside/Beside.h": '#include "other/Other.h"\n'}),
                         ["high/beside/Beside.h includes other/include/other/Other.h: "
                          "high does not link other"])

    def test_an_upper_room(self):
        self.assertEqual(self.problems({"low/include/low/Low.h": '#include "high/High.h"\n'}),
                         ["low/include/low/Low.h includes high/include/high/High.h: "
                          "low does not link high"])

    def test_a_private_header(self):
        self.assertEqual(self.problems({"high/beside/Beside.h": '#include "Private.h"\n'}),
                         ["high/beside/Beside.h includes low/Private.h: a private header of low"])

    def test_a_room_that_includes_a_test(self):
        self.assertEqual(self.problems({"high/beside/Beside.h": '#include "kit/Kit.h"\n'}),
                         ["high/beside/Beside.h includes tests/kit/Kit.h: "
                          "a room includes what stands beside the rooms"])

    def test_another_suite(self):
        self.assertEqual(self.problems({"tests/low/LowTest.cpp": '#include "high/HighSupport.h"\n'}),
                         ["tests/low/LowTest.cpp includes tests/high/HighSupport.h: "
                          "another suite's; only tests/kit/ is shared"])

    def test_a_benchmark_that_includes_of_a_suite(self):
        self.assertEqual(self.problems({"bench/Bench.cpp": '#include "high/HighSupport.h"\n'}),
                         ["bench/Bench.cpp includes tests/high/HighSupport.h: "
                          "only tests/kit/ is shared"])

    def test_an_upper_folder(self):
        self.assertEqual(self.problems({"high/below/Ground.h": '#include "beside/New.h"\n',
                                        "high/beside/New.h": ""}),
                         ["high/below/Ground.h includes high/beside/New.h: runs upward"])

    def test_a_public_header_of_an_upper_folder(self):
        self.assertEqual(self.problems({"high/below/Ground.h": '#include "high/High.h"\n'}),
                         ["high/below/Ground.h includes high/include/high/High.h: runs upward"])

    def test_a_public_header_without_a_source_stands_as_high_as_what_it_includes(self):
        changes = {"high/below/Ground.h": '#include "high/Words.h"\n', "high/include/high/Words.h": ""}
        self.assertEqual(self.problems(changes), [])
        changes |= {"high/include/high/Words.h": '#include "beside/New.h"\n', "high/beside/New.h": ""}
        self.assertEqual(self.problems(changes),
                         ["high/below/Ground.h includes high/include/high/Words.h: runs upward"])

    def test_what_the_build_makes_may_include_anything_of_the_tests(self):
        changes = {"build/Made.cpp": '#include "high/HighSupport.h"\n',
                   "tests/high/HighSupport.h": '#include "low/LowSupport.h"\n',
                   "tests/low/LowSupport.h": ""}
        self.assertEqual(self.problems(changes),
                         ["tests/high/HighSupport.h includes tests/low/LowSupport.h: "
                          "another suite's; only tests/kit/ is shared"])

    def test_a_folder_without_a_place(self):
        self.assertEqual(self.problems({"high/main.cpp": '#include "attic/Attic.h"\n',
                                        "high/attic/Attic.h": ""}),
                         ["high/main.cpp includes high/attic/Attic.h: "
                          "a folder without a place in the order of high"])

    def test_a_link_without_an_include(self):
        changes = {"high/above/High.cpp": ""}
        self.assertEqual(self.problems(changes), ["high links low and includes nothing of it"])
        self.assertEqual(self.problems(changes, exceptions={("high", "low")}), [])

    def test_exceptions_hold_for_one_include_and_as_long_as_it_is_there(self):
        changes = {"high/below/Ground.h": '#include "beside/New.h"\n', "high/beside/New.h": ""}
        pair = ("high/below/Ground.h", "high/beside/New.h")
        self.assertEqual(self.problems(changes, exceptions={pair}), [])
        self.assertEqual(self.problems({}, exceptions={pair}), [f"no longer an exception: {pair}"])


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])
