"""What a person does at the screen of a private world: look for a control, press it, take a picture.

Controls are found by their label through the accessibility bus and pressed with a real pointer in the
middle of their extents, so that a button that cannot be pressed fails here too.
"""

import contextlib
import functools
import subprocess

import Xlib.X
import Xlib.display
import Xlib.error
import Xlib.ext.damage
import pyatspi
from gi.repository import Gio, GLib

from world import LIMIT, WorldError, let_pass, run, wait_for

_EVENTS = ("object:state-changed:showing", "object:state-changed:visible", "object:children-changed",
           "object:bounds-changed", "window:create", "window:activate", "object:state-changed:focused",
           "object:text-changed:insert", "object:text-changed:delete")
_CURSOR_WIDTH, _CURSOR_HEIGHT = 16, 64  # what is drawn anew when a text cursor blinks, in whole tiles
_STEP = 0.1  # seconds between two looks at something that may move


def _no_matter(_event):
    """Its only purpose is to wake the loop."""


@functools.cache
def _listen():
    """Once and for good: a program tells no change that nobody listened for when it came, and the state that is
    remembered of its controls would stay as it was."""
    for event in _EVENTS:
        pyatspi.Registry.registerEventListener(_no_matter, event)


def announce_reader():
    """Says that a screen reader is there: the toolkit shows its controls only to programs started after this."""
    _listen()
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


def at_rest(label, role=None):
    """The extents of the control with this label once it stands: popups slide in. None when it went away."""
    for node in nodes():
        try:
            if node.name != label or not (role is None or role in node.getRoleName()):
                continue
            if not node.getState().contains(pyatspi.STATE_SHOWING):
                continue
            component, before = node.queryComponent(), None
            while before != (extents := component.getExtents(pyatspi.DESKTOP_COORDS)):
                before = extents
                let_pass(_STEP)
        except Exception:  # the object went away while it was looked at
            continue
        if extents.width > 1 and extents.height > 1:
            return extents
    return None


def _blinks(event):
    area = getattr(event, "area", None)
    return area is not None and area.width <= _CURSOR_WIDTH and area.height <= _CURSOR_HEIGHT


class Drawing:
    """Wakes the loop whenever something is drawn on the screen, and tells `drawn` if that is given and it was more
    than a text cursor, which blinks for ever."""

    def __init__(self, drawn=None):
        self.display = Xlib.display.Display()
        self.display.damage_query_version()
        self.display.screen().root.damage_create(Xlib.ext.damage.DamageReportRawRectangles)
        self.display.sync()
        self.drawn = drawn
        self.watch = GLib.io_add_watch(self.display.fileno(), GLib.PRIORITY_DEFAULT, GLib.IOCondition.IN, self._read)

    def _read(self, *_):
        events = [self.display.next_event() for _ in range(self.display.pending_events())]
        if self.drawn and not all(map(_blinks, events)):
            self.drawn()
        return True

    def close(self):
        GLib.source_remove(self.watch)
        self.display.close()


@contextlib.contextmanager
def awake():
    """Wakes the loop at the events of programs, and when something is drawn."""
    _listen()
    drawing = Drawing()
    try:
        yield
    finally:
        drawing.close()


@contextlib.contextmanager
def _forgetting(seconds):
    """Forgets what is remembered of every program's controls each time so long has passed, and wakes the loop."""
    timer = GLib.timeout_add_seconds(seconds, _forget)
    try:
        yield
    finally:
        GLib.source_remove(timer)


def _forget():
    for application in pyatspi.Registry.getDesktop(0):
        if application:
            application.clear_cache()
    return GLib.SOURCE_CONTINUE


def _told():
    """The programs and the names of what they show, for whoever reads why a wait was in vain."""
    try:
        programs = [application.name for application in pyatspi.Registry.getDesktop(0) if application]
    except Exception:  # one went away while it was looked at
        programs = "that come and go"
    return f"programs {programs}, shown {[name for name, _, _, _ in controls() if name]}"


def wait_seen(condition, what, limit=LIMIT):
    """Waits until condition() is true of what programs show, and returns its value.

    A program may announce a control a moment before it answers for it; what it draws then is looked at too. A name that
    was asked for while it changed is remembered as it was, so what is remembered is forgotten now and then.
    """
    with awake(), _forgetting(5):
        try:
            return wait_for(condition, what, limit)
        except WorldError as error:
            raise WorldError(f"{error}; {_told()}") from None


def wait_for_control(label, role=None, limit=LIMIT):
    """Waits until a control with this label shows and returns its extents."""
    return wait_seen(lambda: find(label, role), f"the control “{label}”", limit)


def wait_for_row(start, role, limit=LIMIT):
    """Waits until a control whose name begins so shows, and returns its name."""
    return wait_seen(lambda: next((name for name, found, _, _ in controls() if name.startswith(start) and role in found),
                                  None), f"a row “{start}”", limit)


def _window_with_keyboard(display):
    """The class names of the window that gets the keys; none while there is no such one. Some toolkits give them to a
    window of their own inside of it."""
    window = display.get_input_focus().focus
    try:
        while hasattr(window, "get_wm_class"):
            if names := window.get_wm_class():
                return names
            window = window.query_tree().parent
        return ()
    except Xlib.error.BadWindow:  # it went away while it was looked at
        return ()


def wait_active(name, active=True, limit=LIMIT):
    """Waits until the keyboard belongs to a window of this name, which gets every key from then on; or to no such."""
    display = Xlib.display.Display()
    # The window manager notes on the root which window it gave the keyboard to, after it did. The note alone may mean
    # a window that is gone, whose number another has got.
    display.screen().root.change_attributes(event_mask=Xlib.X.PropertyChangeMask)

    def look():
        names = _window_with_keyboard(display)
        while display.pending_events():  # also those that came with the answers, which wake no loop
            display.next_event()
            names = _window_with_keyboard(display)
        return (name in names) == active

    watch = GLib.io_add_watch(display.fileno(), GLib.PRIORITY_DEFAULT, GLib.IOCondition.IN, lambda *_: True)
    try:
        wait_for(look, f"a window “{name}” to {'get' if active else 'lose'} the keyboard", limit)
    finally:
        GLib.source_remove(watch)
        display.close()


def press(label, role=None, limit=LIMIT):
    """Waits for a control and presses it with the pointer."""
    extents = wait_for_control(label, role, limit)
    extents = at_rest(label, role) or extents
    x, y = extents.x + extents.width // 2, extents.y + extents.height // 2
    run("xdotool", "mousemove", str(x), str(y), "click", "1")


def press_row(name, seen):
    """Presses a row of a list until the press has led to a control with the label `seen`. A list that is laid out anew
    between press and release, or takes the press for a long one since the machine was busy, does nothing, and a person
    would press again."""
    for limit in (10, 10, LIMIT):
        wait_still(0.6)
        press(name, "list item")
        with contextlib.suppress(WorldError):
            return wait_for_control(seen, limit=limit)
    raise WorldError(f"no press of “{name}” led to “{seen}”")


def key(name):
    run("xdotool", "key", name)


def _entry(label):
    """Whether the entry with this label has the focus, and its text; None while there is none."""
    for node in nodes():
        try:
            if node.name == label and "entry" in node.getRoleName():
                node.clear_cache()  # what is remembered may be older than the last press
                text = node.queryText()
                return (node.getState().contains(pyatspi.STATE_FOCUSED), text.getText(0, text.characterCount))
        except Exception:  # the object went away while it was looked at
            continue
    return None


def text_of(label):
    """What the entry with this label holds; None while there is no such entry."""
    found = _entry(label)
    return found and found[1]


def type_into(label, text):
    """Replaces the text of an entry as a person does: a press into it, all letters removed, others typed."""
    press(label, "entry")
    wait_seen(lambda: (_entry(label) or [False])[0], f"the focus of “{label}”")
    run("xdotool", "key", "End", *["BackSpace"] * len(text_of(label)),
        *(["type", "--delay", "5", "--", text] if text else []))
    wait_seen(lambda: text_of(label) == text, f"“{label}” to hold “{text}”")


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


def colour(x, y):
    """What is drawn at a place of the screen now."""
    display = Xlib.display.Display()
    try:
        return display.screen().root.get_image(x, y, 1, 1, Xlib.X.ZPixmap, 0xFFFFFFFF).data
    finally:
        display.close()


def screenshot(path, limit=5.0):
    """Saves the whole screen, once it stands still or `limit` seconds later, as a PNG."""
    wait_still(limit=limit)
    done = subprocess.run(["import", "-window", "root", path], capture_output=True, text=True)
    if done.returncode != 0:
        raise WorldError(f"no screenshot: {done.stderr.strip()}")
    return path
