"""Every text is there in every language, asks for the same values and fits where it is shown or sent."""

import functools
import gettext
import re
import subprocess
import sys
import tempfile
import unicodedata
import unittest
from pathlib import Path

SOURCE = Path(sys.argv.pop(1))
LANGUAGES = """ar bn de en es fr he hi id it ja ko nl pl pt_BR ru th tr uk vi zh_CN zh_TW""".split()
APPLICATION = "res/locale"
# Their English texts stand in the sources.
OTHERS = {
    "companions/history/locale": "companions",
    "companions/picker/locale": "companions",
    "companions/signin/locale": "companions",
    "companions/viewer/locale": "companions",
    "res/desktop/locale": "res/desktop",
    "service/server/pages/locale": "service/server/pages",
}
PLACE = re.compile(r"%(?:(\d)\$)?[-+ #0']*\d*(?:\.\d+)?([a-zA-Z%])")
SMS = "IDS_RSH_BODY_FILES_HAVE_BEEN_SHARED_VIA_PELLIKO_C_NP1SS_HEXPIRES_C_P2SS_ABB"
WIFI = "IDS_RSH_POP_TO_AVOID_ANY_ADDITIONAL_CHARGES_SHARE_YOUR_FILES_VIA_WI_FI_ONLY"
RESHARE = (
    "IDS_RSH_POP_TAP_SHARE_TO_RESHARE_THE_FILES_THAT_ARE_ALREADY_UPLOADED_TO_THE_SERVER_"
    "WITHOUT_ANY_DATA_CHARGES"
)
# Bytes that the application has for a text, its end included.
ROOM = {
    "IDS_RSH_MBODY_SENDING_PD_FILES_ING": 100,
    "IDS_RSH_SBODY_SHARED_PD_FILES_WITH_YOU_M_STATUS_ABB": 128,
    "IDS_RSH_TMBODY_SHARED_PD_FILES_WITH_YOU_ABB": 128,
    "IDS_RSH_TPOP_PD_NEW_PELLIKO_MESSAGES_RECEIVED_ABB": 128,
}
POPUP_ROOM = 512
# What a language may share with English: international words, and words that are the same there.
SAME = {"OK", "%s kB", "%s MB", "%s GB", "%s TB", ".", "%d byte", "%d file", "%d files", "Download (%s)"}
SAME_IN = {
    "de": {"Text", "Video"},
    "fr": {"Archive", "Contact", "Document"},
    "it": {"1 file ", "%d file", "1 file (%1$s %2$s)", "File", "Video"},
    "id": {"1 file ", "1 file (%1$s %2$s)", "File", "Video"},
    "nl": {"Contact", "Document", "Video"},
    "tr": {"Video"},
}
SCRIPTS = {
    "ar": "ARABIC", "bn": "BENGALI", "he": "HEBREW", "hi": "DEVANAGARI", "ru": "CYRILLIC", "uk": "CYRILLIC",
    "th": "THAI", "ko": "HANGUL", "zh_CN": "CJK", "zh_TW": "CJK", "ja": ("CJK", "HIRAGANA", "KATAKANA"),
}  # fmt: skip
GSM_BASIC = set(
    "@£$¥èéùìòÇ\nØø\rÅåΔ_ΦΓΛΩΠΨΣΘΞÆæßÉ !\"#¤%&'()*+,-./0123456789:;<=>?¡ABCDEFGHIJKLMNOPQRSTUVWXYZÄÖÑÜ§¿"
    "abcdefghijklmnopqrstuvwxyzäöñüà"
)
GSM_EXTENDED = set("^{}\\[~]|€")
ISOLATES = {"\u2066", "\u2067", "\u2068"}


@functools.cache
def catalogue(folder, language):
    with tempfile.NamedTemporaryFile(suffix=".mo") as compiled:
        path = SOURCE / folder / f"{language}.po"
        subprocess.run(["msgfmt", "--check", "-o", compiled.name, path], check=True)
        with open(compiled.name, "rb") as file:
            return gettext.GNUTranslations(file)


def texts(folder, language):
    """By id, or by id and number of the plural form."""
    return {key: text for key, text in catalogue(folder, language)._catalog.items() if key}


def own_id(key):
    name = key[0] if isinstance(key, tuple) else key
    return name.split("\x04")[-1]


def rooms():
    yield from ((APPLICATION, language) for language in LANGUAGES)
    for folder in OTHERS:
        yield from ((folder, language) for language in LANGUAGES if language != "en")


def all_texts():
    """Where, id, English text and text."""
    for folder, language in rooms():
        english = texts(APPLICATION, "en") if folder == APPLICATION else {}
        for key, text in texts(folder, language).items():
            yield folder, language, key, english.get(key, own_id(key)), text


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


def is_date(english):
    return english.startswith("%Y-%m-%d")


def stands_for_one_number(folder, language, form):
    """A form that only one number takes may have that number as a word."""
    rule = re.search(r"plural=([^;]+)", catalogue(folder, language).info()["plural-forms"]).group(1)
    of = gettext.c2py(rule.strip())
    return sum(of(number) == form for number in range(1000)) <= 2


def ids_in_sources():
    """Ids in the sources; a long one may be written as several adjacent literals."""
    used = set()
    for path in (SOURCE / "src").rglob("*.cpp"):
        joined = re.sub(r'"\s*"', "", path.read_text())
        used |= set(re.findall(r'"(IDS_[A-Za-z0-9_]+)"', joined))
    return used


def first_strong(text):
    """The class of the first letter that sets the direction of the line; isolated parts do not."""
    depth = 0
    for letter in text:
        if letter in ISOLATES:
            depth += 1
        elif letter == "\u2069":
            depth -= 1
        elif depth == 0 and (strength := unicodedata.bidirectional(letter)) in ("L", "R", "AL"):
            return strength
    return None


def message_parts(text):
    """Messages that the network sends for a text."""
    if set(text) <= GSM_BASIC | GSM_EXTENDED:
        length = len(text) + sum(letter in GSM_EXTENDED for letter in text)
        single, part = 160, 153
    else:
        length, single, part = len(text.encode("utf-16-le")) // 2, 70, 67
    return 1 if length <= single else -(-length // part)


class Catalogues(unittest.TestCase):
    def test_every_room_has_every_language(self):
        for folder in (APPLICATION, *OTHERS):
            found = {path.stem for path in (SOURCE / folder).glob("*.po")}
            self.assertEqual(found | {"en"}, set(LANGUAGES), folder)

    def test_every_language_has_the_same_ids(self):
        for folder, language in rooms():
            ids = {own_id(key) for key in texts(folder, language)}
            self.assertEqual(ids, {own_id(key) for key in texts(folder, "de")}, f"{folder} {language}")

    def test_every_id_of_the_sources_has_a_text(self):
        used = ids_in_sources()
        self.assertGreater(len(used), 10)
        self.assertEqual(used - set(texts(APPLICATION, "en")), set())

    def test_no_text_outlives_its_place_in_the_sources(self):
        for folder, sources in OTHERS.items():
            code = "".join(path.read_text() for path in (SOURCE / sources).rglob("*.cpp"))
            joined = re.sub(r'"\s*"', "", code)
            for entry in (SOURCE / sources).rglob("*.desktop"):
                joined += re.sub("^[^=]*=(.*)$", r'"\1"', entry.read_text(), flags=re.M)
            for key in texts(folder, "de"):
                # Units are put together.
                if not re.fullmatch(r"%s .B|\.", own_id(key)):
                    self.assertIn(f'"{own_id(key)}"', joined, folder)

    def test_no_text_is_empty_or_an_id(self):
        for folder, language, key, _, text in all_texts():
            self.assertTrue(text.strip() and not text.startswith("IDS_"), f"{folder} {language}: {key}")

    def test_places_are_the_same_in_every_language(self):
        for folder, language, key, english, text in all_texts():
            if is_date(english):
                self.assertEqual(set(re.findall("%.", text)), set(re.findall("%.", english)), language)
                continue
            asked, wanted = places(text), places(english)
            if isinstance(key, tuple):
                wanted[1] = "d"
                if stands_for_one_number(folder, language, key[1]):
                    asked[1] = "d"
            self.assertEqual(asked, wanted, f"{folder} {language}: {key}")

    def test_places_are_numbers_and_texts_without_a_gap(self):
        for language in LANGUAGES:
            for key, text in texts(APPLICATION, language).items():
                asked = places(text)
                self.assertLessEqual(set(asked.values()), {"d", "s"}, f"{language}: {key}")
                self.assertEqual(sorted(asked), list(range(1, len(asked) + 1)), f"{language}: {key}")

    def test_plural_forms_are_complete(self):
        for folder, language in rooms():
            for name in {key[0] for key in texts(folder, language) if isinstance(key, tuple)}:
                count = int(re.search(r"nplurals=(\d)", catalogue(folder, language).info()["plural-forms"])[1])
                forms = [texts(folder, language).get((name, form)) for form in range(count)]
                self.assertTrue(all(forms), f"{folder} {language}: {name}")

    def test_nothing_is_left_in_english(self):
        for folder, language, key, english, text in all_texts():
            if language == "en" or is_date(english) or english in SAME | SAME_IN.get(language, set()):
                continue
            self.assertNotEqual(text, english, f"{folder} {language}: {key}")

    def test_texts_are_written_in_the_languages_script(self):
        for folder, language, key, english, text in all_texts():
            words = [letter for letter in PLACE.sub("", text) if letter.isalpha()]
            if language not in SCRIPTS or not words or is_date(english) or english in SAME:
                continue
            names = [unicodedata.name(letter) for letter in words]
            self.assertTrue(any(name.startswith(SCRIPTS[language]) for name in names), f"{language}: {text}")

    def test_blanks_and_lines_are_kept(self):
        for folder, language, key, english, text in all_texts():
            where = f"{folder} {language}: {key}"
            self.assertEqual(text.endswith(" "), english.endswith(" "), where)
            self.assertEqual(text.count("\n"), english.count("\n"), where)
            self.assertFalse(text.startswith(" ") or "  " in text or "..." in text, where)

    def test_right_to_left_lines_begin_from_the_right(self):
        for folder, language, key, english, text in all_texts():
            if language in ("ar", "he") and not is_date(english) and english not in SAME:
                self.assertIn(first_strong(PLACE.sub("", text)), ("R", "AL"), f"{folder} {language}: {key}")

    def test_foreign_parts_cannot_turn_a_right_to_left_line(self):
        for folder, language, key, english, text in all_texts():
            where = f"{folder} {language}: {key}"
            opened = sum(letter in ISOLATES for letter in text)
            self.assertEqual(opened, text.count("\u2069"), where)
            # A message keeps to letters that every phone shows; its address has a line for itself.
            if language not in ("ar", "he") or key == SMS or english in SAME or is_date(english):
                continue
            outside = re.sub("[\u2066-\u2068][^\u2069]*\u2069", "", text)
            self.assertNotIn("s", places(outside).values(), where)
            self.assertNotRegex(outside, "https?:|\\+\\d", where)

    def test_a_message_with_address_and_date_fits_in_two_parts(self):
        address = "https://share.example.org/s/0123456789abcdefghijkl"
        for language in LANGUAGES:
            text = texts(APPLICATION, language)[SMS]
            filled = text.replace("%1$s", address).replace("%2$s", "2026/11/23")
            self.assertLessEqual(message_parts(filled), 2, f"{language}: {filled}")
            self.assertLessEqual(len(filled.encode()), 255, language)

    def test_languages_of_the_basic_alphabet_send_one_part(self):
        address = "https://share.example.org/s/0123456789abcdefghijkl"
        for language in "de en es fr id it nl pt_BR".split():
            text = texts(APPLICATION, language)[SMS].replace("%1$s", address).replace("%2$s", "2026/11/23")
            self.assertEqual(message_parts(text), 1, f"{language}: {text}")

    def test_parts_are_counted_as_the_network_does(self):
        for text, parts in (("a" * 160, 1), ("a" * 161, 2), ("a" * 306, 2), ("a" * 307, 3), ("[" * 81, 2),
                            ("ж" * 70, 1), ("ж" * 71, 2), ("ж" * 134, 2), ("ж" * 135, 3), ("😀" * 36, 2)):  # fmt: skip
            self.assertEqual(message_parts(text), parts, text)

    def test_texts_fit_into_the_applications_buffers(self):
        for language in LANGUAGES:
            known = texts(APPLICATION, language)
            for key, room in ROOM.items():
                self.assertLess(len(known[key].replace("%d", "1000").encode()), room, f"{language}: {key}")
            heading = known["IDS_CMV_HEADER_SHARE_PD_FILES_ABB"].replace("%d", "1000")
            unsupported = known["IDS_RSH_POP_PD_FILES_ARE_NOT_SUPPORTED_AND_WILL_NOT_BE_SHARED"]
            for advice in (known[RESHARE], unsupported.replace("%d", "1000") + " " + known[WIFI]):
                whole = heading + "(1023.99MB)" + "<br><br>" + advice
                self.assertLess(len(whole.encode()), POPUP_ROOM, f"{language}: {whole}")


unittest.main()
