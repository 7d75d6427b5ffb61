"""The history with every state that a share can have, what it asks of the service, and what it launches."""

import os
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "common"))

import companion_case  # noqa: E402
import doubles  # noqa: E402
import reach  # noqa: E402
import screen  # noqa: E402
import world  # noqa: E402

END = 4_102_444_800  # 2100-01-01
ANN, BO, CEM = "+447700900123", "+447700900456", "+447700900789"


class HistoryCase(companion_case.CompanionCase):
    program = "com.velmora.pelliko-history"

    @classmethod
    def setUpClass(cls):
        cls.ann = world.add_contact("Ann Example", "+44 7700 900123")
        cls.bo = world.add_contact("Bo Example", "+44 7700 900456")

    def setUp(self):
        super().setUp()
        self.service = doubles.SharesService()
        self.addCleanup(self.service.close)

    def available(self, number=7):
        return doubles.sent(number, doubles.AVAILABLE, [(ANN, self.ann, doubles.PUSH), (CEM, 0, doubles.SMS)],
                            files=(("photo.jpg", 2_400_000, "image/jpeg"), ("notes.txt", 600, "text/plain")),
                            expires=END)

    def row(self, start):
        """The name of the row that begins so, once it shows."""
        return screen.wait_for_row(start, "button")

    def open_row(self, start):
        self.press(self.row(start))

    def wait_call(self, call):
        world.wait_for(lambda: call in self.service.calls, f"the call {call}")


class States(HistoryCase):
    def test_an_empty_history_says_what_will_be_there(self):
        self.launch()
        self.see("You have not shared anything yet. Share pictures, files or texts from other applications, "
                 "and they are listed here for 30 days.")
        self.picture("empty")
        self.press("Received")
        self.see("Nobody has shared anything with you yet. What others share with your phone number is listed here.")
        self.picture("empty-received")

    def test_each_state_is_told_in_words(self):
        one = [(ANN, self.ann, doubles.SMS)]
        states = [
            (doubles.sent(1, doubles.UPLOADING, one, percent=42), "Sending, \u206842 %\u2069"),
            (doubles.sent(2, doubles.PAUSED, one), "Paused: waits for a connection"),
            (doubles.sent(3, doubles.NOTIFYING, one), "Telling the recipients"),
            (doubles.sent(4, doubles.WITHDRAWING, one), "Being withdrawn, as soon as the server can be reached"),
            (doubles.sent(5, doubles.WITHDRAWN, one), "Withdrawn"),
            (doubles.sent(6, doubles.CANCELLED, one), "Cancelled"),
            (doubles.sent(7, doubles.FAILED, one, error=-16), "Failed: the server had an error"),
            (doubles.sent(8, doubles.FAILED, one, error=-5), "Failed: this device had an error"),
            (doubles.sent(9, doubles.EXPIRED, one, expires=1_790_000_000), "Expired on "),
            (doubles.sent(10, doubles.AVAILABLE, one, expires=END), "Available until ")]
        for chunk in (states[:5], states[5:]):
            self.service.sent = [share for share, _ in chunk]
            self.launch()
            self.service.change()
            for _, words in chunk:
                self.row("Ann Example, 1 file, 2.4 MB, " + words)
            self.picture(f"states-{len(chunk)}-{chunk[0][0]['id'].unpack()}")

    def test_the_list_follows_the_service(self):
        one = [(ANN, self.ann, doubles.SMS)]
        self.service.sent = [doubles.sent(1, doubles.UPLOADING, one, percent=1)]
        self.launch()
        self.row("Ann Example, 1 file, 2.4 MB, Sending, \u20681 %")
        self.service.sent = [doubles.sent(1, doubles.UPLOADING, one, percent=80)]
        self.service.change()
        self.row("Ann Example, 1 file, 2.4 MB, Sending, \u206880 %")
        self.service.sent = [doubles.sent(2, doubles.UPLOADING, [(BO, self.bo, doubles.SMS)]),
                             doubles.sent(1, doubles.AVAILABLE, one, expires=END)]
        self.service.change()
        self.row("Bo Example, ")
        self.row("Ann Example, 1 file, 2.4 MB, Available until")

    def test_two_hundred_shares_come_in_portions(self):
        self.service.sent = [doubles.sent(n, doubles.WITHDRAWN, [(f"+4915{n:09}", 0, doubles.SMS)])
                             for n in range(200, 0, -1)]
        self.launch()
        self.row("+4915000000200, ")
        names = [node.name for node in screen.nodes()]  # also those that only scrolling shows
        self.assertEqual(50, sum(name.startswith("+4915") for name in names))
        self.assertIn("Show more", names)

    def test_long_names_and_right_to_left_ones_keep_their_place(self):
        arabic = world.add_contact("ليلى العربية", "+971501234567")
        self.service.sent = [
            doubles.sent(1, doubles.AVAILABLE, [("+971501234567", arabic, doubles.PUSH)], expires=END),
            doubles.sent(2, doubles.AVAILABLE, [(f"+4915100000{n:03}", 0, doubles.SMS) for n in range(60)],
                         files=[("x" * 200 + ".jpg", 10**9, "image/jpeg")] * 100, expires=END)]
        self.launch()
        self.row("ليلى العربية, 1 file")
        self.picture("long-names")
        self.open_row("+4915100000000, +4915100000001")
        self.see("Recipients")
        self.picture("long-share")


class Actions(HistoryCase):
    def test_withdrawing_asks_first(self):
        self.service.sent = [self.available()]
        self.launch()
        self.open_row("Ann Example")
        self.see(ANN + ", Sees it in Pelliko")
        self.picture("share")
        self.press("Withdraw")
        self.see("Withdraw this share? Its link ends for everybody. Files that somebody has saved already stay with "
                 "them.")
        self.picture("withdraw-question")
        screen.key("Return")  # whoever does not read changes nothing
        self.see("Share again", "button")
        self.assertEqual([], self.service.calls)
        self.press("Withdraw")
        self.see("No, go back", "button")
        self.press("Withdraw")
        self.wait_call(("withdraw", 7))
        self.service.sent = [doubles.sent(7, doubles.WITHDRAWN, [(ANN, self.ann, doubles.PUSH)])]
        self.service.change()
        self.see("Withdrawn")
        self.wait_away("Withdraw")
        self.picture("withdrawn")

    def test_a_refused_withdrawal_is_told(self):
        self.service.sent = [self.available()]
        self.service.answer = doubles.NOT_FOUND
        self.launch()
        self.open_row("Ann Example")
        self.press("Withdraw")
        self.see("No, go back", "button")
        self.press("Withdraw")
        self.see("This share is not there any more.")

    def test_forgetting_takes_it_off_the_list(self):
        self.service.sent = [self.available()]
        self.launch()
        self.open_row("Ann Example")
        self.press("Remove from the list")
        self.see("Remove this share from the list? Its link stays until its end date, and you can no longer withdraw "
                 "it.")
        self.press("Remove")
        self.wait_call(("forget", 7))
        self.service.sent = []
        self.service.change()
        self.see("You have not shared anything yet. Share pictures, files or texts from other applications, "
                 "and they are listed here for 30 days.")

    def test_sharing_again_asks_for_people(self):
        picker = doubles.Application("com.velmora.pelliko-picker")
        self.addCleanup(picker.close)
        self.service.sent = [self.available()]
        self.launch()
        self.open_row("Ann Example")
        self.press("Share again")
        request = picker.wait_request()
        self.assertEqual("http://tizen.org/appcontrol/operation/share", request["operation"])
        self.assertEqual({"pk_reshare": "7"}, request["extras"])

    def test_a_received_share_opens_in_the_viewer(self):
        viewer = doubles.Application("com.velmora.pelliko-viewer")
        self.addCleanup(viewer.close)
        self.service.received = [doubles.received("AbC_-123", ANN), doubles.received("second", CEM)]
        self.launch("view", "--extra", "view_type=received", "--extra", "remoteShare=remoteview")
        self.row(CEM + ", 1 file")
        self.picture("received")
        self.open_row("Ann Example, 1 file")
        self.press("Open")
        request = viewer.wait_request()
        self.assertEqual("http://tizen.org/appcontrol/operation/launch_viewer", request["operation"])
        self.assertEqual({"contents_token": "AbC_-123", "share_type": "single_share"}, request["extras"])
        self.picture("received-share")


class Launches(HistoryCase):
    def test_a_forwarded_push_marks_what_is_new(self):
        self.service.received = [doubles.received("old", ANN)]
        self.launch("view", "--extra", "view_type=received")
        self.row("Ann Example, 1 file")
        self.service.received.insert(0, doubles.received("fresh", BO))
        self.launch("send", "--extra-array", "contents_token_list=fresh")
        self.row("Bo Example, 1 file, 2.4 MB, New: ")
        self.picture("new")

    def test_notices_of_finished_shares_leave_the_user_where_he_is(self):
        self.service.received = [doubles.received("old", ANN)]
        self.launch("view", "--extra", "view_type=received")
        self.row("Ann Example, 1 file")
        for operation, number in (("shared", 7), ("reshared", 8)):
            self.service.sent.insert(0, self.available(number))
            self.launch(operation, "--extra", f"request_id={number}")
        self.row("Ann Example, 1 file")
        self.press("Sent")
        screen.wait_seen(lambda: sum("New: " in name for name, _, _, _ in screen.controls()) == 2, "two new rows")

    def test_it_speaks_german_and_changes_while_it_is_open(self):
        self.service.sent = [self.available()]
        self.launch()
        self.open_row("Ann Example")
        self.see("Withdraw", "button")
        self.language("de_DE.UTF-8")
        self.addCleanup(self.language, "en_GB.UTF-8")
        self.see("Zurückziehen", "button")
        self.see(ANN + ", Sieht es in Pelliko")
        self.picture("german")

    def test_who_sees_little_reaches_everything(self):
        self.service.sent = [self.available(), doubles.sent(8, doubles.PAUSED, [(BO, self.bo, doubles.SMS)])]
        self.enlarge()
        self.launch()
        self.row("Bo Example")
        screen.wait_active("pelliko-history")
        screen.wait_still()
        reach.expect_all_named_and_reached(self)
        reach.expect_within(self, 480)
        self.language("ar_EG.UTF-8")
        self.addCleanup(self.language, "en_GB.UTF-8")
        self.see("المرسلة، معروضة", "button")
        screen.wait_still()
        reach.expect_mirrored(self)
        reach.expect_within(self, 480)
        self.picture("large-arabic")
        self.open_row("Ann Example")
        self.see("سحب", "button")
        screen.wait_still()
        reach.expect_all_named_and_reached(self)
        self.picture("large-arabic-share")

    def test_the_keyboard_is_enough(self):
        self.service.sent = [self.available()]
        self.launch()
        self.row("Ann Example")
        screen.wait_still()
        for name in ("Tab", "Tab", "Return"):
            screen.key(name)
        self.see("Withdraw", "button")
        screen.wait_still()
        screen.key("Escape")
        self.row("Ann Example")
        screen.wait_still()
        screen.key("Escape")
        self.application.wait_gone()


if __name__ == "__main__":
    unittest.main(verbosity=2)
