#!/usr/bin/python3
"""Every call that the application makes of the platform or of a service can be made to fail by the fault plan, and
what is handed out knows nothing of it.

  cover.py BUILD-DIRECTORY
"""

import glob
import pathlib
import subprocess
import sys

SOURCE = pathlib.Path(__file__).resolve().parents[3]
# Who may name the plan's variable: the plan, its tests and what is written about it.
HOMES = ("platform/faults/", "tests/", "docs/", "scripts/fault-plan", "scripts/lint", "CONTRIBUTING.md")


def symbols(archives, kinds):
    """Names of C functions of these kinds, as nm writes them."""
    lines = subprocess.run(["nm", *archives], capture_output=True, text=True, check=True).stdout.splitlines()
    return {words[-1] for words in map(str.split, lines)
            if len(words) >= 2 and words[-2] in kinds and not words[-1].startswith("_")}


def check(build):
    called = symbols([f"{build}/src/libapp_core.a"], "U")
    offered = symbols(glob.glob(f"{build}/platform/*/libplatform_*.a") + glob.glob(f"{build}/service/*/libservice_*.a"),
                      "T")
    with open(f"{build}/platform/faults/never.txt", encoding="utf-8") as file:
        never = set(file.read().split())
    if len([name for name in called if name.startswith("pelliko_fault_")]) < 100:
        yield "the application's calls do not go through the fault plan"
    for name in sorted((called & offered) - never):
        yield f"{name} does not go through the fault plan: no public C header declares it"
    files = subprocess.run(["git", "grep", "-l", "PELLIKO_" + "FAULTS"], cwd=SOURCE, capture_output=True,
                           text=True, check=False).stdout.split()
    for file in files:
        if not file.startswith(HOMES):
            yield f"{file} knows of the fault plan"
    rooms = (SOURCE / "platform/faults/CMakeLists.txt").read_text(encoding="utf-8")
    lines = [line for line in rooms.splitlines() if not line.startswith("#")]
    if not (lines[0].startswith("if(NOT PELLIKO_TESTS OR ") and lines[1] == "  return()"):
        yield "platform/faults is not left out where the tests are not built"


if __name__ == "__main__":
    faults = list(check(sys.argv[1]))
    print("\n".join(faults) or "every call is covered")
    sys.exit(bool(faults))
