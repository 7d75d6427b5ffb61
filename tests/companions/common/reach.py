"""What somebody who sees little, or has only a keyboard, gets of a program: names, ways, and room."""

import pyatspi
import screen

OPERABLE = ("push button", "button", "entry", "check box", "toggle button", "radio button", "slider", "link")


def _state(node):
    node.clear_cache()  # what is remembered may be older than the last key
    return node.getState()


def _shown():
    """Every control that a person can act on: its node, name, role and extents."""
    found = []
    for node in screen.nodes():
        try:
            state = _state(node)
            extents = node.queryComponent().getExtents(pyatspi.DESKTOP_COORDS)
            if (node.getRoleName() in OPERABLE and state.contains(pyatspi.STATE_SHOWING) and extents.width > 1
                    and state.contains(pyatspi.STATE_ENABLED)):
                found.append((node, node.name, node.getRoleName(), extents))
        except Exception:  # the object went away while it was looked at
            continue
    return found


def places():
    """Where the controls are, in the order in which they are read out."""
    return [extents for _, _, _, extents in _shown()]


def _focused():
    for node, name, role, _ in _shown():
        if _state(node).contains(pyatspi.STATE_FOCUSED):
            return name, role
    return None


def unnamed():
    return [f"{role} at {extents.x},{extents.y}" for _, name, role, extents in _shown() if not name.strip()]


def walk(most=40):
    """Presses Tab until the keyboard is back where it was, and returns the names of what it acted on."""
    first = here = screen.wait_seen(_focused, "something to have the keyboard")
    names = []
    while not names or (here != first and len(names) < most):
        names.append(here[0])
        screen.key("Tab")
        before = here
        here = screen.wait_seen(lambda: (now := _focused()) != before and now, f"the keyboard to leave “{before[0]}”")
    return names


def expect_all_named_and_reached(case, *others):
    """Every control that shows, and the others that only scrolling shows, has a name, and Tab comes to each of them."""
    case.assertEqual([], unnamed())
    names = {name for _, name, _, _ in _shown()}
    case.assertGreater(len(names), 1)
    case.assertEqual(set(), (names | set(others)) - set(walk()))


def expect_within(case, width):
    """Nothing that a person can act on, or read, stands out at the side."""
    parts = [(name, extents) for name, _, extents, _ in screen.controls() if name]
    case.assertGreater(len(parts), 1)
    out = [(name, extents.x, extents.width) for name, extents in parts
           if extents.x < 0 or extents.x + extents.width > width]
    case.assertEqual([], out)


def expect_mirrored(case):
    """Of two controls beside each other the first is on the right."""
    first, second = places()[:2]
    case.assertEqual(first.y, second.y)
    case.assertGreater(first.x, second.x)
