"""How a control looks while it is held, also when it is held again at once."""

import screen
import world


def _wait_colour(x, y, right, what):
    drawing = screen.Drawing()
    try:
        world.wait_for(lambda: right(screen.colour(x, y)), what, 10)
    finally:
        drawing.close()


def expect_both_look_pressed(label, role="button"):
    """Holds a control, then clicks and holds it within the time of a double press. What a click does may not
    change the place of the control."""
    extents = screen.wait_for_control(label, role)
    screen.wait_still(0.2)
    x, y = extents.x + extents.width // 8, extents.y + extents.height // 2
    place = (x, y + 10)
    rest = screen.colour(*place)
    try:
        world.run("xdotool", "mousemove", str(x), str(y), "mousedown", "1")
        _wait_colour(*place, lambda now: now != rest, f"{label} to look pressed")
        screen.wait_still(0.2)
        pressed = screen.colour(*place)
        world.run("xdotool", "mousemove", "5", "5", "mouseup", "1")
        _wait_colour(*place, lambda now: now == rest, f"{label} to look at rest")
        world.run("xdotool", "mousemove", str(x), str(y), "mousedown", "1", "mouseup", "1", "mousedown", "1")
        screen.wait_still(0.5)  # the first of the two looked pressed as well, and is fading
        _wait_colour(*place, lambda now: now == pressed, f"{label} to look pressed again")
    finally:
        world.run("xdotool", "mousemove", "5", "5", "mouseup", "1")
