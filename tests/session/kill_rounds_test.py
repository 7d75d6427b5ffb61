"""Whatever is killed at whatever moment of a share: it is sent, once, and its bytes arrive whole.

    kill_rounds_test.py [--rounds N] [--seed S] [--first K]

The moments of the rounds are drawn at random, that is their point; each round prints its plan, and is made again
with its seed and `--rounds 1 --first K`. Beside them stand the moments between two steps of one message, which are
held open until the kill. Every wait for an outcome is for something that is announced.
"""

import argparse
import contextlib
import fcntl
import os
import random
import sqlite3
import sys
import unittest

import share_case
import screen
import world
from gi.repository import Gio

VICTIMS = ["application", "service", "quickpanel", "server"]
NAMES = {"application": world.APP, "service": world.SERVICE, "quickpanel": "com.velmora.quickpanel"}
RATE = 2_000_000  # bytes a second
QUEUE = os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-service", "queue.db")
DATA = "/opt/usr/apps/com.velmora.pelliko/data"
JOURNAL = os.path.join(DATA, ".pelliko-messages.db")
SENDING, SENT = 1, 2


class Killing(share_case.ShareCase):
    @classmethod
    def setUpClass(cls):
        cls.people = [world.add_contact(f"Person {digit}", f"+44 7700 90012{digit}") for digit in "123"]

    def setUp(self):
        super().setUp()
        self.changes = {JOURNAL: 0, QUEUE: 0}
        self.monitors = [self._watch_database(path) for path in self.changes]

    def _watch_database(self, path):
        def count(_monitor, file, *_):
            self.changes[path] += file.get_path().startswith(path)

        os.makedirs(os.path.dirname(path), mode=0o700, exist_ok=True)  # one that comes later is not watched
        monitor = Gio.File.new_for_path(os.path.dirname(path)).monitor_directory(Gio.FileMonitorFlags.NONE, None)
        monitor.set_rate_limit(1)
        monitor.connect("changed", count)
        return monitor

    def tearDown(self):
        for monitor in self.monitors:
            monitor.cancel()
        super().tearDown()

    def share_it(self, name, data, people):
        """Until the service has the request on disk and the application has shown that it knows."""
        shown = len(self.panel.items)
        world.share([self.file(name, data)], people)
        screen.wait_for_control("Share", "button")
        screen.press("Share", "button")
        world.wait_for(lambda: any(item.get("app") == world.APP and item["event"] == "post"
                                   for item in self.panel.items[shown:]), "the notification of the share")

    def kill(self, victim):
        if victim == "server":
            world.kill_server()
            return
        if not world.BusName(NAMES[victim]).kill():
            print(f"  the {victim} had left by itself", flush=True)

    def bring_back(self, victim):
        """As the system does: a login starts the service, its supervisor the server; the bus starts the others."""
        if victim == "server":
            world.start_server()
        elif victim == "service":
            world.requests()
        elif victim == "quickpanel":
            self.panel.close()
            self.panel = self._watch_panel()

    def pending(self):
        """Whether the service or the application has anything left to do."""
        # The call makes the service handle first what the application told it before it left.
        world.requests()
        queued = world.run("sqlite3", QUEUE, "SELECT id FROM requests WHERE state < 2 OR delivered = 0 OR withdraw = 1")
        # Its table is looked at when the application has written it for the last time: a reader could be in its way.
        return bool(queued) or bool(self.pending_rows())

    def wait_over(self, messages):
        """The application comes and goes until nothing is pending; then it may stay, for there is one way to launch
        it for a share that it has seen end, and that leaves it without a reason to go."""
        self.outbox.wait(lambda lines: len(lines) >= messages, f"{messages} messages")
        looked_at = []

        def over():
            # Looking is dear, and worth it only when something was committed since.
            state = self.changes[QUEUE]
            if state in looked_at:
                return False
            looked_at.append(state)
            return not self.pending()

        world.wait_for(over, "the end of the share")

    def check(self, name, data, sent_before, count):
        found = [world.json.loads(line) for line in self.outbox.read()[sent_before:]]
        self.assertEqual(count, len({message["to"] for message in found}), found)
        self.assertEqual(count, len(found), found)
        self.assertEqual([SENT] * count, self.states()[-count:])
        for message in found:
            self.assert_downloads_equal(message, {name: data})
        last = world.requests()[-1]
        self.assertEqual(("shared", 0), (last["state"], last["error"]))
        self.assertIn("Files sent", [item["title"] for item in world.notifications()])

    @staticmethod
    def states():
        """How far the application knows each message to be, in the order in which they were begun."""
        try:
            with contextlib.closing(sqlite3.connect(f"file:{JOURNAL}?mode=ro", uri=True)) as journal:
                return [state for (state,) in journal.execute("SELECT state FROM messages ORDER BY begun_at, number")]
        except sqlite3.OperationalError:
            return []  # not made yet


class KillRounds(Killing):
    def test_a_share_survives_any_kill(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE=str(RATE))
        # Shuffled in blocks, so that few rounds already kill each of them.
        order = random.Random(OPTIONS.seed)
        victims = []
        while len(victims) < OPTIONS.first + OPTIONS.rounds:
            victims += order.sample(VICTIMS, len(VICTIMS))
        for number in range(OPTIONS.first, OPTIONS.first + OPTIONS.rounds):
            with self.subTest(round=number, victim=victims[number]):
                try:
                    self.round(number, victims[number])
                except Exception as fault:
                    print(f"round {number} failed: {fault}", flush=True)
                    self._keep_evidence(f"-round{number}")
                    raise

    def round(self, number, victim):
        draw = random.Random(OPTIONS.seed * 100_000 + number)
        data = draw.randbytes(draw.randint(200_000, 2_000_000))
        people = self.people[:draw.randint(1, len(self.people))]
        among_messages = draw.random() < 0.4
        moment = draw.uniform(0, 0.08) if among_messages else draw.uniform(0, len(data) / RATE + 0.5)
        print(f"round {number} of seed {OPTIONS.seed}: {len(data)} bytes to {len(people)}, {victim} dies after "
              f"{moment:.3f} s {'of messages' if among_messages else 'of upload'}", flush=True)
        sent_before = len(self.outbox.read())
        changes, known = self.changes[JOURNAL], len(self.states())
        self.share_it(f"round{number}.bin.mp4", data, people)
        if among_messages:
            world.wait_for(lambda: self.changes[JOURNAL] > changes and len(self.states()) > known,
                           "the first message to be begun")
        world.let_pass(moment)
        self.kill(victim)
        self.bring_back(victim)
        self.wait_over(sent_before + len(people))
        self.check(f"round{number}.bin.mp4", data, sent_before, len(people))


class BetweenTwoSteps(Killing):
    """The first of three messages is held between two of its steps while somebody is killed."""

    def setUp(self):
        super().setUp()
        self.data = share_case.random_bytes(20_000)
        self.log = world.Follower(world.APP_LOG)
        self.asked_before = self.asked_for_messages()

    def share_up_to_the_first_message(self):
        """The first message is noted as begun, and its application waits for the outbox that the caller has locked."""
        self.share_it("letter.pdf", self.data, self.people)
        world.wait_for(lambda: SENDING in self.states(), "the first message to be begun")

    @contextlib.contextmanager
    def outbox_locked(self):
        with open(self.outbox.path, "ab") as outbox:
            fcntl.flock(outbox, fcntl.LOCK_EX)
            yield

    @staticmethod
    @contextlib.contextmanager
    def no_commits_in(database):
        with contextlib.closing(sqlite3.connect(database, isolation_level=None)) as writer:
            writer.execute("BEGIN IMMEDIATE")
            yield
            writer.execute("ROLLBACK")

    def assert_everybody_is_told_once(self):
        self.wait_over(self.messages_before + len(self.people))
        self.check("letter.pdf", self.data, self.messages_before, len(self.people))

    def test_the_application_dies_before_its_message_is_sent(self):
        with self.outbox_locked():
            self.share_up_to_the_first_message()
            self.kill("application")
        self.assert_everybody_is_told_once()

    def test_the_application_dies_before_it_has_noted_what_it_sent(self):
        with contextlib.ExitStack() as journal_is_full:
            with self.outbox_locked():
                self.share_up_to_the_first_message()
                journal_is_full.enter_context(self.no_commits_in(JOURNAL))
            self.outbox.wait(lambda lines: len(lines) > self.messages_before, "the first message")
            self.kill("application")
        self.assert_everybody_is_told_once()
        self.assertIn("This message was sent before the interruption", self.log_lines())

    def test_the_service_dies_while_the_application_sends(self):
        with self.outbox_locked():
            self.share_up_to_the_first_message()
            self.kill("service")
            self.bring_back("service")
            world.wait_for(lambda: self.asked_for_messages() == self.asked_before + 2, "the service to ask again")
        self.assert_everybody_is_told_once()

    def test_the_service_dies_before_it_has_noted_the_answer(self):
        with contextlib.ExitStack() as queue_is_full:
            with self.outbox_locked():
                self.share_up_to_the_first_message()
                queue_is_full.enter_context(self.no_commits_in(QUEUE))
            world.wait_for(lambda: self.states()[-3:] == [SENT] * 3, "the messages to be sent")
            self.kill("service")
        self.bring_back("service")
        self.assert_everybody_is_told_once()

    def asked_for_messages(self):
        return sum("Need to Send SMS to receiver !!" in line for line in self.log.read())


OPTIONS = None


def read_options():
    parser = argparse.ArgumentParser(description="Kills programs at random moments of shares.")
    parser.add_argument("--rounds", type=int, default=10, help="how many shares (default 10)")
    parser.add_argument("--seed", type=int, default=1, help="what the rounds are drawn from")
    parser.add_argument("--first", type=int, default=0, help="the number of the first round")
    return parser.parse_known_args()


if __name__ == "__main__":
    OPTIONS, rest = read_options()
    unittest.main(argv=[sys.argv[0], *rest], verbosity=2)
