"""Every text of the sign-in has a German one, and no German text is left over."""

import pathlib
import re
import unittest

ROOM = pathlib.Path(__file__).resolve().parents[3] / "companions" / "signin"


def joined(literal):
    return "".join(re.findall(r'"((?:[^"\\]|\\.)*)"', literal))


class Texts(unittest.TestCase):
    def test_the_catalogue_has_exactly_the_texts_of_the_sources(self):
        source = "".join(path.read_text(encoding="utf-8") for path in sorted(ROOM.glob("*.cpp")))
        used = {joined(found) for found in re.findall(r'(?:mark|translated)\(\s*((?:"(?:[^"\\]|\\.)*"\s*)+)\)', source)}
        catalogue = (ROOM / "locale" / "de.po").read_text(encoding="utf-8")
        entries = re.findall(r'^msgid ((?:"(?:[^"\\]|\\.)*"\s*)+)msgstr ((?:"(?:[^"\\]|\\.)*"\s*)+)', catalogue, re.M)
        german = {joined(text): joined(translation) for text, translation in entries}
        german.pop("")
        self.assertGreater(len(used), 25)
        self.assertEqual(used, set(german))
        for text, translation in german.items():
            self.assertTrue(translation, text)
            self.assertEqual(text.count("%d"), translation.count("%d"), text)


if __name__ == "__main__":
    unittest.main(verbosity=2)
