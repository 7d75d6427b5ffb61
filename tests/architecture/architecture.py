#!/usr/bin/python3
"""Checks that the tree is what docs/architecture.md says: the file map, the direction of knowledge
between folders, the floors of the application, no circles, and who may use which library.

  architecture.py [--root DIR]      prints each violation; exit status 1 when there is one
"""

import argparse
import fnmatch
import pathlib
import sys

SOURCE = pathlib.Path(__file__).resolve().parents[2]
sys.path.insert(0, str(SOURCE / "scripts" / "lib"))
sys.dont_write_bytecode = True

import source_tree  # noqa: E402

# The platform's own header names; all its other headers begin with a lower-case letter.
PUBLIC_NAMES = {"ITapiNetwork.h", "ITapiSim.h", "WApp.h", "WWindowController.h"}

# Beginning of the include, the files that may have it, and what to use instead.
LIBRARIES = [
    ("curl/", ["service/pelliko-service/Curl*", "service/korrin/Curl*", "service/server/s3/Wire.cpp"],
     "transfers go through CurlTransfer, CurlPost or Wire"),
    ("sqlite3.h", ["src/PellikoDatabaseManager/*", "platform/contacts/Database.cpp",
                   "platform/quickpanel/Store.cpp", "platform/preference/PreferenceStore.cpp",
                   "service/pelliko-service/QueueFile.cpp", "service/server/store/*"],
     "only the files that own a table know SQLite"),
    ("SQLiteCpp/", ["platform/*", "service/*"], "the application uses SQLite's own interface"),
    ("boost/", ["service/server/*"], "Boost is for the share server"),
]


def is_public(header):
    name = header.rsplit("/", 1)[-1]
    return name in PUBLIC_NAMES or name[0].islower()


def check_map(tree, document):
    entries = source_tree.file_map(document)
    for file in tree.files:
        if file not in entries:
            yield f"{file} is missing from the file map (scripts/file-map adds it)"
    for file in entries:
        if file not in tree.files:
            yield f"the file map names {file}, which is gone (scripts/file-map takes it out)"


def direction_fault(file, target):
    """Why a file of one top folder may not include the target, or None."""
    top, other = file.split("/")[0], target.split("/")[0]
    if top in ("platform", "service") and other in ("src", "companions"):
        return f"{top}/ never includes {other}/"
    if top == "platform" and other == "service":
        return "platform/ never includes service/"
    if top == "src" and other == "companions":
        return "src/ never includes companions/"
    if top == "companions" and other == "src":
        return "companions/ use only public headers of platform/ and service/"
    if top in ("src", "companions") and other in ("platform", "service") and not is_public(target):
        return f"it is no public header of {other}/"
    return None


def check_directions(tree):
    for file in tree.files:
        for name, target in tree.includes(file):
            fault = direction_fault(file, target) if target else None
            if fault:
                yield f"{file} includes {name}: {fault}"


def check_floors(tree, document):
    floors = source_tree.floors(document)
    graph = tree.units()
    units = {unit[len("src/"):] for unit in graph if unit.startswith("src/")}
    for unit in sorted(units - set(floors)):
        yield f"src/{unit} stands on no floor (scripts/file-map adds it)"
    for unit in sorted(set(floors) - units):
        yield f"the floors name {unit}, which is gone (scripts/file-map takes it out)"
    for unit in sorted(units & set(floors)):
        for other in sorted(graph["src/" + unit]):
            below = other[len("src/"):]
            if other.startswith("src/") and below in floors and floors[below] >= floors[unit]:
                yield (f"src/{unit} (floor {floors[unit]}) includes src/{below} "
                       f"(floor {floors[below]}); a file includes only lower floors")


def check_circles(tree):
    graph, done = tree.graph(), set()

    def walk(file, path):
        if file in path:
            yield "includes form a circle: " + " -> ".join(path[path.index(file):] + [file])
            return
        if file in done:
            return
        for other in sorted(graph[file]):
            yield from walk(other, path + [file])
        done.add(file)

    for file in sorted(graph):
        yield from walk(file, [])


def check_libraries(tree):
    for file in tree.files:
        for name, _ in tree.includes(file):
            for start, allowed, reason in LIBRARIES:
                if name.startswith(start) and not any(fnmatch.fnmatch(file, a) for a in allowed):
                    yield f"{file} includes {name}: {reason}"


def violations(root):
    tree = source_tree.Tree(root)
    try:
        document = (pathlib.Path(root) / "docs" / "architecture.md").read_text(encoding="utf-8")
        return [*check_map(tree, document), *check_directions(tree), *check_floors(tree, document),
                *check_circles(tree), *check_libraries(tree)]
    except (OSError, ValueError) as error:
        return [str(error)]


def main():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("--root", default=SOURCE, type=pathlib.Path)
    found = violations(parser.parse_args().root)
    for violation in found:
        print(violation)
    print(f"architecture: {len(found)} violation(s)")
    sys.exit(1 if found else 0)


if __name__ == "__main__":
    main()
