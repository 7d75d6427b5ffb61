"""When calls and signals pass on the session bus, told by dbus-monitor: name and time of each."""

import os
import subprocess

from gi.repository import GLib

import world


class BusTimes:
    """Collects (seconds of time.time(), member) of every message that the match rules name."""

    def __init__(self, *rules):
        self.seen = []
        self.rest = b""
        self.process = subprocess.Popen(["dbus-monitor", "--session", "--profile", *rules], stdout=subprocess.PIPE)
        os.set_blocking(self.process.stdout.fileno(), False)
        self.source = GLib.io_add_watch(self.process.stdout, GLib.PRIORITY_HIGH, GLib.IOCondition.IN, self._read)
        # A connection gives up its own name the moment it becomes a monitor.
        world.wait_for(lambda: self.first("NameLost", 0), "the bus monitor to listen")

    def _read(self, *_):
        data = os.read(self.process.stdout.fileno(), 1 << 20)
        *complete, self.rest = (self.rest + data).split(b"\n")
        for line in complete:
            fields = line.decode("ascii", "replace").split("\t")
            if fields[0] in ("mc", "sig") and len(fields) >= 8:
                self.seen.append((float(fields[1]), fields[7]))
        return bool(data)

    def count(self, member, begin, end):
        return sum(name == member and begin <= at < end for at, name in self.seen)

    def first(self, member, begin):
        """The time of the first such message since then, or None."""
        return next((at for at, name in self.seen if name == member and at >= begin), None)

    def close(self):
        GLib.source_remove(self.source)
        self.process.terminate()
        self.process.wait()
        self.process.stdout.close()
