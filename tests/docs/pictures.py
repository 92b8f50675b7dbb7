#!/usr/bin/env -S python3 -B
"""Every picture of the pages can be read: its texts are within its frame and beside each
other, and it has a ground of its own, without which a dark page would swallow it.

Usage: pictures.py SOURCE_DIRECTORY

How wide a text is, is estimated (docs/figures/drawing.py): which font a reader has is not known.
"""

import pathlib
import re
import sys
import xml.etree.ElementTree as ElementTree

NUMBER = r"-?\d+(?:\.\d+)?"


def numbers(text):
    return [float(each) for each in re.findall(NUMBER, text)]


class Box:
    def __init__(self, name, left, top, right, bottom):
        self.name, self.left, self.top, self.right, self.bottom = name, left, top, right, bottom

    def moved(self, offset):
        x, y = offset
        return Box(self.name, self.left + x, self.top + y, self.right + x, self.bottom + y)

    def holds(self, other):
        return (self.left <= other.left and self.top <= other.top and
                self.right >= other.right and self.bottom >= other.bottom)

    def overlaps(self, other):
        return (min(self.right, other.right) - max(self.left, other.left) > 1 and
                min(self.bottom, other.bottom) - max(self.top, other.top) > 1)


def text_box(element, inherited):
    size = float(element.get("font-size", inherited["font-size"]))
    bold = element.get("font-weight", inherited["font-weight"]) == "bold"
    words = "".join(element.itertext())
    width = text_width(words, size, bold)
    shift = {"start": 0, "middle": width / 2, "end": width}[
        element.get("text-anchor", inherited["text-anchor"])]
    x, y = float(element.get("x")) - shift, float(element.get("y"))
    return Box(words, x, y - 0.75 * size, x + width, y + 0.2 * size)


def area(element):
    """What a rectangle or polygon covers, or nothing for other shapes."""
    kind = element.tag.rpartition("}")[2]
    if kind == "rect":
        x, y = float(element.get("x", 0)), float(element.get("y", 0))
        return Box("rect", x, y, x + float(element.get("width")), y + float(element.get("height")))
    if kind == "polygon":
        points = numbers(element.get("points"))
        return Box("polygon", min(points[0::2]), min(points[1::2]), max(points[0::2]), max(points[1::2]))
    return None


def parts(element, offset=(0, 0), inherited=None):
    """The elements that are drawn, in their order, each with where its own zero is."""
    inherited = {key: element.get(key, (inherited or {}).get(key, default)) for key, default in
                 (("font-size", "16"), ("font-weight", "normal"), ("text-anchor", "start"))}
    for child in element:
        place = offset
        if child.get("transform"):
            moves = re.search(rf"translate\(({NUMBER})[ ,]+({NUMBER})\)", child.get("transform"))
            place = (offset[0] + float(moves[1]), offset[1] + float(moves[2]))
        yield child, place, inherited
        yield from parts(child, place, inherited)


def problems(text):
    """A line for each fault of a picture."""
    root = ElementTree.fromstring(text)
    x, y, width, height = numbers(root.get("viewBox"))
    frame = Box("frame", x, y, x + width, y + height)
    found, boxes, ground = [], [], None
    for element, place, inherited in parts(root):
        kind = element.tag.rpartition("}")[2]
        if kind == "text":
            box = text_box(element, inherited).moved(place)
            if not frame.holds(box):
                found.append(f"out of the frame: {box.name}")
            found += [f"over each other: {other.name} / {box.name}"
                      for other in boxes if other.overlaps(box)]
            boxes.append(box)
        elif (covered := area(element)) is not None:
            covered = covered.moved(place)
            ground = ground or (covered, element.get("fill"))
            # The samples of colors in a legend are small; what is written on is not.
            if covered.right - covered.left <= 12 and covered.bottom - covered.top <= 12 and kind == "rect":
                covered.name = "sample of a color"
                found += [f"over each other: {other.name} / {covered.name}"
                          for other in boxes if other.overlaps(covered)]
                boxes.append(covered)
    if ground is None or not ground[0].holds(frame) or ground[1] in (None, "none", "transparent"):
        found.append("no ground of its own")
    return found


def expect(what, found, wanted):
    if [each.partition(":")[0] for each in found] != wanted:
        sys.exit(f"{what}: expected {wanted}, found {found}")


def check_the_check():
    """Pictures with one fault each, and the most that the tools draw, which has none."""
    def picture(texts, ground="white"):
        return (f'<svg xmlns="http://www.w3.org/2000/svg" viewBox="0 0 100 100">'
                f'<rect width="100" height="100" fill="{ground}"/>'
                f'<g font-size="10" transform="translate(4 4)">{texts}</g></svg>')

    expect("good", problems(picture('<text x="0" y="20">one</text><text x="0" y="40">two</text>')), [])
    expect("wide", problems(picture('<text x="0" y="20">a legend that runs out</text>')),
           ["out of the frame"])
    expect("left", problems(picture('<text x="2" y="20" text-anchor="end">one</text>')),
           ["out of the frame"])
    expect("twice", problems(picture('<text x="0" y="20">one</text><text x="9" y="22">two</text>')),
           ["over each other"])
    expect("on a sample", problems(picture('<rect x="0" y="12" width="10" height="10"/>'
                                           '<text x="5" y="20">one</text>')), ["over each other"])
    expect("without a ground", problems(picture("", ground="none")), ["no ground of its own"])
    names = [f"QVXZR_DHCPRemoteAccessAvailableToElement from QVXZR_DHCPRemoteServiceAccessPoint {each}"
             for each in range(14)]
    curves = {name: {1: 1e3, 10: 2e6, 12: 3e6, 10000: 9e9} for name in names}
    expect("many curves", problems(plot(curves, "Many", "interfaces")), [])
    samples = [{"requests": each, "residentKiB": 90 * each, "descriptors": 7} for each in (1, 999999)]
    expect("a process that grows", problems(soak.draw(samples)), [])
    expect("few curves", problems(plot({name[-2:]: curves[name] for name in names}, "Few", "clients")), [])


if __name__ == "__main__":
    docs = pathlib.Path(sys.argv[1]) / "docs"
    sys.path.insert(0, str(docs / "figures"))
    import soak
    from drawing import plot, text_width

    check_the_check()
    pictures = sorted(docs.rglob("*.svg"))
    if len(pictures) < 5:
        sys.exit(f"only {len(pictures)} pictures below {docs}")
    faults = [f"{path.relative_to(docs)}: {fault}" for path in pictures
              for fault in problems(path.read_text())]
    print("\n".join(faults))
    sys.exit(1 if faults else 0)
