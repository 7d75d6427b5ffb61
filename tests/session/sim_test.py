"""The SIM of the phone: which country the sender is in, and what happens while there is none to be read."""

import os
import signal
import subprocess
import sys
import unittest

import share_case
import world

PHONE = [sys.executable, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "scripts", "lib",
                                      "phonesim.py"), "tell", os.environ["PELLIKO_PHONE"]]


def phone(*command):
    """Has the simulated phone do something; returns once it is done."""
    subprocess.run([*PHONE, *command], check=True, timeout=world.LIMIT)


class Sim(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        phone("reset")
        self.log = world.Follower(world.APP_LOG)
        self.log.read()
        self.lines_before = len(self.log.lines)

    def tearDown(self):
        super().tearDown()
        if self.application.here():
            os.kill(self.application.process_id(), signal.SIGTERM)
            self.application.wait_gone()

    def start(self):
        """A start that does nothing else and stays."""
        world.launch("unheard_of")
        self.application.wait_here()

    def about_the_sim(self):
        """What the application says of telephony, since the case began."""
        beginnings = ("SIM index", "tapi_ready_state", "tel ", "tel_", "index = ", "_getCcc", "sender_ccc",
                      "Dual-sim", "account_country_code")
        return [text for text in (line.split(") > ", 1)[-1] for line in self.log.read()[self.lines_before:])
                if text.startswith(beginnings)]

    def wait_said(self, *texts):
        self.log.wait(lambda _: len(self.about_the_sim()) >= len(texts), f"the lines {texts}")
        self.assertEqual(list(texts), self.about_the_sim())

    def test_a_sim_is_read_at_the_start(self):
        self.start()
        self.wait_said("SIM index = 0")

    def test_a_phone_that_is_switched_on_later_is_read_then(self):
        phone("power", "1", "off")
        self.start()
        self.wait_said("tapi_ready_state isn't yet ready !!")
        phone("power", "1", "on")
        self.wait_said("tapi_ready_state isn't yet ready !!", "tel status[1]", "index = 0")

    def test_a_phone_that_is_switched_off_and_on_is_read_again(self):
        phone("power", "1", "off")
        self.start()
        phone("power", "1", "on")
        said = ["tapi_ready_state isn't yet ready !!", "tel status[1]", "index = 0"]
        self.wait_said(*said)
        phone("power", "1", "off")
        self.wait_said(*said, "tel status[0]")
        phone("power", "1", "on")
        self.wait_said(*said, "tel status[0]", "tel status[1]", "index = 0", "sender_ccc already exist !!")

    def test_a_locked_sim_is_read_once_its_pin_was_entered(self):
        phone("power", "1", "off")
        phone("sim", "1", "locked")
        phone("power", "1", "on")
        self.start()
        self.wait_said("tapi_ready_state isn't yet ready !!")
        phone("enter-pin", "1", "1234")
        self.wait_said("tapi_ready_state isn't yet ready !!", "tel status[1]", "index = 0")

    def test_a_share_of_a_phone_with_a_sim_names_the_country(self):
        ids = [world.add_contact("Di Example", "0151 23456789")]
        world.share([self.file("note.txt", b"text")], ids)
        self.confirm()
        self.wait_sent_and_gone()
        self.assertTrue(self.messages(1)[0]["to"].endswith("15123456789"))
        self.assertEqual(["SIM index = 0", "SIM index = 0"], self.about_the_sim())

    def test_a_sim_of_an_unknown_country_sends_without_a_country_code(self):
        phone("power", "1", "off")
        phone("sim", "1", "999011234567890")
        phone("power", "1", "on")
        world.share([self.file("note.txt", b"text")], [world.add_contact("Ed Example", "+49 151 23456780")])
        self.confirm()
        self.wait_sent_and_gone()
        self.assertEqual(["SIM index = 0", "account_country_code is NULL !!", "sender_ccc is NULL !!",
                          "SIM index = 0"], self.about_the_sim())


if __name__ == "__main__":
    unittest.main(verbosity=2)
