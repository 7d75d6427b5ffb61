"""What others share with the user: from the share server's push to the panel, and what is left of it when the
service is switched off or the account is gone. The world has one account, so the user shares with herself."""

import os
import signal
import unittest

import share_case
import screen
import world

from gi.repository import Gio, GLib

OWN_NUMBER = "+447700900100"
TAG = "PUSH_NOTI"


def received():
    """The tokens of the received shares, newest first."""
    bus = Gio.bus_get_sync(Gio.BusType.SESSION)
    shares = bus.call_sync(world.SERVICE, "/com/velmora/pelliko/Service", "com.velmora.pelliko.Shares1", "ListReceived",
                           None, None, Gio.DBusCallFlags.NONE, int(world.LIMIT * 1000)).unpack()[0]
    return [share["token"] for share in shares]


def send(tokens, **options):
    words = [word for token in tokens for word in ("--extra-array", f"contents_token_list={token}")]
    return world.launch("send", *words, **options)


class Push(share_case.ShareCase):
    me = None

    def setUp(self):
        super().setUp()
        world.run("velmora-log", "clear")
        self.log = world.Follower(world.APP_LOG)
        self.log.read()
        self.lines_before = len(self.log.lines)
        if Push.me is None:
            Push.me = world.add_contact("Ida Example", OWN_NUMBER, joined=True)

    def tearDown(self):
        if self.application.here():
            os.kill(self.application.process_id(), signal.SIGTERM)
            self.application.wait_gone()
        if self.shown():
            world.run("quickpanel-tool", "swipe", "--app", world.APP, TAG)
        super().tearDown()

    def said(self):
        return [line.split(") > ", 1)[-1] for line in self.log.read()[self.lines_before:]]

    def arrived(self):
        return [item for item in self.panel.items if item["event"] == "post" and item["tag"] == TAG]

    def wait_arrived(self, count=1):
        return world.wait_for(lambda: len(self.arrived()) >= count and self.arrived()[-1], "the received share")

    @staticmethod
    def shown():
        return [item for item in world.notifications() if item["tag"] == TAG]

    def tokens(self, count):
        """So many shares to oneself that have arrived before."""
        while len(received()) < count:
            before = len(self.arrived())
            name = f"to-me-{len(received())}.jpg"
            world.share([self.file(name, share_case.random_bytes(500))], [self.me])
            self.confirm()
            self.wait_arrived(before + 1)
            self.application.wait_gone()
        return received()[:count]

    def test_a_share_to_oneself_arrives(self):
        files = [self.file(f"{i}.jpg", share_case.random_bytes(500 + i)) for i in range(3)]
        world.share(files, [self.me])
        self.confirm()
        noti = self.wait_arrived()
        self.assertEqual("Ida Example", noti["title"])
        self.assertEqual("Files shared with you: 3", noti["content"])
        self.application.wait_gone()
        self.picture("single")
        self.assertIn("get shared token list info success", self.said())
        self.assertIn("thumbnails_count = 3", self.said())
        self.assertIn("write pipe success", self.said())
        self.messages(0)

    def test_the_trace_and_the_usage_of_three_at_once(self):
        tokens = self.tokens(3)
        self.lines_before = len(self.log.read())
        before = len(self.arrived())
        world.run("velmora-log", "clear")
        send(tokens)
        noti = self.wait_arrived(before + 1)
        self.application.wait_gone()
        self.picture("several")
        self.assertEqual("New shared files", noti["title"])
        self.assertEqual("Ida Example", noti["content"])
        said = self.said()
        expected = ["Push message received !!",
                    "type: 0, feature: PK10 [Pelliko_Receive_notification], extra: (null), value: (null)",
                    "token_length = 3", "reset noti backup count = 3", "get shared token list info success",
                    "History app is NOT running", "Push notification."]
        self.assertEqual(expected, [line for line in said if line in expected])
        self.assertEqual(["PK10"], [world.json.loads(line)["feature"]
                                    for line in world.run("velmora-log", "show", "--json").splitlines()])

    def test_a_push_while_the_popup_is_open_leaves_it_alone(self):
        tokens = self.tokens(1)
        before = len(self.arrived())
        world.share([self.file("a.jpg", share_case.random_bytes(500))], [self.me])
        screen.wait_for_control("Share", "button")
        send(tokens)
        self.wait_arrived(before + 1)
        self.log.wait(lambda _: "Popup is open.. can't exit" in self.said(), "the exit rule")
        screen.press("Cancel", "button")
        self.application.wait_gone()

    def test_a_push_while_the_service_is_not_running(self):
        tokens = self.tokens(1)
        before = len(self.arrived())
        world.stop_service()
        send(tokens)
        self.assertEqual("Ida Example", self.wait_arrived(before + 1)["title"])
        self.application.wait_gone()

    def test_tokens_that_nobody_knows_end_the_application(self):
        send(["x" * 1000, "unheard-of"])
        self.wait_arrived()
        self.application.wait_gone()
        self.assertEqual(2, self.said().count("get thumbnails_count error!! error_code = -2")
                         + self.said().count("get thumbnails_count error!! error_code = -22"))

    def test_shares_outlive_a_time_without_the_service(self):
        tokens = self.tokens(2)
        before = len(self.arrived())
        send(tokens)
        self.wait_arrived(before + 1)
        self.application.wait_gone()
        world.launch("service_off")
        self.application.wait_gone()
        self.assertEqual([], self.shown())
        self.assertIn("Noti exist, backuped_count=2", self.said())
        world.launch("service_on")
        self.assertEqual("New shared files", self.wait_arrived(before + 2)["title"])
        self.application.wait_gone()
        self.assertIn("noti restored", self.said())

    def test_without_a_shown_share_nothing_outlives(self):
        world.launch("service_off")
        self.application.wait_gone()
        world.launch("service_on")
        self.application.wait_gone()
        self.assertIn("backuped_count=0", self.said())
        self.assertNotIn("noti restored", self.said())
        self.assertEqual([], self.shown())

    def test_switching_off_right_behind_a_push_announces_nothing_after_it(self):
        tokens = self.tokens(1)
        if self.shown():
            world.run("quickpanel-tool", "swipe", "--app", world.APP, TAG)
        send(tokens)
        world.launch("service_off")
        self.application.wait_gone()
        self.assertEqual([], self.shown())

    def test_the_account_goes_with_everything(self):
        tokens = self.tokens(1)
        before = len(self.arrived())
        thumbnails = "/opt/usr/apps/com.velmora.pelliko/shared/data/thumbnail"
        os.makedirs(thumbnails, exist_ok=True)
        send(tokens)
        self.wait_arrived(before + 1)
        self.application.wait_gone()
        world.launch("deregistered")
        self.application.wait_gone()
        self.assertEqual([], [item for item in world.notifications() if item["app"] == world.APP])
        self.assertIn("Database file deleted successfully...!!!", self.said())
        self.assertFalse(os.path.exists(thumbnails))
        self.assertFalse(os.path.exists("/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db"))
        world.launch("service_on")
        self.application.wait_gone()
        self.assertIn("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED", self.said())


if __name__ == "__main__":
    unittest.main(verbosity=2)
