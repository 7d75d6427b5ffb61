"""A NetworkManager on the world's system bus whose state a test decides: online, metered or not."""

import os
import subprocess
import sys

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "scripts", "lib"))

import world  # noqa: E402
from gi.repository import Gio, GLib  # noqa: E402

NAME = "org.freedesktop.NetworkManager"
PATH = "/org/freedesktop/NetworkManager"
CONNECTED, DISCONNECTED = 70, 20
FULL, NONE = 4, 1
METERED_YES, METERED_NO = 1, 2


class NetworkDouble:
    def __init__(self, metered=False, online=True):
        self.bus = Gio.bus_get_sync(Gio.BusType.SYSTEM)
        owned = []
        watch = Gio.bus_watch_name(Gio.BusType.SYSTEM, NAME, Gio.BusNameWatcherFlags.NONE,
                                   lambda *_: owned.append(True), None)
        self.process = subprocess.Popen(["/usr/bin/python3", "-m", "dbusmock", "--system", NAME, PATH, NAME],
                                        stdout=subprocess.DEVNULL)
        world.wait_for(lambda: owned, "the network double")
        Gio.bus_unwatch_name(watch)
        self._call("org.freedesktop.DBus.Mock", "AddProperties", {
            "Version": GLib.Variant("s", "1.42.4"), "NetworkingEnabled": GLib.Variant("b", True),
            **self._state(metered, online)})

    @staticmethod
    def _state(metered, online):
        return {"State": GLib.Variant("u", CONNECTED if online else DISCONNECTED),
                "Connectivity": GLib.Variant("u", FULL if online else NONE),
                "Metered": GLib.Variant("u", METERED_YES if metered else METERED_NO)}

    def _call(self, interface, method, properties):
        self.bus.call_sync(NAME, PATH, interface, method, GLib.Variant("(sa{sv})", (NAME, properties)), None,
                           Gio.DBusCallFlags.NONE, 5000)

    # Every change tells the whole state, as a listener that came with an earlier double knows nothing of it.
    def set_metered(self, metered):
        self._call("org.freedesktop.DBus.Mock", "UpdateProperties", self._state(metered, True))

    def set_online(self, online):
        self._call("org.freedesktop.DBus.Mock", "UpdateProperties", self._state(False, online))

    def close(self):
        self.process.terminate()
        self.process.wait()
