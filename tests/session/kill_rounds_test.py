"""Whatever is killed at whatever moment of a share: it is sent, once, and its bytes arrive whole.

The moment is drawn at random, that is the point of the case; every wait for an outcome is for something
that is announced. PELLIKO_KILL_ROUNDS sets how many rounds are made, PELLIKO_KILL_SEED where they begin.
"""

import os
import random
import signal
import unittest

import share_case
import world
from gi.repository import GLib

ROUNDS = int(os.environ.get("PELLIKO_KILL_ROUNDS", "4"))
SEED = int(os.environ.get("PELLIKO_KILL_SEED", "1"))
VICTIMS = ["application", "service", "quickpanel", "server"]
NAMES = {"application": world.APP, "service": world.SERVICE, "quickpanel": "com.velmora.quickpanel"}
RATE = 3_000_000  # bytes a second
QUEUE = os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-service", "queue.db")


class KillRounds(share_case.ShareCase):
    @classmethod
    def setUpClass(cls):
        cls.people = [world.add_contact("Ann Example", "+44 7700 900123"),
                      world.add_contact("Ben Example", "+44 7700 900124")]

    def test_a_share_survives_any_kill(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE=str(RATE))
        # Shuffled in blocks, so that few rounds already kill each of them.
        order = random.Random(SEED)
        victims = []
        while len(victims) < ROUNDS:
            victims += order.sample(VICTIMS, len(VICTIMS))
        for number, victim in enumerate(victims[:ROUNDS]):
            with self.subTest(round=number, victim=victim):
                self.round(number, victim)

    def round(self, number, victim):
        draw = random.Random(SEED * 1000 + number)
        size = draw.randint(3_000_000, 8_000_000)
        data = draw.randbytes(size)
        people = self.people[:draw.randint(1, 2)]
        moment = draw.uniform(0, size / RATE + 0.7)
        print(f"round {number}: {size} bytes to {len(people)}, {victim} dies after {moment:.3f} s", flush=True)
        sent_before = len(self.outbox.read())
        self.share_it(f"round{number}.bin.mp4", data, people)
        self.let_pass(moment)
        self.kill(victim)
        self.bring_back(victim)
        self.wait_over(number, sent_before + len(people))
        self.check(number, f"round{number}.bin.mp4", data, sent_before, len(people))

    def share_it(self, name, data, people):
        """Until the service has the request on disk and the application has shown that it knows."""
        shown = len(self.panel.items)
        world.share([self.file(name, data)], people)
        self.confirm()
        world.wait_for(lambda: any(item.get("app") == world.APP and item["event"] == "post"
                                   for item in self.panel.items[shown:]), "the notification of the share")

    @staticmethod
    def let_pass(seconds):
        over = []
        GLib.timeout_add(int(seconds * 1000), lambda: over.append(True))
        world.wait_for(lambda: over, "the moment of the kill")

    def kill(self, victim):
        if victim == "server":
            world.kill_server()
            return
        name = world.BusName(NAMES[victim])
        if name.owner is None:
            print(f"  the {victim} had left by itself", flush=True)
            return
        os.kill(name.process_id(), signal.SIGKILL)
        name.wait_gone()

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
        # The call makes the service handle first what the application told it before it left.
        world.requests()
        queued = world.run("sqlite3", QUEUE, "SELECT id FROM requests WHERE state < 2 OR delivered = 0 OR withdraw = 1")
        return queued.split(), self.pending_rows()

    def wait_over(self, number, messages):
        """The application comes and goes until nothing is pending."""
        self.outbox.wait(lambda lines: len(lines) >= messages, f"the messages of round {number}")
        world.wait_for(lambda: self.application.owner is None and self.pending() == ([], []),
                       f"the end of round {number}")

    def check(self, number, name, data, sent_before, count):
        found = [world.json.loads(line) for line in self.outbox.read()[sent_before:]]
        self.assertEqual(count, len({message["to"] for message in found}), found)
        self.assertEqual(count, len(found), found)
        for message in found:
            self.assert_downloads_equal(message, {name: data})
        last = world.requests()[-1]
        self.assertEqual(("shared", 0), (last["state"], last["error"]))
        self.assertIn("Files sent", [item["title"] for item in world.notifications()], f"round {number}")


if __name__ == "__main__":
    unittest.main(verbosity=2)
