"""The status popup of an upload: a tap on its notification, the bar, the cancel button, the end."""

import os
import subprocess
import unittest

import share_case  # first: it knows where the next two are
import screen
import world

SLOW = "1000000"  # bytes a second
STORE = os.path.join(os.environ["PELLIKO_STATE"], "server")


def stored_bytes():
    return int(subprocess.check_output(["du", "-sb", STORE], text=True).split()[0])


class Status(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE=SLOW)
        self.log = world.Follower(world.APP_LOG)  # every report wakes a wait
        self.log.read()

    def test_a_tapped_upload_is_followed_and_taken_back(self):
        before = stored_bytes()
        request = self.start_slow("long film.mp4", 40_000_000)
        self.tap(request)
        self.wait_shown("Sending…")
        self.assertIn("Ann Example", self.shown())
        first = self.bar_value()
        screen.wait_seen(lambda: self.bar_value() > first + 0.02, "the bar to move")
        self.picture("sending")

        world.run("velmora-log", "clear")
        screen.press("Cancel", "button")
        self.wait_shown("Sending has been cancelled.")
        self.picture("cancelled")
        self.assertIsNone(screen.find("Cancel", "button"))
        self.assertEqual("cancelled", world.requests()[-1]["state"])
        self.assertLess(stored_bytes() - before, 1_000_000, "the server has dropped the bytes")
        self.assertEqual([], [n for n in world.notifications() if n["tag"] == str(request)])
        self.assertEqual([], self.pending_rows())
        self.assertEqual(1, world.run("velmora-log", "show", "--json").count('"PK08"'))

        self.assertTrue(self.application.here(), "an open popup keeps the application")
        screen.press("OK", "button")
        self.application.wait_gone()
        self.assertEqual([], self.messages(0))

    def test_a_popup_that_stays_open_sees_the_share_to_its_end(self):
        request = self.start_slow("song.mp3", 6_000_000)
        self.tap(request)
        self.wait_shown("Sending…")
        self.set_language("de_DE.UTF-8")
        screen.wait_for_control("Abbrechen", "button")
        self.assertIn("Wird gesendet …", self.shown())
        self.set_language("en_GB.UTF-8")
        self.wait_shown("Files sent")
        self.messages(1)
        self.assertIsNone(screen.find("Cancel", "button"))
        self.assertTrue(self.application.here())
        screen.press("OK", "button")
        self.application.wait_gone()

    def test_ok_leaves_the_upload_alone(self):
        request = self.start_slow("song.mp3", 6_000_000)
        self.tap(request)
        self.wait_shown("Sending…")
        screen.press("OK", "button")
        self.log.wait(lambda lines: any("Exit app" in line or "waiting for sending SMS" in line
                                        for line in lines), "the end of the share")
        self.wait_sent_and_gone()
        self.messages(1)

    def test_a_sent_share_is_shown_by_a_new_process(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        world.share([self.file("a.jpg", share_case.random_bytes(1_572_864))], [self.ann()])
        self.confirm()
        sent = self.wait_sent_and_gone()
        self.messages(1)
        self.tap(sent["tag"])
        self.wait_shown("Files sent")
        self.assertIn("Ann Example", self.shown())
        screen.press("OK", "button")
        self.application.wait_gone()
        self.assertEqual([], [n for n in world.notifications() if n["tag"] == sent["tag"]])

    def test_two_taps_in_a_row_for_an_upload_that_nobody_knows(self):
        extras = {"recipient_count": "1", "recipient_list": "Ann Example+SMS?", "recipient_index_list": "4711?",
                  "total_files": "3", "total_size": "5242880", "upload_request_id": "4000000000"}
        for state in ("3", "42", "7", "8"):
            options = [word for key, value in {**extras, "upload_status": state}.items()
                       for word in ("--extra", f"{key}={value}")]
            world.launch("uploading_noti_pressed", *options)
            screen.wait_for_control("OK", "button")
            world.launch("uploading_noti_pressed", *options)
        self.wait_shown("A server error has occurred while sending files.")
        screen.press("OK", "button")
        self.application.wait_gone()

    # --- steps ---

    @staticmethod
    def ann():
        return world.add_contact("Ann Example", "+44 7700 900123")

    def start_slow(self, name, size):
        """Shares a file and returns its request's id once the notification's bar moves."""
        world.share([self.file(name, share_case.random_bytes(size))], [self.ann()])
        self.confirm()
        world.wait_for(lambda: any(i["progress"] > 0 for i in self.posted(event="update")), "some progress")
        return world.requests()[-1]["id"]

    def tap(self, request):
        world.run("quickpanel-tool", "tap", "--app", world.APP, str(request))
        screen.wait_for_control("OK", "button")

    @staticmethod
    def shown():
        return [name for name, _role, _extents, _enabled in screen.controls() if name]

    def wait_shown(self, text):
        screen.wait_seen(lambda: text in self.shown(), f"“{text}”")

    @staticmethod
    def bar_value():
        for node in screen.nodes():
            if node.getRoleName() == "progress bar":
                return node.queryValue().currentValue
        return None

    def set_language(self, language):
        setter = os.path.join(os.environ["PELLIKO_BUILD"], "tests", "key-setter")
        subprocess.run([setter, "--text", "db/menu_widget/language", language], check=True)
        if language != "en_GB.UTF-8":
            self.addCleanup(self.set_language, "en_GB.UTF-8")


if __name__ == "__main__":
    unittest.main(verbosity=2)
