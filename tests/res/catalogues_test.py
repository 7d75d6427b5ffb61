"""Every message id that the application uses has a text in every language, with the same places."""

import gettext
import re
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path

SOURCE = Path(sys.argv.pop(1))
LANGUAGES = sorted(path.stem for path in (SOURCE / "res/locale").glob("*.po"))
PLACE = re.compile(r"%(?:(\d)\$)?[-+ #0']*\d*(?:\.\d+)?([a-zA-Z%])")


def texts(language):
    with tempfile.NamedTemporaryFile(suffix=".mo") as compiled:
        subprocess.run(
            ["msgfmt", "--check", "-o", compiled.name, SOURCE / f"res/locale/{language}.po"], check=True
        )
        with open(compiled.name, "rb") as file:
            catalogue = gettext.GNUTranslations(file)
    return {key: text for key, text in catalogue._catalog.items() if key}


def places(text):
    """The values that a text asks for, by position."""
    found, following = {}, 1
    for position, kind in PLACE.findall(text):
        if kind == "%":
            continue
        if not position:
            position, following = str(following), following + 1
        found[int(position)] = kind
    return found


def ids_in_sources():
    """Ids in the sources; a long one may be written as several adjacent literals."""
    used = set()
    for path in (SOURCE / "src").rglob("*.cpp"):
        joined = re.sub(r'"\s*"', "", path.read_text())
        used |= set(re.findall(r'"(IDS_[A-Za-z0-9_]+)"', joined))
    return used


class Catalogues(unittest.TestCase):
    def test_there_are_english_and_german(self):
        self.assertEqual(LANGUAGES, ["de", "en"])

    def test_every_language_has_the_same_ids(self):
        english = set(texts("en"))
        for language in LANGUAGES:
            self.assertEqual(set(texts(language)), english, language)

    def test_every_id_of_the_sources_has_a_text(self):
        used = ids_in_sources()
        self.assertGreater(len(used), 10)
        for language in LANGUAGES:
            self.assertEqual(used - set(texts(language)), set(), language)

    def test_no_text_is_empty_or_an_id(self):
        for language in LANGUAGES:
            for key, text in texts(language).items():
                self.assertTrue(text.strip() and not text.startswith("IDS_"), f"{language}: {key}")

    def test_places_are_the_same_in_every_language(self):
        english = texts("en")
        for language in LANGUAGES:
            for key, text in texts(language).items():
                self.assertEqual(places(text), places(english[key]), f"{language}: {key}")

    def test_places_are_numbers_and_texts_without_a_gap(self):
        for language in LANGUAGES:
            for key, text in texts(language).items():
                asked = places(text)
                self.assertLessEqual(set(asked.values()), {"d", "s"}, f"{language}: {key}")
                self.assertEqual(sorted(asked), list(range(1, len(asked) + 1)), f"{language}: {key}")

    def test_a_message_with_address_and_date_fits_in_two_parts(self):
        for language in LANGUAGES:
            text = texts(language)[
                "IDS_RSH_BODY_FILES_HAVE_BEEN_SHARED_VIA_PELLIKO_C_NP1SS_HEXPIRES_C_P2SS_ABB"
            ]
            filled = text.replace("%1$s", "https://share.example.org/s/0123456789abcdefghijkl").replace(
                "%2$s", "2026/11/23"
            )
            self.assertLessEqual(len(filled.encode()), 255, language)


unittest.main()
