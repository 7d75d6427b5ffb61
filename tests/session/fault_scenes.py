"""What is played under a fault plan, and which calls the application makes in it."""

import collections
import os

import share_case
import world
from fault_rounds import Round, Stage

from gi.repository import Gio

OWN_NUMBER = "+447700900100"
TO = "http://tizen.org/appcontrol/data/to"


class Scenes:
    """A share from the popup to the message, and the arrival of one and of two shares of others."""

    def __init__(self):
        self.stage = Stage()
        self.ann = world.add_contact("Ann Example", "+447700900123")
        self.ida = world.add_contact("Ida Example", OWN_NUMBER, joined=True)
        self.file = os.path.join(self.stage.folder, "picture.jpg")
        with open(self.file, "wb") as file:
            file.write(share_case.random_bytes(3000))
        self.tokens = []

    def share(self, actor, to=None):
        actor.launch("share", uri=f"file://{self.file}", **{TO: [f"{to or self.ann}|"]})
        actor.press_share()

    def receive(self, actor):
        actor.launch("send", contents_token_list=self.tokens[:1])

    def receive_two(self, actor):
        actor.launch("send", contents_token_list=self.tokens[:2])

    def prepare(self, name):
        """What has to be there before a scene; without a fault."""
        while name != "share" and len(self.tokens) < 2:
            before = self._announced()
            Round(self.stage, lambda actor: self.share(actor, self.ida))
            # The push comes to that process or brings up another one.
            world.wait_for(lambda: self._announced() > before, "the share to arrive")
            self.stage.application.wait_gone()
            self.tokens = self._received()

    def _announced(self):
        return sum(item["event"] == "post" and item.get("tag") == "PUSH_NOTI" for item in self.stage.panel.items)

    @staticmethod
    def _received():
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        shares = bus.call_sync(world.SERVICE, "/com/velmora/pelliko/Service", "com.velmora.pelliko.Shares1",
                               "ListReceived", None, None, Gio.DBusCallFlags.NONE, int(world.LIMIT * 1000)).unpack()[0]
        return [share["token"] for share in shares]

    def play(self, name, plan="", **options):
        return Round(self.stage, getattr(self, name), plan, **options)

    def calls(self, name):
        """{call: how often} in the scene when nothing fails, and the round that told it."""
        self.prepare(name)
        self.play(name)  # what is done once a day is done here
        quiet = self.play(name, leaks=True)
        return collections.Counter(line.split()[0] for line in quiet.trace), quiet


def turns(count):
    """Which of so many calls are made to fail: the first two, the middle one and the last."""
    return sorted({1, 2, (count + 1) // 2, count} & set(range(1, count + 1)))


def outcome(name, found):
    """What became of the round, in a word or two."""
    if found.stayed:
        return "stays"
    if name != "share":
        return "announced" if any(tag == "PUSH_NOTI" for _title, tag in found.posted) else "not announced"
    if found.requests == ["shared"]:
        return {0: "shared without message", 1: "shared"}.get(found.messages, f"{found.messages} messages")
    return {(): "refused", ("failed",): "failed"}.get(tuple(found.requests), str(found.requests))
