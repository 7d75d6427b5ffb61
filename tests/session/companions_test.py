"""The history and the viewer on a real service and a real share server: what they show is what a recipient finds."""

import json
import os
import signal
import subprocess
import unittest
import urllib.error
import urllib.request

import share_case
import screen
import world

HISTORY, PICKER, VIEWER = [f"com.velmora.pelliko-{name}" for name in ("history", "picker", "viewer")]
SERVER = os.environ["PELLIKO_SERVER_URL"]
SERVER_DATA = os.path.join(os.environ["PELLIKO_STATE"], "server")
OWN_NUMBER = "+447700900100"
DOWNLOADS = os.path.join(os.environ["HOME"], "Downloads")
UNREACHABLE = "The share server cannot be reached. Check your connection and try again."


class Sender:
    """Somebody else with an account at the same server."""

    def __init__(self, number):
        self.token = world.run("pelliko-server", "account", "add", "--data", SERVER_DATA, "--number", number).strip()

    def _call(self, method, path, body=b"", **headers):
        request = urllib.request.Request(SERVER + path, data=body or None, method=method)
        request.add_header("Authorization", "Bearer " + self.token)
        for name, value in headers.items():
            request.add_header(name.replace("_", "-"), value)
        with urllib.request.urlopen(request, timeout=world.LIMIT) as answer:
            text = answer.read()
        return json.loads(text) if text else None

    def share(self, files, key):
        """Shares {name: bytes} with the user of this world and returns the share's name."""
        record = self._call("POST", "/api/v1/shares", json.dumps(
            {"files": [{"name": name, "size": len(data)} for name, data in files.items()],
             "recipients": [{"number": OWN_NUMBER, "ccc": "44"}]}).encode(), Idempotency_Key=key)
        for file in record["files"]:
            self._call("PATCH", file["upload"], files[file["name"]], Tus_Resumable="1.0.0", Upload_Offset="0",
                       Content_Type="application/offset+octet-stream")
        self._call("POST", f"/api/v1/shares/{record['share']}/finish")
        return record["share"]

    def withdraw(self, share):
        self._call("DELETE", f"/api/v1/shares/{share}")


class CompanionsCase(share_case.ShareCase):
    def setUp(self):
        super().setUp()
        world.run("dunstctl", "set-paused", "true")  # banners lie over what is to be pressed
        self.companions = [world.BusName(name) for name in (HISTORY, PICKER, VIEWER)]
        self.addCleanup(self._end_companions)

    def pick(self, *people):
        """Chooses people in the picker, which then hands over to the application."""
        for count, person in enumerate(people, 1):
            chosen = "1 person is" if count == 1 else f"{count} people are"
            screen.press_row(self.row(person, "list item"), f"{chosen} chosen. At most 10 people at once.")
        self.press("Share")
        self.companions[1].wait_gone()

    def _end_companions(self):
        for program in self.companions:
            program.kill()

    @staticmethod
    def press(label, role="button"):
        screen.wait_for_control(label, role)
        screen.wait_still(0.2)  # words that come or go move what stands under them
        screen.press(label, role)

    @staticmethod
    def row(start, kind="button"):
        return screen.wait_for_row(start, kind)


class SentShares(CompanionsCase):
    def share_one(self, name, data, person):
        path = self.file(name, data)
        world.share([path], [person])
        self.confirm()
        self.wait_sent_and_gone()
        return self.messages(1)[0]

    def test_a_withdrawn_share_is_gone_for_its_recipient(self):
        data = share_case.random_bytes(30_000)
        message = self.share_one("plan.pdf", data, world.add_contact("Ann Example", "+44 7700 900123"))
        self.assert_downloads_equal(message, {"plan.pdf": data})
        world.launch("default", app=HISTORY)
        self.press(self.row("Ann Example, 1 file, 30.0 kB, Available until "))
        self.press("Withdraw")
        screen.wait_for_control("No, go back", "button")
        self.press("Withdraw")
        screen.wait_for_control("Withdrawn")
        with self.assertRaises(urllib.error.HTTPError) as refused:
            urllib.request.urlopen(world.link_in(message["text"]), timeout=world.LIMIT)
        self.assertEqual(410, refused.exception.code)
        self.assertIn("No longer shared", refused.exception.read().decode())
        self.picture("withdrawn")

    def test_a_share_goes_again_to_somebody_from_the_contacts(self):
        data = share_case.random_bytes(200_000)
        cem = world.add_contact("Cem Example", "+44 7700 900777")
        world.add_contact("Dora Example", "+44 7700 900888")
        first = self.share_one("album.jpg", data, cem)
        world.launch("default", app=HISTORY)
        self.press(self.row("Cem Example, 1 file, 200.0 kB, Available until "))
        self.press("Share again")
        self.pick("Dora Example, +44 7700 900888")
        self.press("Share")  # the application asks
        self.outbox.wait(lambda lines: len(lines) - self.messages_before >= 2, "the second message")
        self.application.wait_gone()
        second = self.messages(2)[1]
        self.assertEqual("+447700900888", second["to"])
        self.assertNotEqual(world.link_in(first["text"]), world.link_in(second["text"]))
        self.assert_downloads_equal(second, {"album.jpg": data})
        world.launch("default", app=HISTORY)
        self.row("Dora Example, 1 file, 200.0 kB, ")


    def test_a_share_without_people_asks_for_them(self):
        data = share_case.random_bytes(40_000)
        path = self.file("map.pdf", data)
        for name in ("Eve Example", "Finn Example"):
            world.add_contact(name, "+44 7700 900" + ("551" if name.startswith("E") else "552"))
        world.launch("share", "--uri", f"file://{path}", app=PICKER)
        self.pick("Finn Example", "Eve Example")
        self.confirm()
        self.wait_sent_and_gone()
        messages = self.messages(2)
        self.assertEqual({"+447700900551", "+447700900552"}, {message["to"] for message in messages})
        for message in messages:
            self.assert_downloads_equal(message, {"map.pdf": data})


class ReceivedShares(CompanionsCase):
    @classmethod
    def setUpClass(cls):
        world.add_contact("Sam Sender", "+44 7700 900555")
        cls.sender = Sender("+447700900555")

    def receive(self, files):
        """Shares with this user and opens the viewer as the history's row does."""
        share = self.sender.share(files, self._testMethodName)
        world.requests()  # the service runs and listens
        self.wait_posted("+447700900555")  # told before the history is open, which would mark it as new
        self.application.wait_gone()
        world.launch("view", "--extra", "view_type=received", "--extra", "remoteShare=remoteview", app=HISTORY)
        many = "1 file" if len(files) == 1 else f"{len(files)} files"
        self.press(self.row(f"Sam Sender, {many}, "))
        self.press("Open")
        screen.wait_for_control("\u2068Sam Sender\u2069 shared with you")
        return share

    def saved(self):
        return {name: world.sha256_of_file(os.path.join(DOWNLOADS, name)) for name in os.listdir(DOWNLOADS)}

    def tearDown(self):
        super().tearDown()
        subprocess.run(["rm", "-rf", DOWNLOADS], check=True)

    def test_what_is_saved_is_what_was_sent(self):
        files = {"photo.jpg": share_case.random_bytes(700_000), "empty.txt": b"",
                 "Grüße ☂.pdf": share_case.random_bytes(50_000, 2)}
        share = self.receive(files)
        self.press("Save all")
        screen.wait_for_control("3 files were saved.")
        self.picture("saved")
        self.assertEqual({name: world.sha256(data) for name, data in files.items()}, self.saved())
        self.sender.withdraw(share)
        world.launch("launch_viewer", "--extra", "contents_token=" + self.token_of(), "--extra",
                     "share_type=single_share", app=VIEWER)
        screen.wait_for_control("The sender has withdrawn this share. Its files cannot be fetched any more. "
                                "3 files were saved.")

    def test_the_notification_of_a_share_opens_the_viewer(self):
        data = share_case.random_bytes(9_000)
        self.sender.share({"voice.ogg": data}, "push")
        world.requests()  # the service runs and listens
        posted = self.wait_posted("+447700900555")
        world.run("quickpanel-tool", "tap", posted["tag"])
        screen.wait_for_control("\u2068Sam Sender\u2069 shared with you")
        self.row("voice.ogg, 9.0 kB, Press to save")
        self.press("Save all")
        screen.wait_for_control("1 file was saved.")
        self.assertEqual({"voice.ogg": world.sha256(data)}, self.saved())

    def token_of(self):
        bus = world.Gio.bus_get_sync(world.Gio.BusType.SESSION)
        shares = bus.call_sync(world.SERVICE, "/com/velmora/pelliko/Service", "com.velmora.pelliko.Shares1",
                               "ListReceived", None, None, world.Gio.DBusCallFlags.NONE, -1, None).unpack()[0]
        return shares[0]["token"]

    def test_a_server_that_dies_while_saving_loses_nothing(self):
        files = {"small.jpg": share_case.random_bytes(20_000), "film.mp4": share_case.random_bytes(5_000_000, 3)}
        self.receive(files)
        self.press("small.jpg, 20.0 kB, Press to save")
        self.row("small.jpg, 20.0 kB, Saved. Press to open")
        with open(os.path.join(os.environ["XDG_RUNTIME_DIR"], "pelliko-server.pid"), encoding="ascii") as file:
            os.kill(int(file.read()), signal.SIGSTOP)  # it answers nothing, so the film is on its way when it dies
        self.press("Save all")
        self.row("film.mp4, 5.0 MB, Being saved, ")
        world.kill_server()
        self.addCleanup(lambda: started or world.start_server())
        started = []
        screen.wait_for_control(UNREACHABLE, limit=100)
        self.picture("server-gone")
        self.assertEqual({"small.jpg": world.sha256(files["small.jpg"])},
                         {name: found for name, found in self.saved().items() if name in files})
        world.start_server()
        started.append(True)
        self.press("Save all")
        self.row("film.mp4, 5.0 MB, Saved. Press to open")
        self.assertEqual({name: world.sha256(data) for name, data in files.items()}, self.saved())


if __name__ == "__main__":
    unittest.main(verbosity=2)
