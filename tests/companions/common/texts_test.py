"""Every text of a companion has a German one with the same places, and no German text is left over."""

import pathlib
import re
import sys
import unittest

ROOM = pathlib.Path(__file__).resolve().parents[3] / "companions" / sys.argv.pop(1)
LITERAL = r'((?:"(?:[^"\\]|\\.)*"\s*)+)'
PLACE = re.compile(r"%[a-zA-Z]")


def joined(literals):
    return "".join(re.findall(r'"((?:[^"\\]|\\.)*)"', literals))


def texts_of_sources():
    """Single texts, and pairs of one and many."""
    source = "".join(path.read_text(encoding="utf-8") for path in sorted(ROOM.glob("*.cpp")))
    single = {joined(found) for found in re.findall(r"(?:mark|translated|filledIn)\(\s*" + LITERAL, source)}
    for entry in ROOM.glob("*.desktop"):
        single |= set(re.findall(r"^(?:Name|Comment)=(.+)", entry.read_text(encoding="utf-8"), re.M))
    pairs = re.findall(r"counted\(\s*" + LITERAL + r",\s*" + LITERAL, source)
    return single, {(joined(one), joined(many)) for one, many in pairs}


class Texts(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.single, cls.pairs = texts_of_sources()
        cls.catalogue = (ROOM / "locale" / "de.po").read_text(encoding="utf-8")

    def test_the_catalogue_has_exactly_the_texts_of_the_sources(self):
        entries = re.findall(r"^msgid " + LITERAL + r"msgstr " + LITERAL, self.catalogue, re.M)
        german = {joined(text): joined(translation) for text, translation in entries}
        german.pop("")
        self.assertGreater(len(self.single), 10)
        self.assertEqual(self.single, set(german))
        for text, translation in german.items():
            self.assertTrue(translation, text)
            if not text.startswith("%"):  # a form for dates has other places in each language
                self.assertEqual(PLACE.findall(text), PLACE.findall(translation), text)

    def test_what_is_counted_has_both_forms(self):
        entries = re.findall(r"^msgid " + LITERAL + r"msgid_plural " + LITERAL + r"msgstr\[0\] " + LITERAL +
                             r"msgstr\[1\] " + LITERAL, self.catalogue, re.M)
        self.assertEqual(self.pairs, {(joined(one), joined(many)) for one, many, _, _ in entries})
        for _, many, _, german_many in entries:
            self.assertEqual(joined(many).count("%d"), joined(german_many).count("%d"), many)


if __name__ == "__main__":
    unittest.main(verbosity=2)
