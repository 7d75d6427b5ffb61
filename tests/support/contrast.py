"""How well letters can be told from their ground, as the guidelines for web content measure it."""


def luminance(colour):
    """Of "#rrggbb", from 0 to 1."""
    channels = [int(colour[place:place + 2], 16) / 255 for place in (1, 3, 5)]
    red, green, blue = (c / 12.92 if c <= 0.04045 else ((c + 0.055) / 1.055) ** 2.4 for c in channels)
    return 0.2126 * red + 0.7152 * green + 0.0722 * blue


def contrast(one, other):
    """From 1 to 21."""
    dark, light = sorted((luminance(one), luminance(other)))
    return (light + 0.05) / (dark + 0.05)
