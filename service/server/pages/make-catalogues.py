#!/usr/bin/python3
"""Turns the catalogues of the pages into a C++ source file, so that the server needs no files beside it.

    make-catalogues.py OUTPUT CATALOGUE.po...

msgfmt compiles each catalogue first: what it refuses ends the build.
"""

import gettext
import re
import subprocess
import sys
import tempfile
from pathlib import Path

RIGHT_TO_LEFT = {"ar", "he"}


def compiled(path):
    with tempfile.NamedTemporaryFile(suffix=".mo") as file:
        subprocess.run(["msgfmt", "--check", "-o", file.name, path], check=True)
        # msgfmt puts a new file in the place of the first one.
        with open(file.name, "rb") as made:
            return gettext.GNUTranslations(made)


def literal(text):
    escaped = text.replace("\\", "\\\\").replace('"', '\\"').replace("\n", "\\n").replace("\x04", "\\004")
    return f'"{escaped}"'


def forms_by_id(catalogue):
    """Each id with its forms in order; gettext keeps a plural's forms under (id, number)."""
    found = {}
    for key, text in catalogue._catalog.items():
        name, number = key if isinstance(key, tuple) else (key, 0)
        if name:
            found.setdefault(name, {})[number] = text
    return {name: [forms[number] for number in sorted(forms)] for name, forms in found.items()}


def plural_rule(catalogue):
    # The rule is written in C already.
    return re.search(r"plural=([^;]+);", catalogue.info()["plural-forms"]).group(1).strip()


def source_of(name, catalogue):
    lines = [f"unsigned long formOf_{name}([[maybe_unused]] unsigned long n)", "{"]
    lines += [f"    return static_cast<unsigned long>({plural_rule(catalogue)});", "}", ""]
    lines += [f"constexpr PageText texts_{name}[] = {{"]
    for key, forms in sorted(forms_by_id(catalogue).items()):
        lines.append(f"    {{{literal(key)}, {{{', '.join(map(literal, forms))}}}}},")
    return lines + ["};", ""]


def main(output, paths):
    catalogues = {Path(path).stem: compiled(path) for path in sorted(paths)}
    lines = ["// Made by make-catalogues.py.", '#include "pages/PageCatalogues.h"', ""]
    lines += ["namespace pelliko::server", "{", "namespace", "{", ""]
    for name, catalogue in catalogues.items():
        lines += source_of(name, catalogue)
    lines += ["constexpr PageCatalogue all[] = {"]
    for name in catalogues:
        direction = "true" if name in RIGHT_TO_LEFT else "false"
        lines.append(f'    {{"{name.replace("_", "-")}", {direction}, formOf_{name}, texts_{name}}},')
    lines += ["};", "", "} // namespace", ""]
    lines += ["std::span<const PageCatalogue> pageCatalogues()", "{", "    return all;", "}", ""]
    lines += ["} // namespace pelliko::server", ""]
    Path(output).write_text("\n".join(lines))


main(sys.argv[1], sys.argv[2:])
