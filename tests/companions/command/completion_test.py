"""What the shells complete of the command, asked of the shells themselves."""

import os
import pty
import subprocess
import sys
import termios
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "..", "scripts", "lib"))
sys.dont_write_bytecode = True

import world  # noqa: E402
from gi.repository import GLib  # noqa: E402

HERE = os.path.dirname(os.path.abspath(__file__))
COMPLETION = os.path.join(HERE, "..", "..", "..", "companions", "command", "completion")


class Typing:
    """A person at a shell: keys go in, what the terminal shows comes out."""

    def __init__(self, *command, **environment):
        self.shown = ""
        parent, child = pty.openpty()
        termios.tcsetwinsize(child, (40, 160))
        self.process = subprocess.Popen(command, stdin=child, stdout=child, stderr=child, start_new_session=True,
                                        env={**os.environ, "TERM": "dumb", **environment})
        os.close(child)
        self.terminal = parent
        self.source = GLib.io_add_watch(parent, GLib.PRIORITY_DEFAULT, GLib.IOCondition.IN | GLib.IOCondition.HUP, self._read)

    def _read(self, *_):
        try:
            self.shown += os.read(self.terminal, 4096).decode(errors="replace")
        except OSError:
            self.source = 0
            return False
        return True

    def type(self, keys, until):
        """Types and waits until that is shown."""
        before = len(self.shown)
        os.write(self.terminal, keys.encode())
        world.wait_for(lambda: until in self.shown[before:], f"“{until}” after {keys!r}; shown: {self.shown!r}", 30)

    def close(self):
        self.process.kill()
        self.process.wait()
        if self.source:
            GLib.source_remove(self.source)
        os.close(self.terminal)


class Completion(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        for name, number in (("Anna Berg", "+4915112345678"), ("Zoë O'Neil", "+447700900107"), ("zoo", "+447700900108")):
            world.add_contact(name, number)
        cls.folder = os.path.join(os.environ["PELLIKO_STATE"], "files")
        os.makedirs(os.path.join(cls.folder, "pictures"))
        for name in ("photo one.jpg", "photo two.jpg"):
            with open(os.path.join(cls.folder, name), "w", encoding="utf-8"):
                pass

    def bash(self, *words):
        script = ('source "$0"; COMP_WORDS=(pelliko "$@"); COMP_CWORD=$#; _pelliko; printf "%s\\n" "${COMPREPLY[@]}"')
        said = subprocess.run(["bash", "--norc", "-c", script, os.path.join(COMPLETION, "pelliko.bash"), *words],
                              capture_output=True, text=True, cwd=self.folder, check=True)
        self.assertEqual("", said.stderr)
        return sorted(line for line in said.stdout.splitlines() if line)

    def fish(self, line):
        said = subprocess.run(["fish", "--no-config", "-c", 'source $argv[1]; complete -C $argv[2]',
                               os.path.join(COMPLETION, "pelliko.fish"), line],
                              capture_output=True, text=True, cwd=self.folder, check=True)
        self.assertEqual("", said.stderr)
        return sorted(line.split("\t")[0] for line in said.stdout.splitlines())

    def test_bash_knows_commands_options_people_and_files(self):
        self.assertEqual(["share", "status"], self.bash("s"))
        self.assertEqual(["--follow"], self.bash("status", "--f"))
        self.assertEqual(["Zoë O'Neil", "zoo"], self.bash("share", "x", "--to", "ZO"))
        self.assertEqual(["Anna Berg"], self.bash("text", "--to", "Anna\\ B"))
        self.assertEqual(["photo one.jpg", "photo two.jpg"], self.bash("share", "--to", "Anna", "ph"))
        self.assertEqual([], self.bash("text", "ph"))

    def test_bash_puts_a_whole_name_on_the_line(self):
        shell = Typing("bash", "--norc", "-i", PS1="$ ", HOME=self.folder)
        self.addCleanup(shell.close)
        shell.type(f"source {COMPLETION}/pelliko.bash; echo re''ady\n", "ready")
        shell.type("pelliko text --to Ann\t", "Anna\\ Berg ")

    def test_fish_knows_commands_options_people_and_files(self):
        self.assertEqual(["share", "status"], self.fish("pelliko s"))
        self.assertEqual(["--follow"], self.fish("pelliko status --f"))
        self.assertEqual(["Zoë O'Neil", "zoo"], self.fish("pelliko share x --to zo"))
        self.assertEqual(["photo one.jpg", "photo two.jpg"], self.fish("pelliko share ph"))
        self.assertEqual([], self.fish("pelliko text ph"))

    def test_zsh_completes_commands_and_people(self):
        shell = Typing("zsh", "-f", "-i", PS1="$ ", HOME=self.folder)
        self.addCleanup(shell.close)
        shell.type(f"fpath=({COMPLETION} $fpath); autoload -Uz compinit; compinit -u -D; echo re''ady\n", "ready")
        shell.type("pelliko stat\t", "pelliko status ")
        shell.type("\x15pelliko share --to Ann\t", "Anna\\ Berg ")


if __name__ == "__main__":
    unittest.main(verbosity=2)
