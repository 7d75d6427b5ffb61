"""Two people with a phone each and one share server: somebody who has joined gets a push, everybody else an SMS.

This file is the ground that both phones stand on; each phone is a private world of its own, played by
two_users_sender.py and two_users_receiver.py. They know of each other only what is said here.
"""

import json
import os
import subprocess
import sys
import tempfile
import unittest

HERE = os.path.dirname(os.path.abspath(__file__))
TOP = os.path.dirname(os.path.dirname(HERE))
BUILD = sys.argv.pop(1)


class Phone:
    """A world whose play prints one JSON object per line and goes on when it reads one."""

    def __init__(self, play, *options):
        self.play = play
        self.process = subprocess.Popen(
            [os.path.join(TOP, "scripts", "session"), "--build", BUILD, *options, "--",
             "/usr/bin/python3", "-u", os.path.join(HERE, play)],
            stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True)

    def says(self, key):
        """The next thing that the phone tells; it must be about `key`."""
        line = self.process.stdout.readline()
        if not line:
            raise AssertionError(f"{self.play} ended before it told “{key}”")
        return json.loads(line)[key]

    def tell(self, **facts):
        self.process.stdin.write(json.dumps(facts) + "\n")
        self.process.stdin.flush()

    def end(self):
        if self.process.stdin and not self.process.stdin.closed:
            self.process.stdin.close()
        self.process.stdout.close()
        return self.process.wait()


class TwoUsers(unittest.TestCase):
    def test_who_has_joined_gets_a_push_and_everybody_else_a_link(self):
        subprocess.run([os.path.join(TOP, "tests", "browser", "run"), BUILD], check=True)
        with tempfile.TemporaryDirectory() as between:
            sender = Phone("two_users_sender.py", "--offer-server", between)
            self.addCleanup(sender.end)
            token = sender.says("token")
            receiver = Phone("two_users_receiver.py", "--server-from", between)
            self.addCleanup(receiver.end)
            receiver.tell(token=token)
            self.assertEqual("waiting", receiver.says("state"))
            sender.tell(receiver="waiting")

            shared = sender.says("files")
            self.assertEqual(["+12025550142"], sender.says("messages"), "only who has not joined needs an SMS")
            self.assertEqual(shared, sender.says("downloaded"), "what the link of the SMS gives in a browser")
            self.assertEqual(shared, receiver.says("saved"), "what the viewer saved")
            self.assertTrue(sender.says("history"))
            self.assertEqual(0, sender.end())
            self.assertEqual(0, receiver.end())


if __name__ == "__main__":
    unittest.main(verbosity=2)
