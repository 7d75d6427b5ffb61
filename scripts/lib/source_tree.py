"""The source files of the tree, what they include, and the lists of them in docs/architecture.md."""

import pathlib
import re

TOPS = ("src", "platform", "service", "companions")
MAP_HEADING = "## File map"
FLOORS_HEADING = "| floor | files |"
INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]', re.MULTILINE)
MAP_LINE = re.compile(r"^- `([^`]+)` (\S.*)$")
FLOOR_LINE = re.compile(r"^\| (\d+)\S* \| (.*) \|$")


class Tree:
    """The source files below `root`, by their paths from there."""

    def __init__(self, root):
        self.root = pathlib.Path(root)
        self.files = sorted(
            path.relative_to(self.root).as_posix()
            for top in TOPS for path in (self.root / top).rglob("*") if path.suffix in (".h", ".cpp"))
        self._known = set(self.files)
        self._by_name = {}
        for file in self.files:
            self._by_name.setdefault(file.rsplit("/", 1)[-1], []).append(file)

    def text(self, file):
        return (self.root / file).read_text(encoding="utf-8")

    def includes(self, file):
        """Pairs of the text between the quotes or brackets and the file of the tree, or None."""
        return [(name, self._resolve(file, name)) for _, name in INCLUDE.findall(self.text(file))]

    def _resolve(self, file, name):
        beside = (pathlib.PurePosixPath(file).parent / name).as_posix()
        parts = []
        for part in beside.split("/"):
            parts = parts[:-1] if part == ".." else parts + [part]
        for candidate in ("/".join(parts), "src/" + name, name):
            if candidate in self._known:
                return candidate
        found = [other for other in self._by_name.get(name.rsplit("/", 1)[-1], [])
                 if other.endswith("/" + name)]
        near = [other for other in found if room(other) == room(file)]
        return (near or found or [None])[0]

    def units(self):
        """Header and source of one stem are one unit: unit -> units that it includes."""
        graph = {stem(file): set() for file in self.files}
        for file in self.files:
            for _, target in self.includes(file):
                if target and stem(target) != stem(file):
                    graph[stem(file)].add(stem(target))
        return graph

    def graph(self):
        """File -> files that it includes."""
        return {file: {target for _, target in self.includes(file) if target}
                for file in self.files}


def stem(file):
    return file.rsplit(".", 1)[0]


def room(file):
    return "/".join(file.split("/")[:2])


def section(document, heading):
    """First and last line number (the last excluded) of the section's body."""
    lines = document.split("\n")
    if heading not in lines:
        raise ValueError(f"docs/architecture.md has no section “{heading}”")
    first = lines.index(heading) + 1
    last = next((i for i in range(first, len(lines)) if lines[i].startswith("## ")), len(lines))
    return first, last


def file_map(document):
    """Path -> description, in the order of the map; a path that stands twice is an error."""
    first, last = section(document, MAP_HEADING)
    entries = {}
    for line in document.split("\n")[first:last]:
        match = MAP_LINE.match(line)
        if match and match[1] in entries:
            raise ValueError(f"the file map names {match[1]} twice")
        if match:
            entries[match[1]] = match[2]
    return entries


def floor_table(document):
    """First and last line number (the last excluded) of the rows under the floors' heading."""
    lines = document.split("\n")
    if FLOORS_HEADING not in lines:
        raise ValueError(f"docs/architecture.md has no table “{FLOORS_HEADING}”")
    first = lines.index(FLOORS_HEADING) + 2
    last = next((i for i in range(first, len(lines)) if not lines[i].startswith("|")), len(lines))
    return first, last


def floors(document):
    """Unit (without src/) -> its floor."""
    first, last = floor_table(document)
    entries = {}
    for line in document.split("\n")[first:last]:
        match = FLOOR_LINE.match(line)
        if not match:
            raise ValueError(f"the table of floors has a row that is none: {line}")
        for unit in re.findall(r"`([^`]+)`", match[2]):
            entries[unit] = int(match[1])
    return entries
