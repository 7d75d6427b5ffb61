"""The ground under the tests of companions: a person in front of one program, in a private world."""

import os
import subprocess
import sys
import unittest

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, os.path.join(HERE, "..", "..", "..", "scripts", "lib"))
sys.dont_write_bytecode = True

import screen  # noqa: E402
import world  # noqa: E402

SEEN = os.path.join(os.environ["PELLIKO_BUILD"], "seen")
SETTER = os.path.join(os.environ["PELLIKO_BUILD"], "tests", "key-setter")


class CompanionCase(unittest.TestCase):
    """A case with one program, which is gone after it."""

    program = None  # the bus name, set by the tests

    def setUp(self):
        screen.announce_reader()
        if "ELM_SCALE" in os.environ:  # a finer display than the bus was started for
            world.activation_environment(ELM_SCALE=os.environ["ELM_SCALE"])
        self.application = world.BusName(self.program)
        self.addCleanup(self._end)

    def _end(self):
        if not all(case is not self for case, _ in self._outcome.result.failures + self._outcome.result.errors):
            self.picture(self._testMethodName)
        self.application.kill()

    def launch(self, operation="default", *options):
        return world.launch(operation, *options, app=self.program)

    @staticmethod
    def press(label, role="button"):
        screen.wait_for_control(label, role)
        screen.wait_still(0.2)  # words that come or go move what stands under them
        screen.press(label, role)

    @staticmethod
    def see(label, role=None):
        return screen.wait_for_control(label, role)

    @staticmethod
    def wait_away(label):
        screen.wait_seen(lambda: screen.find(label) is None, f"“{label}” to go away")

    def picture(self, name):
        os.makedirs(SEEN, exist_ok=True)
        size = os.environ.get("PELLIKO_WORLD_SIZE", "480x800")
        prefix = "" if size == "480x800" else size + "-"
        screen.screenshot(os.path.join(SEEN, f"{prefix}{self.program.split('.')[-1]}-{name}.png"))

    def enlarge(self, scale="2.0"):
        """Programs that are started from now on in this case are as large as for somebody who sees little."""
        usual = os.environ.get("ELM_SCALE", "1.0")
        world.activation_environment(ELM_SCALE=scale)
        self.addCleanup(world.activation_environment, ELM_SCALE=usual)

    def language(self, name):
        subprocess.run([SETTER, "--text", "db/menu_widget/language", name], check=True)
