"""On a phone with a modem the SMS of a share go through the modem service, or fail where it says so."""

import os
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


class Modem(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        phone("reset")

    def share_one_file(self, *names_and_numbers):
        ids = [world.add_contact(name, number) for name, number in names_and_numbers]
        self.data = share_case.random_bytes(20_000)
        world.share([self.file("letter.pdf", self.data)], ids)
        self.confirm()
        self.wait_sent_and_gone()

    def test_every_recipient_gets_a_message_over_the_air(self):
        self.share_one_file(("Ann Example", "+44 7700 900123"), ("Bo Example", "+49 151 23456789"))
        messages = self.messages(2)
        self.assertEqual(["+447700900123", "+4915123456789"], [m["to"] for m in messages])
        for message in messages:
            self.assertEqual(1, message["sim"])
            self.assert_downloads_equal(message, {"letter.pdf": self.data})
        phone("wait-message", "1", "2")

    def test_a_network_that_refuses_is_told_in_the_log(self):
        phone("refuse", "1")
        self.share_one_file(("Cy Example", "+44 7700 900789"))
        self.assertTrue([line for line in self.log_lines() if "msg_sms_send_message Failed" in line])
        self.assertEqual([], self.outbox.read()[self.messages_before:])


if __name__ == "__main__":
    unittest.main(verbosity=2)
