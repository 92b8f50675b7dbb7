"""What CMake tells of the rooms: their folders, and which of them link which."""


class Arrows:
    """`rooms`: folders; `arrows`: pairs of them, the one that links and the one linked."""

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
