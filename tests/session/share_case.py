"""The ground under the whole-program tests: recipients, files, the way of one share, and what is left
behind when a case fails."""

import os
import random
import shutil
import signal
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "scripts", "lib"))

import screen  # noqa: E402
import world  # noqa: E402

SEEN = os.path.join(os.environ["PELLIKO_BUILD"], "seen")


def random_bytes(size, seed=1):
    return random.Random(seed).randbytes(size)


class ShareCase(unittest.TestCase):
    """A case that shares; after it nothing of the application is left running."""

    def setUp(self):
        self.folder = os.path.join(os.environ["PELLIKO_STATE"], "files", self._testMethodName)
        os.makedirs(self.folder)
        screen.announce_reader()
        self.panel = self._watch_panel()
        self.outbox = world.Follower(os.environ["PELLIKO_SMS_OUTBOX"])
        self.outbox.read()
        self.messages_before = len(self.outbox.lines)
        self.application = world.BusName(world.APP)

    @staticmethod
    def _watch_panel():
        """The panel's events from now on; reading starts before anything is launched."""
        past = [world.json.loads(line) for line in world.run("quickpanel-tool", "history", "--json").splitlines()]
        last = past[-1]["seq"] if past else 0
        return world.Stream("quickpanel-tool", "watch", "--since", str(last))

    def tearDown(self):
        self.panel.close()
        if not self._succeeded():
            self._keep_evidence()

    def _succeeded(self):
        return not any(error for _case, error in self._outcome.result.failures + self._outcome.result.errors
                       if _case is self)

    def _keep_evidence(self, part=""):
        target = os.path.join(SEEN, self.id() + part)
        os.makedirs(target, exist_ok=True)
        if "DISPLAY" in os.environ:
            screen.screenshot(os.path.join(target, "screen.png"))
        if os.path.exists(world.APP_LOG):
            shutil.copy(world.APP_LOG, target)
        shutil.copytree(os.path.join(os.environ["PELLIKO_STATE"], "log"), os.path.join(target, "log"),
                        dirs_exist_ok=True)

    # --- steps ---

    def file(self, name, data):
        path = os.path.join(self.folder, name)
        with open(path, "wb") as file:
            file.write(data)
        return path

    def picture(self, name):
        os.makedirs(SEEN, exist_ok=True)
        screen.screenshot(os.path.join(SEEN, f"{self._testMethodName}-{name}.png"))

    def posted(self, title=None, event="post"):
        """What the panel was given by the application, tickers left out."""
        return [item for item in self.panel.items
                if item.get("app") == world.APP and item["event"] == event and item["tag"] != "TICKER"
                and (title is None or item["title"] == title)]

    def wait_posted(self, title, count=1):
        return world.wait_for(lambda: len(self.posted(title)) >= count and self.posted(title)[-1],
                              f"the notification “{title}”")

    def messages(self, count):
        """The messages of this case; waits for so many and fails when there are more."""
        self.outbox.wait(lambda lines: len(lines) - self.messages_before >= count, f"{count} messages")
        found = [world.json.loads(line) for line in self.outbox.lines[self.messages_before:]]
        self.assertEqual(count, len(found), found)
        return found

    def confirm(self):
        screen.wait_for_control("Share", "button")
        self.picture("popup")
        screen.press("Share", "button")

    def wait_sent_and_gone(self):
        """The share has ended as sent and the application has left by its own rule."""
        sent = self.wait_posted("Files sent")
        self.application.wait_gone()
        self.assertEqual([], [item for item in self.posted() if item["title"] == "Failed to send files"])
        return sent

    def assert_downloads_equal(self, message, files):
        """Behind the message's link are exactly these files: {name: bytes}."""
        found = world.download_all(world.link_in(message["text"]))
        self.assertEqual(sorted(files), sorted(found))
        for name, data in files.items():
            self.assertEqual(world.sha256(data), world.sha256(found[name]), name)

    def kill_application_and_service(self):
        """Both at once, as when the power goes; the service first, so that it cannot see the other leave."""
        service = world.BusName(world.SERVICE)
        os.kill(service.process_id(), signal.SIGKILL)
        os.kill(self.application.process_id(), signal.SIGKILL)
        service.wait_gone()
        self.application.wait_gone()

    def pending_rows(self):
        """The rows of the application's table of pending uploads."""
        return world.run("sqlite3", "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db",
                         "SELECT req_id FROM UPLOAD_INFO ORDER BY req_id").split()

    def log_lines(self):
        with open(world.APP_LOG, encoding="utf-8") as log:
            return [line.split(" > ", 1)[1].rstrip("\n") for line in log if " > " in line]
