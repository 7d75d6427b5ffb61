"""What desktops and terminals are told of Pelliko: the menu entry, “Send to”, the page of software centres, man pages."""

import re
import subprocess
import sys
import unittest
from pathlib import Path

from gi.repository import Gio, GLib

SOURCE, BUILD = Path(sys.argv.pop(1)), Path(sys.argv.pop(1))
SHARE = BUILD / "share"
ENTRY = SHARE / "applications/com.velmora.pelliko.desktop"
SENDTO = SHARE / "Thunar/sendto/pelliko.desktop"
ACTION = SHARE / "file-manager/actions/pelliko-send.desktop"
LANGUAGES = [path.stem for path in (SOURCE / "res/desktop/locale").glob("*.po")]
# Kinds that a machine takes these names for, which are other kinds in truth or none at all.
OTHER_KINDS = {"application/octet-stream", "text/vnd.trolltech.linguist", "application/vnd.stardivision.math",
               "application/x-fluid"}


def check(*command):
    done = subprocess.run([str(word) for word in command], capture_output=True, text=True)
    return "" if done.returncode == 0 else done.stdout + done.stderr or "failed without a word"


def entry_of(path):
    entry = GLib.KeyFile()
    entry.load_from_file(str(path), GLib.KeyFileFlags.KEEP_TRANSLATIONS)
    return entry


class DesktopFiles(unittest.TestCase):
    def test_they_keep_to_the_rules(self):
        self.assertEqual("", check("desktop-file-validate", ENTRY, SENDTO))
        self.assertEqual("", check("appstreamcli", "validate", "--no-net",
                                   SHARE / "metainfo/com.velmora.pelliko.metainfo.xml"))

    def test_every_language_has_its_words(self):
        entry = entry_of(ENTRY)
        for key in ("GenericName", "Comment", "Keywords", "X-Pelliko-Send-Label"):
            english = entry.get_string("Desktop Entry", key)
            for language in LANGUAGES:
                self.assertNotEqual(english, entry.get_locale_string("Desktop Entry", key, language), (key, language))
        self.assertEqual("Mit Pelliko senden", entry_of(ACTION).get_locale_string("Desktop Entry", "Name", "de"))
        self.assertEqual(21, len(LANGUAGES))

    def test_the_action_keeps_to_what_file_managers_bear(self):
        profile = "X-Action-Profile share"
        action = entry_of(ACTION)
        self.assertEqual(["all/allfiles"], action.get_string_list(profile, "MimeTypes"))  # folders are left out
        self.assertIn("%F", action.get_string(profile, "Exec"))
        self.assertNotIn("Schemes", action.get_keys(profile)[0])  # PCManFM 1.3 crashes at it

    def test_all_that_can_be_shared_can_be_opened_with_it(self):
        table = (SOURCE / "src/PellikoUploadDataManager/SupportedFileTypes.cpp").read_text()
        names = re.findall(r'"(\w+)"', table.split("supported_extensions[] = {")[1].split("};")[0])
        self.assertGreater(len(names), 70)
        kinds = {Gio.content_type_guess("a." + name, None)[0] for name in names} - OTHER_KINDS
        entry = entry_of(ENTRY)
        offered = set(entry.get_string_list("Desktop Entry", "MimeType"))
        self.assertEqual(set(), kinds - offered)
        self.assertFalse([kind for kind in offered if kind.startswith("inode/")])
        self.assertEqual(offered, set(entry_of(SENDTO).get_string_list("Desktop Entry", "MimeType")))


class ManPages(unittest.TestCase):
    def test_they_are_well_formed(self):
        pages = sorted((SOURCE / "docs/man").glob("*.[18]"))
        self.assertGreater(len(pages), 10)
        self.assertEqual("", check("mandoc", "-T", "lint", "-W", "warning", *pages))

    def test_every_program_has_one(self):
        made = {re.search(r"pelliko_(?:program|companion)\(([\w-]+)", line)[1]
                for top in ("platform", "service", "companions") for path in (SOURCE / top).rglob("CMakeLists.txt")
                for line in path.read_text().splitlines()
                if re.match(r"\s*pelliko_(program|companion)\([a-z]", line)} - {"pelliko-command"} | {"pelliko"}
        pages = {path.stem for path in (SOURCE / "docs/man").iterdir()}
        self.assertEqual(set(), made - pages)

    def test_all_options_of_the_command_are_explained(self):
        page = (SOURCE / "docs/man/pelliko.1").read_text()
        for command in ([], ["share"], ["text"], ["contacts"], ["status"]):
            said = subprocess.run([BUILD / "bin/pelliko", *command, "--help"], capture_output=True, text=True).stdout
            options = set(re.findall(r"^  (?:-h,)?--([a-z]+)", said, re.M))
            self.assertIn("help", options)
            for option in options:
                self.assertIn(f"Fl -{option}", page, command)


if __name__ == "__main__":
    unittest.main(verbosity=2)
