"""What a person does at the screen of a private world: look for a control, press it, take a picture.

Controls are found by their label through the accessibility bus and pressed with a real pointer in the
middle of their extents, so that a button that cannot be pressed fails here too.
"""

import subprocess

import Xlib.display
import Xlib.ext.damage
import pyatspi
from gi.repository import Gio, GLib

from world import LIMIT, WorldError, run, wait_for

_EVENTS = ("object:state-changed:showing", "object:state-changed:visible", "object:children-changed",
           "object:bounds-changed", "window:create", "window:activate")



def announce_reader():
    """Says that a screen reader is there: the toolkit shows its controls only to programs started after this."""
    bus = Gio.bus_get_sync(Gio.BusType.SESSION)
    bus.call_sync("org.a11y.Bus", "/org/a11y/bus", "org.freedesktop.DBus.Properties", "Set",
                  GLib.Variant("(ssv)", ("org.a11y.Status", "ScreenReaderEnabled", GLib.Variant("b", True))),
                  None, Gio.DBusCallFlags.NONE, 5000)


def _walk(node, depth=0):
    if node is None or depth > 40:
        return
    yield node
    try:
        count = node.childCount
    except Exception:  # the object went away while it was looked at
        return
    for index in range(count):
        try:
            child = node.getChildAtIndex(index)
        except Exception:
            continue
        yield from _walk(child, depth + 1)


def nodes():
    """Everything that every program shows to assistive programs."""
    for application in pyatspi.Registry.getDesktop(0):
        yield from _walk(application)


def controls():
    """Every control of every program on the screen that is showing and enabled: (name, role, extents)."""
    found = []
    for node in nodes():
        try:
            states = node.getState()
            if not states.contains(pyatspi.STATE_SHOWING):
                continue
            extents = node.queryComponent().getExtents(pyatspi.DESKTOP_COORDS)
            found.append((node.name, node.getRoleName(), extents, states.contains(pyatspi.STATE_ENABLED)))
        except Exception:
            continue
    return found


def find(label, role=None):
    """The extents of the control with this label, or None."""
    for name, found_role, extents, _enabled in controls():
        if name == label and (role is None or role in found_role) and extents.width > 1 and extents.height > 1:
            return extents
    return None


class Drawing:
    """Wakes the loop whenever something is drawn on the screen, and tells `drawn` if that is given."""

    def __init__(self, drawn=None):
        self.display = Xlib.display.Display()
        self.display.damage_query_version()
        self.display.screen().root.damage_create(Xlib.ext.damage.DamageReportRawRectangles)
        self.display.sync()
        self.drawn = drawn
        self.watch = GLib.io_add_watch(self.display.fileno(), GLib.PRIORITY_DEFAULT, GLib.IOCondition.IN, self._read)

    def _read(self, *_):
        while self.display.pending_events():
            self.display.next_event()
        if self.drawn:
            self.drawn()
        return True

    def close(self):
        GLib.source_remove(self.watch)
        self.display.close()


def wait_for_control(label, role=None, limit=LIMIT):
    """Waits until a control with this label shows and returns its extents.

    A program may announce a control a moment before it answers for it; what it draws then is looked at too.
    """
    listener = lambda event: None  # noqa: E731 - its only purpose is to wake the loop
    for event in _EVENTS:
        pyatspi.Registry.registerEventListener(listener, event)
    drawing = Drawing()
    try:
        return wait_for(lambda: find(label, role), f"the control “{label}”", limit)
    finally:
        drawing.close()
        for event in _EVENTS:
            pyatspi.Registry.deregisterEventListener(listener, event)


def press(label, role=None, limit=LIMIT):
    """Waits for a control and presses it with the pointer."""
    extents = wait_for_control(label, role, limit)
    x, y = extents.x + extents.width // 2, extents.y + extents.height // 2
    run("xdotool", "mousemove", str(x), str(y), "click", "1")


def key(name):
    run("xdotool", "key", name)


def type_into(label, text):
    """Replaces the text of an entry as a person does: a press into it, all marked, removed, typed."""
    press(label, "entry")
    wait_still(0.2)
    key("ctrl+a")
    key("BackSpace")
    if text:
        run("xdotool", "type", "--delay", "5", "--", text)
    wait_still(0.2)


def wait_still(quiet=0.4, limit=5.0):
    """Waits until nothing was drawn on the screen for `quiet` seconds, so that a picture shows no half-drawn state."""
    loop = GLib.MainLoop()
    timers = {"quiet": 0}

    def settle():
        loop.quit()
        return False

    def drawn():
        GLib.source_remove(timers["quiet"])
        timers["quiet"] = GLib.timeout_add(int(quiet * 1000), settle)

    timers["quiet"] = GLib.timeout_add(int(quiet * 1000), settle)
    timers["limit"] = GLib.timeout_add(int(limit * 1000), settle)
    drawing = Drawing(drawn)
    loop.run()
    drawing.close()
    for timer in timers.values():
        if GLib.MainContext.default().find_source_by_id(timer):
            GLib.source_remove(timer)


def screenshot(path):
    """Saves the whole screen, once it stands still, as a PNG."""
    wait_still()
    done = subprocess.run(["import", "-window", "root", path], capture_output=True, text=True)
    if done.returncode != 0:
        raise WorldError(f"no screenshot: {done.stderr.strip()}")
    return path
