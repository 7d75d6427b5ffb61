"""What the tests of whole programs stand on: who has a name on the bus is told as it is, not as it was announced."""

import os
import signal
import subprocess
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "scripts", "lib"))
sys.dont_write_bytecode = True

import world  # noqa: E402

NAME = "com.velmora.pelliko.Nobody"
OWNER = f"""
from gi.repository import Gio, GLib
loop = GLib.MainLoop()
Gio.bus_own_name(Gio.BusType.SESSION, "{NAME}", 0, None, lambda *_: print("here", flush=True), lambda *_: loop.quit())
loop.run()
"""


class Names(unittest.TestCase):
    def setUp(self):
        self.name = world.BusName(NAME)
        self.program = subprocess.Popen([sys.executable, "-c", OWNER], stdout=subprocess.PIPE, text=True)
        self.addCleanup(self.program.communicate)
        self.addCleanup(self.program.kill)
        self.assertEqual("here\n", self.program.stdout.readline())  # without a turn of the loop, which would tell it

    def test_a_program_is_killed_whose_coming_was_not_announced_yet(self):
        self.assertTrue(self.name.kill())
        self.assertEqual(-signal.SIGKILL, self.program.wait())
        self.assertFalse(self.name.kill())

    def test_a_program_is_waited_for_whose_coming_was_not_announced_yet(self):
        self.assertTrue(self.name.here())
        with self.assertRaisesRegex(world.WorldError, f"{NAME} to leave the bus"):
            self.name.wait_gone(limit=0.2)


if __name__ == "__main__":
    unittest.main(verbosity=2)
