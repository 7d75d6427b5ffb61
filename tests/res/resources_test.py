"""The build tree mirrors the application's directory, readable for everybody, and texts can be read on it."""

import re
import stat
import subprocess
import sys
import tempfile
import unittest
import xml.etree.ElementTree as xml
from pathlib import Path

SOURCE, BUILD = Path(sys.argv.pop(1)), Path(sys.argv.pop(1))
sys.path.insert(0, str(SOURCE / "tests" / "support"))

from contrast import contrast  # noqa: E402

APP = BUILD / "app"
FILES = [
    "res/edje/pelliko.edj",
    "res/images/sender-images/WVGA/noti_icon_pelliko.png",
    "res/images/sender-images/WVGA/pk_badge_ic_sms.png",
    "res/images/sender-images/WVGA/pk_caller_id_default.png",
    "res/images/sender-images/WVGA/pk_caller_id_default_masking.png",
    "res/locale/C/LC_MESSAGES/pelliko.mo",
    *(f"res/locale/{path.stem}/LC_MESSAGES/pelliko.mo" for path in sorted((SOURCE / "res/locale").glob("*.po"))),
    "shared/res/com.velmora.pelliko.png",
    "shared/res/tables/com.velmora.pelliko_ChangeableColorTable.xml",
    "shared/res/tables/com.velmora.pelliko_FontInfoTable.xml",
]
# Letters and what they stand on.
PAIRS = [
    ("pelliko/text", "pelliko/card"),
    ("pelliko/text/second", "pelliko/card"),
    ("pelliko/text", "pelliko/row"),
    ("pelliko/text", "pelliko/row/pressed"),
    ("pelliko/primary/text", "pelliko/primary"),
    ("pelliko/primary/text", "pelliko/primary/pressed"),
    ("pelliko/button/text", "pelliko/button"),
    ("pelliko/button/text", "pelliko/button/pressed"),
    ("/fg/normal/popup/text", "pelliko/card"),
    ("AO004", "pelliko/card"),
    ("pelliko/error", "pelliko/card"),
    *(("pelliko/person/text", f"pelliko/person/{number}") for number in range(1, 6)),
]


def table(name):
    return xml.parse(SOURCE / f"res/tables/com.velmora.pelliko_{name}.xml").getroot()


def palettes():
    """The colours of each palette by class."""
    return {palette.get("name"): {color.get("class"): color.get("value") for color in palette.iter("color")}
            for palette in table("ChangeableColorTable").iter("palette")}


class Resources(unittest.TestCase):
    def test_the_mirror_holds_exactly_these_files(self):
        found = sorted(str(path.relative_to(APP)) for path in APP.rglob("*") if path.is_file())
        self.assertEqual(found, FILES)

    def test_everybody_may_read_them(self):
        for name in FILES:
            self.assertEqual(stat.S_IMODE((APP / name).stat().st_mode) & 0o444, 0o444, name)
        self.assertEqual(stat.S_IMODE((APP / FILES[0]).stat().st_mode), 0o644)

    def test_menus_name_the_companions_in_every_language(self):
        entries = list((BUILD / "companions").glob("*/*.desktop"))
        self.assertEqual(len(entries), 4)
        wanted = {path.stem for path in (SOURCE / "res/locale").glob("*.po")} - {"en"}
        for entry in entries:
            for key in ("Name", "Comment"):
                found = set(re.findall(rf"^{key}\[(\w+)\]=\S", entry.read_text(), re.M))
                self.assertEqual(found, wanted, f"{entry}: {key}")

    def test_letters_can_be_told_from_their_ground(self):
        self.assertEqual(["light", "dark"], list(palettes()))
        for name, colors in palettes().items():
            for letters, ground in PAIRS:
                with self.subTest(f"{name}: {letters} on {ground}"):
                    self.assertGreaterEqual(contrast(colors[letters], colors[ground]), 4.5)

    def test_both_palettes_name_the_same_classes(self):
        light, dark = palettes().values()
        self.assertEqual(set(light), set(dark))

    def test_every_class_of_the_layouts_is_in_the_tables(self):
        layouts = "".join(path.read_text() for path in (SOURCE / "res/edje").glob("*.edc"))
        fonts = {font.get("class") for font in table("FontInfoTable").iter("font")}
        named = set(re.findall(r'"(pelliko/[a-z/]*[a-z])"', layouts))
        named |= {f"pelliko/person/{number}" for number in re.findall(r"\bGROUND\((\d)\)", layouts)}
        self.assertEqual(named - set(palettes()["light"]), set())
        self.assertIn("pelliko/person/5", named)
        self.assertEqual(set(re.findall(r"text_class[=: ]+\"?(pelliko_[a-z]+)", layouts)) - fonts, set())

    def test_locales_are_made_once_and_kept(self):
        with tempfile.TemporaryDirectory() as folder:
            make = [SOURCE / "scripts/make-locales", folder]
            subprocess.run(make, check=True)
            made = {path: path.stat().st_mtime_ns for path in Path(folder).glob("*/LC_CTYPE")}
            self.assertEqual(
                sorted(path.parent.name for path in made), ["de_DE.utf8", "en_GB.utf8", "en_US.utf8"]
            )
            subprocess.run(make, check=True)
            self.assertEqual({path: path.stat().st_mtime_ns for path in made}, made)

    def test_locales_need_a_folder(self):
        refused = subprocess.run([SOURCE / "scripts/make-locales"], capture_output=True, text=True)
        self.assertEqual(refused.returncode, 2)
        self.assertIn("make-locales DIR", refused.stdout)


unittest.main()
