"""Stand-ins on the session bus for what the companions talk to, so that every state of a share can be shown: the
background service's side of shares, and applications that only note what they are launched with."""

import os
import time

import world
from gi.repository import Gio, GLib

SOURCE = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "..")
UPLOADING, PAUSED, NOTIFYING, AVAILABLE, EXPIRED, WITHDRAWING, WITHDRAWN, CANCELLED, FAILED = range(9)
NOT_YET, PUSH, SMS, NOBODY = range(4)
NOT_FOUND, UNREACHABLE, NO_SPACE = -2, -7, -28


def _interface(file):
    with open(os.path.join(SOURCE, "dbus", file), encoding="utf-8") as xml:
        return Gio.DBusNodeInfo.new_for_xml(xml.read()).interfaces[0]


class _Name:
    """A name on the bus with one object behind it."""

    def __init__(self, name, path, interface):
        self.name, self.path = name, path
        self.bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        self.object = self.bus.register_object(path, interface, self._called, None, None)
        owned = self._ask("RequestName", "(su)", (name, 4))
        assert owned == 1, f"{name} is taken"

    def _ask(self, method, kind, values):
        return self.bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
                                  GLib.Variant(kind, values), None, Gio.DBusCallFlags.NONE, -1).unpack()[0]

    def _called(self, _bus, sender, _path, _interface, method, arguments, call):
        getattr(self, "on_" + method)(call, sender, *arguments.unpack())

    def close(self):
        self.bus.unregister_object(self.object)
        self._ask("ReleaseName", "(s)", (self.name,))


class Application(_Name):
    """Keeps the launch requests that it gets."""

    def __init__(self, name):
        self.requests = []
        path = "/" + name.replace(".", "/").replace("-", "_")
        super().__init__(name, path, _interface("com.velmora.Platform.Application1.xml"))

    def on_Launch(self, call, _sender, request, _reply_wanted):
        self.requests.append(request)
        call.return_value(GLib.Variant("(ia{sv})", (0, {})))

    def wait_request(self):
        world.wait_for(lambda: self.requests, f"a launch of {self.name}")
        return self.requests[-1]


def _files(files):
    return GLib.Variant("a(sxs)", [(name, size, kind) for name, size, kind in files])


def sent(number, state, recipients, files=(("photo.jpg", 2_400_000, "image/jpeg"),), percent=0, error=0, expires=0):
    """A sent share: recipients are (number, id of the number, how told)."""
    return {"id": GLib.Variant("i", number), "state": GLib.Variant("i", state), "percent": GLib.Variant("i", percent),
            "error": GLib.Variant("i", error), "reshare": GLib.Variant("b", False),
            "created": GLib.Variant("x", 1_790_000_000), "expires": GLib.Variant("x", expires),
            "size": GLib.Variant("x", sum(size for _, size, _ in files)), "files": _files(files),
            "recipients": GLib.Variant("a(ssii)", [(one, one, number_id, told) for one, number_id, told in recipients])}


def received(token, sender, state=AVAILABLE, files=(("photo.jpg", 2_400_000, "image/jpeg"),), expires=None):
    if expires is None:
        expires = int(time.time()) + 90_000
    return {"token": GLib.Variant("s", token), "sender": GLib.Variant("s", sender), "state": GLib.Variant("i", state),
            "received": GLib.Variant("x", 1_790_000_000), "created": GLib.Variant("x", 1_790_000_000),
            "expires": GLib.Variant("x", expires), "size": GLib.Variant("x", sum(size for _, size, _ in files)),
            "files": _files(files)}


class SharesService(_Name):
    """The service's shares: lists that a test writes, and calls that it looks at or answers itself."""

    def __init__(self):
        self.sent, self.received = [], []
        self.calls = []
        self.answer = 0  # of withdraw, forget and get
        self.downloads = []
        super().__init__("com.velmora.pelliko.Service", "/com/velmora/pelliko/Service",
                         _interface("com.velmora.pelliko.Shares1.xml"))

    def change(self):
        self.bus.emit_signal(None, self.path, "com.velmora.pelliko.Shares1", "Changed", None)

    def on_ListSent(self, call, _sender):
        call.return_value(GLib.Variant("(aa{sv})", (self.sent,)))

    def on_ListReceived(self, call, _sender):
        call.return_value(GLib.Variant("(aa{sv})", (self.received,)))

    def on_GetReceived(self, call, _sender, token, _fresh):
        self.calls.append(("get", token))
        found = [share for share in self.received if share["token"].unpack() == token]
        error = self.answer or (0 if found else NOT_FOUND)
        call.return_value(GLib.Variant("(ia{sv})", (error, found[0] if found else {})))

    def _done(self, call, name, key):
        self.calls.append((name, key))
        call.return_value(GLib.Variant("(i)", (self.answer,)))

    def on_Withdraw(self, call, _sender, number):
        self._done(call, "withdraw", number)

    def on_ForgetSent(self, call, _sender, number):
        self._done(call, "forget", number)

    def on_ForgetReceived(self, call, _sender, token):
        self._done(call, "forget", token)

    def on_Download(self, call, sender, number, token, file, directory):
        self.calls.append(("download", token, file, bytes(directory).rstrip(b"\0").decode()))
        self.downloads.append((call, sender, number, file))

    def on_CancelDownload(self, call, _sender, number):
        self.calls.append(("cancel", number))
        call.return_value(None)

    # --- a download that a test runs ---

    def wait_download(self):
        world.wait_for(lambda: self.downloads, "a download")

    def progress(self, done, total):
        _, sender, number, file = self.downloads[0]
        self.bus.emit_signal(sender, self.path, "com.velmora.pelliko.Shares1", "DownloadProgress",
                             GLib.Variant("(uixx)", (number, file, done, total)))

    def finish(self, error=0, *paths):
        call, _, _, _ = self.downloads.pop(0)
        call.return_value(GLib.Variant("(iaay)", (error, [path.encode() + b"\0" for path in paths])))
