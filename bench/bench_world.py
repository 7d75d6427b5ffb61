"""What the measuring scripts share: a private world for themselves, and how a result is told."""

import argparse
import os
import pathlib
import subprocess
import sys

ROOT = pathlib.Path(__file__).resolve().parent.parent
sys.path.insert(0, str(ROOT / "scripts" / "lib"))


def enter(description, **numbers):
    """Reads the options and returns them, inside a private world of the release build.

    Each of `numbers` becomes an option with this default. Outside of a world the script runs itself again in one.
    """
    parser = argparse.ArgumentParser(description=description)
    parser.add_argument("--build", default=str(ROOT / "build" / "release"), help="build tree to measure")
    for name, value in numbers.items():
        parser.add_argument(f"--{name}", type=int, default=value, metavar="N", help=f"default {value}")
    chosen = parser.parse_args()
    if not os.access(os.path.join(chosen.build, "libexec", "pelliko"), os.X_OK):
        parser.error(f"there are no programs in {chosen.build}: build them, or name another tree with --build")
    if "PELLIKO_STATE" not in os.environ:
        again = ["/usr/bin/python3", "-u", os.path.abspath(sys.argv[0]), *sys.argv[1:]]
        session = [ROOT / "scripts" / "session", "--build", chosen.build, "--", *again]
        sys.exit(subprocess.run(session, check=False).returncode)
    return chosen


def percentile(values, percent):
    """The value that this share of the values does not exceed."""
    ordered = sorted(values)
    return ordered[min(len(ordered) - 1, -(-len(ordered) * percent // 100) - 1)]


def tell(what, seconds):
    """Prints median and 95th percentile in milliseconds."""
    print(f"{what}: median {1000 * percentile(seconds, 50):.1f} ms, 95th percentile"
          f" {1000 * percentile(seconds, 95):.1f} ms ({len(seconds)} times)")


def judge(what, value, most, unit=""):
    """Prints a value beside its limit and returns whether it keeps to it."""
    good = value <= most
    print(f"{what} = {value:.2f}{unit} (at most {most:.2f}){'' if good else '  TOO MUCH'}")
    return good
