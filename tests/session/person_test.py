"""./run on a display of the user's own: the person signs in, presses Share and saves; the script only watches.

The person is played from outside of the world, with a keyboard and a pointer on that display.
"""

import os
import queue
import re
import subprocess
import sys
import tempfile
import threading
import unittest

HERE = os.path.dirname(os.path.abspath(__file__))
TOP = os.path.dirname(os.path.dirname(HERE))
BUILD = sys.argv.pop(1)
NUMBER_FIELD = ("240", "402")
CODE_FIELD = ("240", "489")
SIGN_IN = ("356", "609")
SHARE = ("360", "756")  # the right one of the two buttons at the lower edge of a screen of 480x800
CANCEL = ("120", "756")
PATIENCE = 30  # seconds until a person who sees that nothing happens tries again


class Desktop:
    """A display with a window manager, as somebody's own session has it."""

    def __init__(self):
        read, write = os.pipe()
        self.server = subprocess.Popen(["Xvfb", "-displayfd", str(write), "-screen", "0", "480x800x24", "-nolisten", "tcp",
                                        # A finger on a key does not stay there because the machine is busy.
                                        "-noreset", "-r"], pass_fds=[write], stderr=subprocess.DEVNULL)
        os.close(write)
        with os.fdopen(read) as numbers:
            self.environment = {**os.environ, "DISPLAY": f":{numbers.readline().strip()}"}
        self.environment.pop("XAUTHORITY", None)
        with tempfile.TemporaryDirectory() as folder:
            started = os.path.join(folder, "started")
            os.mkfifo(started)
            self.manager = subprocess.Popen(
                ["openbox", "--sm-disable", "--config-file", os.path.join(TOP, "scripts", "session-data", "openbox.xml"),
                 "--startup", f"sh -c 'echo ready >{started}'"], env=self.environment, stderr=subprocess.DEVNULL)
            with open(started, encoding="utf-8") as ready:
                ready.readline()

    def do(self, *words):
        subprocess.run(["xdotool", *words], env=self.environment, check=True)

    def press(self, place):
        self.do("mousemove", *place, "click", "1")

    def type(self, text):
        self.do("type", "--delay", "20", "--", text)

    def picture(self):
        """Of the display as it is now; returns where it is."""
        path = os.path.join(BUILD, "seen", "person.png")
        os.makedirs(os.path.dirname(path), exist_ok=True)
        subprocess.run(["import", "-window", "root", path], env=self.environment, check=True)
        return path

    def close(self):
        for process in (self.manager, self.server):
            process.terminate()
            process.wait()


class Person(unittest.TestCase):
    def setUp(self):
        self.desktop = Desktop()
        self.addCleanup(self.desktop.close)
        pictures = tempfile.TemporaryDirectory()
        self.addCleanup(pictures.cleanup)
        self.run = subprocess.Popen(
            [os.path.join(TOP, "scripts", "session"), "--build", BUILD, "--host-display", "--no-account",
             "--modem", "ofono:234159900000100", "--writable", pictures.name, "--",
             "/usr/bin/python3", "-u", os.path.join(TOP, "scripts", "main-job"), "--pictures", pictures.name],
            env=self.desktop.environment, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
        self.said = ""
        self.lines = queue.Queue()
        self.listener = threading.Thread(target=self.listen)
        self.listener.start()
        self.addCleanup(self.end)

    def listen(self):
        for line in self.run.stdout:
            self.lines.put(line)
        self.lines.put("")

    def end(self):
        self.run.kill()
        self.run.wait()
        self.listener.join()
        self.run.stdout.close()

    def until(self, pattern, seconds=None):
        """Reads what is printed until it matches; None when nothing is printed for so many seconds."""
        while not (found := re.search(pattern, self.said)):
            try:
                line = self.lines.get(timeout=seconds)
            except queue.Empty:
                return None
            self.assertTrue(line, f"it ended without “{pattern}”:\n{self.said}")
            self.said += line
        return found

    def act_until(self, act, pattern):
        """Does something that has this printed; again where it seems to have had no effect."""
        for _ in range(3):
            act()
            if self.until(pattern, PATIENCE):
                return
        self.fail(f"“{pattern}” was not printed; {self.desktop.picture()} shows why:\n{self.said}")

    def fill(self, field, text):
        self.desktop.press(field)
        self.desktop.do("key", "ctrl+a", "key", "BackSpace")
        self.desktop.type(text)

    def sign_in(self):
        number, code = self.until(r"Number (\+\d+), invitation code (\S+)").groups()
        self.until(r"The sign-in is open")

        def enter():
            self.fill(NUMBER_FIELD, number)
            self.fill(CODE_FIELD, code)
            self.desktop.press(SIGN_IN)

        self.act_until(enter, r"press Share")

    def test_the_person_signs_in_shares_and_saves(self):
        self.sign_in()
        self.act_until(lambda: self.desktop.press(SHARE), r"Files sent")
        self.until(r"press Save all")
        self.act_until(lambda: self.desktop.do("key", "Return"), r"All of it held")
        self.assertEqual(0, self.run.wait())

    def test_who_cancels_is_told_that_nothing_was_sent(self):
        self.sign_in()
        self.act_until(lambda: self.desktop.press(CANCEL), r"the share was cancelled; nothing was sent")
        self.assertEqual(1, self.run.wait())


if __name__ == "__main__":
    unittest.main(verbosity=2)
