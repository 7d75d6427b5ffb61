"""A person without an account shares: the sign-in program opens, and the share goes on after it or ends with it. Answers
that the program does not give are in sign_in_answers_test.py."""

import json
import os
import unittest

import share_case  # first: it knows where the next two are
import screen
import world

SERVER_DATA = os.path.join(os.environ["PELLIKO_STATE"], "server")
ACCOUNT = os.path.join(os.environ["XDG_CONFIG_HOME"], "pelliko", "account.json")
NUMBER = "+4915112345678"


class SignInProgram(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        os.remove(ACCOUNT)
        # The service runs before there is an account and is not told that one came.
        self.requests_before = len(world.requests())
        self.person = world.add_contact("Ann Example", "+44 7700 900123")
        world.share([self.file("note.txt", b"note")], [self.person])
        screen.wait_active("korrin")

    def test_the_share_goes_on_after_the_sign_in(self):
        code = world.run("pelliko-server", "account", "invite", "--data", SERVER_DATA).strip()
        screen.type_into("Your phone number", NUMBER)
        screen.type_into("Invitation code", code)
        self.picture("form")
        screen.press("Sign in", "button")
        self.confirm()
        message = self.messages(1)[0]
        self.assert_downloads_equal(message, {"note.txt": b"note"})
        self.wait_sent_and_gone()
        with open(ACCOUNT, encoding="utf-8") as file:
            account = json.load(file)
        self.assertEqual(NUMBER, account["number"])
        shares = world.run("curl", "-sSf", "-H", f"Authorization: Bearer {account['token']}",
                           os.environ["PELLIKO_SERVER_URL"] + "/api/v1/shares")
        self.assertEqual(1, len(json.loads(shares)["shares"]), "the share is the new account's")
        os.remove(ACCOUNT)
        world.run("pelliko-server", "account", "remove", "--data", SERVER_DATA, "--number", NUMBER)
        self.restore()

    def test_a_cancelled_sign_in_ends_the_share(self):
        screen.key("Escape")
        self.application.wait_gone()
        self.assertEqual(["Not supported result : -2", "Exit App!!!",
                          "No upload_data request id exist so app is exiting"], self.log_lines()[-3:])
        self.assertEqual([], self.posted())
        self.assertEqual([], self.messages(0))
        self.assertEqual(self.requests_before, len(world.requests()))
        self.assertFalse(os.path.exists(ACCOUNT))
        self.restore()

    @staticmethod
    def restore():
        """Each case of this world begins with an account file to remove."""
        os.makedirs(os.path.dirname(ACCOUNT), exist_ok=True)
        with open(ACCOUNT, "w", encoding="utf-8") as file:
            file.write("{}")


if __name__ == "__main__":
    unittest.main(verbosity=2)
