"""The confirmation popup as a person uses it who has a keyboard, a screen reader or another language."""

import os
import subprocess
import unittest

import share_case  # first: it knows where the next two are
import screen
import world

CHECK = "Share via Wi-Fi only"


class Popup(share_case.ShareCase):
    def open_popup(self, *names):
        people = [world.add_contact(name, f"+44 7700 900{100 + index}") for index, name in enumerate(names)]
        world.share([self.file("note.txt", b"note")], people)
        screen.wait_for_control("Share", "button")
        screen.wait_still()

    def labels(self):
        return [(name, role) for name, role, _extents, _enabled in screen.controls() if name]

    def wait_left(self):
        self.application.wait_gone()
        self.assertIn("No upload_data request id exist so app is exiting", self.log_lines())
        self.assertEqual([], self.messages(0))

    def test_the_back_key_closes_the_popup_while_a_reader_runs(self):
        self.open_popup("Ann Example")
        screen.key("Escape")
        self.wait_left()

    def test_the_keyboard_ticks_the_box_while_a_reader_runs(self):
        self.open_popup("Ann Example")
        screen.press(CHECK, "check box")
        screen.wait_seen(self.box_is_ticked, "the tick of the pointer")
        screen.press(CHECK, "check box")
        screen.wait_seen(lambda: not self.box_is_ticked(), "no tick")
        for _stop in range(4):
            screen.key("Tab")
            if self.box_has_focus():
                break
        self.assertTrue(self.box_has_focus())
        screen.key("space")
        screen.wait_seen(self.box_is_ticked, "the tick of the keyboard")
        screen.key("Escape")
        self.wait_left()

    def test_only_the_check_box_carries_the_name_of_the_row(self):
        self.open_popup("Ann Example", "Bo Example")
        self.assertEqual(["check box"], [role for name, role in self.labels() if name == CHECK])
        self.assertIn("Recipients (2)", [name for name, _role in self.labels()])
        screen.key("Escape")
        self.wait_left()

    def test_a_language_set_by_another_program_changes_every_text(self):
        self.open_popup("Ann Example")
        self.set_language("de_DE.UTF-8")
        screen.wait_for_control("Teilen", "button")
        self.picture("german")
        names = [name for name, _role in self.labels()]
        for text in ("Alert, Dateien über Pelliko teilen", "Abbrechen", "Nur über WLAN teilen"):
            self.assertIn(text, names)
        self.assertTrue([name for name in names if "Nur über\u00a0WLAN teilen, um" in name], names)
        for text in ("Alert, Share files via Pelliko", "Cancel", "Share", CHECK):
            self.assertNotIn(text, names)
        screen.press("Abbrechen", "button")
        self.wait_left()

    # --- steps ---

    def set_language(self, language):
        setter = os.path.join(os.environ["PELLIKO_BUILD"], "tests", "key-setter")
        subprocess.run([setter, "--text", "db/menu_widget/language", language], check=True)
        if language != "en_GB.UTF-8":
            self.addCleanup(self.set_language, "en_GB.UTF-8")

    @staticmethod
    def box_states():
        for node in screen.nodes():
            if node.getRoleName() == "check box" and node.name == CHECK:
                return node.getState()
        return None

    def box_is_ticked(self):
        states = self.box_states()
        return states is not None and states.contains(screen.pyatspi.STATE_CHECKED)

    def box_has_focus(self):
        screen.wait_still()
        states = self.box_states()
        return states is not None and states.contains(screen.pyatspi.STATE_FOCUSED)


if __name__ == "__main__":
    unittest.main(verbosity=2)
