"""The application when one call of the platform, of a service or of a library fails: it does not crash, loses no
memory, says what it has to say, and the share or the push ends as fault_plan.txt tells.

  fault_plan_test.py [--whole] [SCENE[:CALL[:TURN]] ...]

Without arguments a part that stands for all: of every family of calls one for each outcome. With --whole every call of
every scene, up to four times each: the first, second, middle and last time that it is made.
"""

import argparse
import fnmatch
import os
import re
import sys
import unittest

from fault_scenes import Scenes, outcome, turns

PLAN = os.path.join(os.path.dirname(os.path.abspath(__file__)), "fault_plan.txt")
# Their failure is that something is not released; the plan itself makes the leak.
RELEASING = re.compile(r"_(destroy|free|close_msg_handle|release_struct|disconnect_on_thread|deinit)$")


class Expectation:
    def __init__(self, line):
        self.scene, what, rest = line.split(None, 2)
        self.call, _, self.turn = what.partition(":")
        self.outcome, _, self.text = (part.strip() for part in rest.partition(" : "))

    def is_about(self, scene, call, turn):
        return (scene, call) == (self.scene, self.call) and self.turn in ("", str(turn))

    def said(self, lines):
        """Whether the text is among the lines; "*" in it stands for anything."""
        pattern = re.compile(".*".join(re.escape(piece) for piece in self.text.split("*")))
        return not self.text or any(pattern.fullmatch(line) for line in lines)


def expectations():
    """The lines of the plan, the more specific ones first."""
    with open(PLAN, encoding="utf-8") as file:
        lines = [Expectation(line) for line in file if line.strip() and not line.startswith("#")]
    return sorted(lines, key=lambda line: line.turn == "")


def standing_for_all(lines):
    """Of every family of calls one for each outcome; that all goes well in the end is the same in all scenes."""
    chosen = {}
    for line in lines:
        ending = "well" if line.outcome in ("shared", "announced") else line.outcome
        chosen.setdefault((line.call.split("_")[0], ending), line)
    return sorted({(line.scene, line.call, int(line.turn or 1)) for line in chosen.values()})


class FaultPlan(unittest.TestCase):
    wanted, whole = [], False

    @classmethod
    def setUpClass(cls):
        cls.lines = expectations()
        cls.scenes = Scenes()

    @classmethod
    def tearDownClass(cls):
        cls.scenes.stage.close()

    def test_every_single_failure_ends_as_it_is_told(self):
        chosen = None if self.whole or self.wanted else standing_for_all(self.lines)
        rounds = 0
        for scene in ("share", "receive", "receive_two"):
            if self.wanted and not any(fnmatch.fnmatch(scene, word.split(":")[0]) for word in self.wanted):
                continue
            calls, quiet = self.scenes.calls(scene)
            self.assertEqual([], quiet.crashes())
            self.usual_leaks = quiet.leaks()
            self.assertEqual("shared" if scene == "share" else "announced", outcome(scene, quiet))
            plan = [(call, turn) for call, count in sorted(calls.items()) for turn in turns(count)]
            for call, turn in plan if chosen is None else [(c, t) for s, c, t in chosen if s == scene]:
                if chosen is None and not self._is_wanted(scene, call, turn):
                    continue
                rounds += 1
                with self.subTest(f"{scene} {call}:{turn}"):
                    self.play(scene, call, turn, last=turn == calls[call])
        print(f"{rounds} failures", flush=True)
        self.assertGreater(rounds, 0)

    def _is_wanted(self, *names):
        return self.whole or any(all(fnmatch.fnmatch(str(name), word) for name, word in zip(names, words.split(":")))
                                 for words in self.wanted)

    def play(self, scene, call, turn, last):
        line = next((line for line in self.lines if line.is_about(scene, call, turn)), None)
        self.assertIsNotNone(line, "fault_plan.txt does not tell how this ends")
        found = self.scenes.play(scene, f"{call}:{turn}", leaks=True,
                                 stays=line.said if line.outcome == "stays" else None)
        if not found.hit and last and turn > 1:
            return  # what is made last is not made every time
        self.assertTrue(found.hit, f"the call was not made: {found.errors[-500:]}")
        self.assertEqual([], found.crashes(), found.report)
        self.assertEqual(0, found.status, found.errors[-500:] + found.report)
        self.assertIn(outcome(scene, found), line.outcome.split(" or "), "\n".join(found.said[-60:]))
        self.assertTrue(line.said(found.said), f"nothing says “{line.text}”:\n" + "\n".join(found.said))
        if not RELEASING.search(call):
            self.assertEqual(set(), found.leaks() - self.usual_leaks, found.report)


if __name__ == "__main__":
    parser = argparse.ArgumentParser()
    parser.add_argument("--whole", action="store_true")
    parser.add_argument("wanted", nargs="*")
    FaultPlan.whole, FaultPlan.wanted = (options := parser.parse_args()).whole, options.wanted
    unittest.main(argv=sys.argv[:1], verbosity=2)
