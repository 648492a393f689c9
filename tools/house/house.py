#!/usr/bin/python3
"""Checks the includes of all sources against the rooms in docs/house.md, and draws the rooms into that page.

    house.py [--check]

A row of the page's first table names a room, a row of the others a floor of a large room; the last column lists the
rooms that it stands on. A room may include these and the rooms below them. Without --check the drawing on the page is
made again; with it, a drawing that differs is an error, as is an include that the tables do not allow, a room that they
do not list, an include of another room's src folder, a folder of more than 25 sources, and a public header that orv.h lacks.
Exit code 1 then.
"""
import argparse
import collections
import pathlib
import re
import sys

ROOT = pathlib.Path(__file__).resolve().parents[2]
PAGE = ROOT / "docs/house.md"
FLOORED = {"engine/facility": "## The floors of the facility", "engine/render": "## The floors of the scene"}
UMBRELLA = pathlib.Path("engine/extra/api/orv/orv.h")
MOST_SOURCES = 25
DRAWING = re.compile(r"(<!-- drawn by ./run house -->\n)(.*?)(<!-- end -->)", re.DOTALL)


class Room:
    def __init__(self, cells):
        self.name = cells[0].strip("`")
        self.headers = re.findall(r"`(\w+)\.h`", cells[1])  # of a floor: those without a source beside them
        self.stands_on = re.findall(r"`([^`]+)`", cells[-1])


def read_table(page, heading):
    """The rooms or floors of the table below a heading, by name."""
    part = page.split(heading, 1)[1].split("\n## ", 1)[0]
    rows = [line.strip("| ").split(" | ") for line in part.splitlines() if line.startswith("| `")]
    return {room.name: room for room in map(Room, rows)}


def find_below(rooms, name):
    """All rooms below a room."""
    below = set()
    for lower in rooms[name].stands_on:
        if lower not in rooms:
            sys.exit(f"docs/house.md: {name} stands on {lower}, which is no room")
        below |= {lower} | find_below(rooms, lower)
    return below


class House:
    def __init__(self, page):
        self.rooms = read_table(page, "## The rooms")
        self.floors = {room: read_table(page, heading) for room, heading in FLOORED.items()}
        self.files = [path.relative_to(ROOT) for folder in sorted({name.split("/")[0] for name in self.rooms})
                      for path in sorted((ROOT / folder).rglob("*")) if path.suffix in (".h", ".cpp")]
        self.headers = collections.defaultdict(list)
        for file in self.files:
            if file.suffix == ".h":
                self.headers[file.name].append(file)

    def room_of(self, file):
        """The room with the longest name that the file is in."""
        parents = [str(parent) for parent in file.parents]
        return next((parent for parent in parents if parent in self.rooms), None)

    def floor_of(self, file):
        """That of the source with the file's name, unless the page says otherwise. @return None for none."""
        room = self.room_of(file)
        for name, floor in self.floors[room].items():
            if file.suffix == ".h" and file.stem in floor.headers:
                return name
        sources = ROOT / room / "src"
        source = next(sources.rglob(file.stem + ".cpp"), ROOT / file)
        folders = source.relative_to(sources).parts[:-1] if sources in source.parents else ("",)
        name = folders[0] if folders else "the pool"
        return name if name in self.floors[room] else None

    def find_header(self, file, name):
        """The file that an include means: one of the same room first."""
        found = [header for header in self.headers[pathlib.PurePath(name).name] if str(header).endswith("/" + name)]
        own = [header for header in found if self.room_of(header) == self.room_of(file)]
        return (own or found or [None])[0]

    def includes(self):
        for file in self.files:
            for name in re.findall(r'^#include "([^"]+)"', (ROOT / file).read_text(), re.MULTILINE):
                header = self.find_header(file, name)
                if header:
                    yield file, header


def draw(title, arrows):
    """Mermaid's text for arrows between names; arrows that follow from others are left out."""
    def reaches(start, end, without):
        return any((middle, end) != without and (middle == end or reaches(middle, end, without))
                   for first, middle in arrows if first == start and (first, middle) != without)

    kept = [arrow for arrow in sorted(arrows) if not reaches(arrow[0], arrow[1], arrow)]
    label = {name: re.sub(r"\W", "_", name) for arrow in kept for name in arrow}
    lines = [f'    {label[name]}["{name.replace("engine/", "")}"]' for name in sorted(label)]
    lines += [f"    {label[upper]} --> {label[lower]}" for upper, lower in kept]
    return f"{title}\n\n```mermaid\ngraph TD\n" + "\n".join(lines) + "\n```\n"


def inspect(house):
    """@return the faults, the arrows between rooms, and those between floors by room."""
    faults, arrows, steps = [], set(), {room: set() for room in FLOORED}
    for file in house.files:
        if house.room_of(file) is None:
            faults.append(f"{file}: no room of docs/house.md")
        elif house.room_of(file) in FLOORED and not house.floor_of(file):
            faults.append(f"{file}: on no floor of docs/house.md")
    for file, header in house.includes() if not faults else ():
        upper, lower = house.room_of(file), house.room_of(header)
        if upper != lower:
            arrows.add((upper, lower))
            if lower not in find_below(house.rooms, upper):
                faults.append(f"{file}: includes {header}, but {upper} does not stand on {lower}")
            if "src" in header.parts and "api" in {path.name for path in (ROOT / lower).iterdir()}:
                faults.append(f"{file}: includes {header} out of another room's src")
        elif upper in FLOORED and house.floor_of(file) != house.floor_of(header):
            step = (house.floor_of(file), house.floor_of(header))
            steps[upper].add(step)
            if step[1] not in find_below(house.floors[upper], step[0]):
                faults.append(f"{file}: includes {header}, but {step[0]} does not stand on {step[1]}")
    counts = collections.Counter(file.parent for file in house.files if file.suffix == ".cpp")
    faults += [f"{folder}: {count} sources; at most {MOST_SOURCES}" for folder, count in counts.items()
               if count > MOST_SOURCES]
    included = {header for file, header in house.includes() if file == UMBRELLA}
    faults += [f"{UMBRELLA}: lacks {file}" for file in house.files
               if file.match("engine/*/api/orv/*.h") and file not in included | {UMBRELLA}]
    return faults, arrows, steps


def main():
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--check", action="store_true", help="change nothing")
    options = parser.parse_args()

    page = PAGE.read_text()
    faults, arrows, steps = inspect(House(page))
    drawing = draw("Rooms:", arrows)
    for room, heading in FLOORED.items():
        drawing += "\n" + draw(heading.replace("## The f", "F") + ":", steps[room])
    drawn = DRAWING.sub(lambda match: match[1] + drawing + match[3], page)
    if not options.check:
        PAGE.write_text(drawn)
    elif drawn != page:
        faults.append("docs/house.md: the drawing is not that of the sources; ./run house draws it")
    for fault in faults:
        print(fault, file=sys.stderr)
    return 1 if faults else 0


if __name__ == "__main__":
    sys.exit(main())
