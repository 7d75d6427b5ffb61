"""The letters of the companions' pages can be told from what they stand on, in every palette."""

import pathlib
import re
import sys
import unittest
import xml.etree.ElementTree as ElementTree

SOURCE = pathlib.Path(__file__).resolve().parents[3]
sys.path.insert(0, str(SOURCE / "tests" / "support"))

from contrast import contrast  # noqa: E402

TABLE = SOURCE / "res" / "tables" / "com.velmora.pelliko_ChangeableColorTable.xml"
LAYOUTS = SOURCE / "companions" / "common" / "edje"
PAGE = "pelliko/card"  # what Widgets paints behind a page
LEAST = 4.5


def palettes():
    """The colours of each palette by class."""
    return {palette.get("name"): {colour.get("class"): colour.get("value") for colour in palette}
            for palette in ElementTree.parse(TABLE).getroot().iter("palette")}


def letters_and_grounds():
    """Pairs of classes: what is written, and what it is written on."""
    layout = "".join(path.read_text(encoding="utf-8") for path in sorted(LAYOUTS.glob("*.edc")))
    pairs = {(letters, PAGE) for letters in re.findall(r'^   TEXT\("\w+", "\d+", "\w+", "([^"]+)"', layout, re.M)}
    rows = re.findall(r'LINE\("[^"]+", "[^"]+", \d+, "\w+", "([^"]+)"', layout)
    pairs |= {(letters, ground) for letters in rows for ground in ("pelliko/row", "pelliko/row/pressed")}
    for kind in ("button", "primary"):
        pairs |= {(f"pelliko/{kind}/text", f"pelliko/{kind}{state}") for state in ("", "/pressed")}
    pairs |= {("pelliko/person/text", f"pelliko/person/{number}") for number in range(1, 6)}  # initials
    for letters in ("/fg/normal/entry/text", "/fg/normal/entry/text/guide"):
        pairs.add((letters, "/bg/normal/entry"))
    return pairs


class Colours(unittest.TestCase):
    def test_letters_can_be_told_from_their_ground(self):
        pairs = letters_and_grounds()
        self.assertGreaterEqual(len(pairs), 13)
        for name, colours in palettes().items():
            for letters, ground in sorted(pairs):
                with self.subTest(f"{name}: {letters} on {ground}"):
                    self.assertGreaterEqual(contrast(colours[letters], colours[ground]), LEAST)

    def test_marks_of_states_stand_out(self):
        """A bar, and the ring around what the keyboard acts on, need no more than three to one."""
        for name, colours in palettes().items():
            for mark, ground in (("pelliko/primary", "pelliko/line"), ("pelliko/focus", PAGE)):
                with self.subTest(f"{name}: {mark} on {ground}"):
                    self.assertGreaterEqual(contrast(colours[mark], colours[ground]), 3)

    def test_contrast_is_measured_as_the_guidelines_do(self):
        self.assertAlmostEqual(contrast("#000000", "#ffffff"), 21)
        self.assertAlmostEqual(contrast("#777777", "#ffffff"), 4.48, places=2)
        self.assertEqual(contrast("#123456", "#123456"), 1)


if __name__ == "__main__":
    unittest.main(verbosity=2)
