"""The viewer with every state that a received share can have, and how it saves and opens."""

import os
import sys
import time
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "common"))

import companion_case  # noqa: E402
import doubles  # noqa: E402
import reach  # noqa: E402
import presses  # noqa: E402
import screen  # noqa: E402
import world  # noqa: E402

ANN = "+447700900123"
TOKEN = "AbC_-123456789012345"
FILES = (("holiday.jpg", 2_400_000, "image/jpeg"), ("film.mp4", 80_000_000, "video/mp4"),
         ("song.ogg", 4_000_000, "audio/ogg"), ("report.pdf", 90_000, "application/pdf"), ("notes.txt", 0, "text/plain"))
DOWNLOADS = os.path.join(os.environ["HOME"], "Downloads")
UNREACHABLE = "The share server cannot be reached. Check your connection and try again."
WITHDRAWN = "The sender has withdrawn this share. Its files cannot be fetched any more."
EXPIRED = "The time of this share is over, and its files are gone. Ask the sender to share them again."


class ViewerCase(companion_case.CompanionCase):
    program = "com.velmora.pelliko-viewer"

    @classmethod
    def setUpClass(cls):
        world.add_contact("Ann Example", "+44 7700 900123")

    def setUp(self):
        super().setUp()
        self.service = doubles.SharesService()
        self.addCleanup(self.service.close)
        self.service.received = [doubles.received(TOKEN, ANN, files=FILES)]

    def open(self, token=TOKEN):
        self.launch("launch_viewer", "--extra", f"contents_token={token}", "--extra", "share_type=single_share")

    def see_share(self):
        self.see("\u2068Ann Example\u2069 shared with you")


class States(ViewerCase):
    def test_a_share_shows_sender_files_and_end(self):
        self.open()
        self.see_share()
        self.see("holiday.jpg, 2.4 MB, Press to save", "button")
        self.see("film.mp4, 80.0 MB, Press to save", "button")
        self.picture("share")

    def test_it_is_told_when_there_is_no_such_share(self):
        for token in ("unknown", "x" * 1000, "../../etc/passwd"):
            self.open(token)
            self.see("There is no such share. It may have been removed.")
            screen.key("Escape")
            self.application.wait_gone()
        self.assertEqual([("get", "unknown")], self.service.calls)

    def test_a_launch_without_a_token_shows_no_share(self):
        self.launch()
        self.see("There is no such share. It may have been removed.")
        self.picture("unknown")

    def test_withdrawn_and_expired_shares_cannot_be_fetched(self):
        for state, words, name in ((doubles.WITHDRAWN, WITHDRAWN, "withdrawn"), (doubles.EXPIRED, EXPIRED, "expired")):
            self.service.received = [doubles.received(TOKEN, ANN, state, FILES, expires=1_790_000_000)]
            self.open()
            self.see(words)
            self.see("holiday.jpg, 2.4 MB, Cannot be fetched any more", "button")
            self.assertIsNone(screen.find("Save all"))
            self.picture(name)
            screen.key("Escape")
            self.application.wait_gone()

    def test_an_unreachable_server_can_be_asked_again(self):
        files, self.service.received = self.service.received, []
        self.service.answer = doubles.UNREACHABLE
        self.open()
        self.see(UNREACHABLE)
        self.picture("unreachable")
        self.service.received, self.service.answer = files, 0
        self.press("Try again")
        self.see_share()

    def test_a_share_that_ends_while_it_is_looked_at_says_so(self):
        self.open()
        self.see("Save all", "button")
        self.service.received = [doubles.received(TOKEN, ANN, files=FILES, expires=int(time.time()) + 2)]
        self.service.change()
        self.see(EXPIRED)
        self.assertIsNone(screen.find("Save all"))

    def test_a_share_that_is_withdrawn_while_it_is_looked_at_says_so(self):
        self.open()
        self.see_share()
        self.service.received = [doubles.received(TOKEN, ANN, doubles.WITHDRAWN, FILES)]
        self.service.change()
        self.see(WITHDRAWN)

    def test_names_are_long_or_run_from_right_to_left(self):
        self.service.received = [doubles.received(TOKEN, "+971501234567", files=[
            ("ملف مهم جدا.pdf", 1_200_000, "application/pdf"), ("x" * 240 + ".jpg", 10**9, "image/jpeg")])]
        self.open()
        self.see("\u2068+971501234567\u2069 shared with you")
        self.see("ملف مهم جدا.pdf, 1.2 MB, Press to save", "button")
        self.picture("long-names")

    def test_two_shares_have_two_windows(self):
        self.service.received.append(doubles.received("second", "+447700900999"))
        self.open()
        self.see_share()
        self.open("second")
        self.see("\u2068+447700900999\u2069 shared with you")
        screen.wait_still()
        screen.key("Escape")
        self.see_share()


class SavingFiles(ViewerCase):
    def test_all_are_saved_one_after_the_other(self):
        self.open()
        self.press("Save all")
        for index, (name, size, _) in enumerate(FILES):
            self.service.wait_download()
            self.assertIn(("download", TOKEN, index, DOWNLOADS), self.service.calls)
            if index == 1:
                self.service.progress(size // 2, size)
                self.see("film.mp4, 80.0 MB, Being saved, \u206850 %\u2069", "button")
                self.see("song.ogg, 4.0 MB, Waits for its turn", "button")
                self.picture("saving")
            self.service.finish(0, f"{DOWNLOADS}/{name}")
        self.see("5 files were saved.")
        self.see("holiday.jpg, 2.4 MB, Saved. Press to open", "button")
        self.assertIsNone(screen.find("Save all"))
        self.picture("saved")

    def test_what_was_saved_stays_when_the_server_is_gone(self):
        self.open()
        self.press("Save all")
        self.service.wait_download()
        self.service.finish(0, f"{DOWNLOADS}/holiday.jpg")
        self.service.wait_download()
        self.service.finish(doubles.UNREACHABLE)
        self.see(UNREACHABLE + " 1 file was saved.")
        self.see("holiday.jpg, 2.4 MB, Saved. Press to open", "button")
        self.see("film.mp4, 80.0 MB, Press to save", "button")
        self.picture("server-gone")
        self.press("Save all")
        self.service.wait_download()
        self.assertEqual([0, 1, 1], [call[2] for call in self.service.calls if call[0] == "download"])

    def test_cancelling_keeps_what_is_complete(self):
        self.open()
        self.press("Save all")
        self.service.wait_download()
        self.service.finish(0, f"{DOWNLOADS}/holiday.jpg")
        self.service.wait_download()
        self.press("Cancel")
        world.wait_for(lambda: any(call[0] == "cancel" for call in self.service.calls), "the cancel")
        self.see("holiday.jpg, 2.4 MB, Saved. Press to open", "button")
        self.see("Save all", "button")
        self.see("1 file was saved.")

    def test_a_full_disk_and_a_withdrawal_while_saving_are_told_apart(self):
        self.open()
        self.press("Save all")
        self.service.wait_download()
        self.service.finish(doubles.NO_SPACE)
        self.see("There is no room left on this device. Make room and try again.")
        self.press("Save all")
        self.service.wait_download()
        self.service.finish(-43)
        self.see(WITHDRAWN)
        self.assertIsNone(screen.find("Save all"))

    def test_one_file_is_saved_and_opened_with_the_default_program(self):
        share = os.path.join(os.environ["XDG_DATA_HOME"], "applications")
        os.makedirs(share, exist_ok=True)
        os.makedirs(DOWNLOADS, exist_ok=True)
        opened = os.path.join(os.environ["PELLIKO_STATE"], "opened")
        with open(opened, "w", encoding="utf-8"):
            pass
        with open(os.path.join(share, "test-opener.desktop"), "w", encoding="utf-8") as file:
            file.write("[Desktop Entry]\nType=Application\nName=Opener\nMimeType=image/jpeg;\n"
                       f"Exec=sh -c 'echo \"$0\" >> {opened}' %f\n")
        with open(os.path.join(os.environ["XDG_CONFIG_HOME"], "mimeapps.list"), "w", encoding="utf-8") as file:
            file.write("[Default Applications]\nimage/jpeg=test-opener.desktop\n")
        saved = f"{DOWNLOADS}/holiday.jpg"
        with open(saved, "wb") as file:
            file.write(b"\xff\xd8\xff\xe0")
        self.open()
        self.press("holiday.jpg, 2.4 MB, Press to save")
        self.service.wait_download()
        self.service.finish(0, saved)
        follower = world.Follower(opened)
        self.press("holiday.jpg, 2.4 MB, Saved. Press to open")
        follower.wait(lambda lines: lines == [saved], "the default program")

    def test_it_is_told_when_no_program_opens_a_file(self):
        self.service.received = [doubles.received(TOKEN, ANN, files=[("thing.xyzzy", 3, "application/x-xyzzy")])]
        os.makedirs(DOWNLOADS, exist_ok=True)
        saved = f"{DOWNLOADS}/thing.xyzzy"
        with open(saved, "wb") as file:
            file.write(b"\0\1\2")
        self.open()
        self.press("thing.xyzzy, 3 B, Press to save")
        self.service.wait_download()
        self.service.finish(0, saved)
        self.press("thing.xyzzy, 3 B, Saved. Press to open")
        self.see("No program opens this kind of file. 1 file was saved.")
        presses.expect_both_look_pressed("thing.xyzzy, 3 B, Saved. Press to open")

    def test_the_keyboard_is_enough(self):
        self.open()
        self.see("Save all", "button")
        screen.wait_still()
        screen.key("Return")
        self.service.wait_download()
        self.see("Cancel", "button")
        screen.wait_still()
        screen.key("Return")
        self.see("Save all", "button")
        screen.wait_still()
        for name in ("Tab", "Tab", "Return"):
            screen.key(name)
        world.wait_for(lambda: [call[2] for call in self.service.calls if call[0] == "download"] == [0, 0],
                       "the first file to be saved by the keyboard")

    def test_who_sees_little_reaches_everything(self):
        self.enlarge()
        self.open()
        self.see("Save all", "button")
        screen.wait_active("pelliko-viewer")
        screen.wait_still()
        reach.expect_all_named_and_reached(self)
        self.language("ar_EG.UTF-8")
        self.addCleanup(self.language, "en_GB.UTF-8")
        self.see("حفظ الكل", "button")
        screen.wait_still()
        reach.expect_within(self, 480)
        self.picture("large-arabic")

    def test_it_speaks_german_and_changes_while_it_saves(self):
        self.open()
        self.press("Save all")
        self.service.wait_download()
        self.language("de_DE.UTF-8")
        self.addCleanup(self.language, "en_GB.UTF-8")
        self.see("Abbrechen", "button")
        self.see("\u2068Ann Example\u2069 hat etwas mit Ihnen geteilt")
        self.service.finish(0, f"{DOWNLOADS}/holiday.jpg")
        self.see("holiday.jpg, 2,4 MB, Gespeichert. Zum Öffnen drücken", "button")
        self.picture("german")


if __name__ == "__main__":
    unittest.main(verbosity=2)
