"""Sharing from a desktop: files that are chosen in a real file manager, and the command beside the real application."""

import json
import os
import shutil
import subprocess
import sys
import unittest

sys.dont_write_bytecode = True

import pyatspi
import share_case
import screen
import world

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "companions", "common"))

import doubles  # noqa: E402

SHARE = os.path.join(os.environ["PELLIKO_BUILD"], "share")
MULTI_SHARE = "http://tizen.org/appcontrol/operation/multi_share"
PATHS = "http://tizen.org/appcontrol/data/path"


class Desktop(share_case.ShareCase):
    @unittest.skipUnless(shutil.which("thunar"), "there is no Thunar here")
    def test_two_files_chosen_in_a_file_manager_are_one_share(self):
        picker = doubles.Application(world.APP + "-picker")
        self.addCleanup(picker.close)
        paths = [self.file("lake.jpg", b"one"), self.file("way to it.txt", b"two")]
        environment = {name: value for name, value in os.environ.items() if name != "NO_AT_BRIDGE"}
        environment["XDG_DATA_DIRS"] = f"{SHARE}:/usr/local/share:/usr/share"
        manager = subprocess.Popen(["thunar", self.folder], env=environment, stdout=subprocess.DEVNULL,
                                   stderr=subprocess.DEVNULL)
        self.addCleanup(manager.wait)
        self.addCleanup(manager.kill)
        self.wait_node("status bar", "2 files")
        screen.wait_active("thunar")
        screen.key("ctrl+a")
        self.wait_node("status bar", "Selection: 2 files")
        screen.key("shift+F10")
        self.press_item("Send To")
        self.wait_node("menu", "Pelliko")
        self.picture("send-to")
        self.press_item("Pelliko")
        request = picker.wait_request()
        self.assertEqual(MULTI_SHARE, request["operation"])
        self.assertEqual(paths, sorted(request["extras"][PATHS]))
        self.assertEqual(1, len(picker.requests))

    @staticmethod
    def node(role, start):
        """What is showing with this role and beginning. This toolkit tells no change of much that it has, so what is
        remembered of it may be older than the last key."""
        for application in pyatspi.Registry.getDesktop(0):
            application.clear_cache()
        for node in screen.nodes():
            try:
                if role in node.getRoleName() and node.name.startswith(start) and \
                        node.getState().contains(pyatspi.STATE_SHOWING):
                    return node
            except Exception:  # it went away while it was looked at
                continue
        return None

    def wait_node(self, role, start):
        return screen.wait_seen(lambda: self.node(role, start), f"the {role} “{start}”")

    def press_item(self, label):
        """Presses an item of a menu that has come to rest."""
        self.wait_node("menu", label)
        screen.wait_still()
        screen.press(label, "menu")

    def test_a_share_from_the_terminal_is_followed_to_its_end(self):
        world.add_contact("Anna Berg", "+447700900101")
        data = {"a.jpg": share_case.random_bytes(200_000), "b.txt": b"hello"}
        paths = [self.file(name, content) for name, content in data.items()]
        world.kill_server()  # so that nothing can end before it is looked at
        self.assertEqual("", world.run("pelliko", "share", *paths, "--to", "anna berg"))
        self.confirm()
        world.wait_for(self.posted, "the first notification")
        follower = world.Stream("pelliko", "status", "--follow", "--json")
        self.addCleanup(follower.close)
        (first,) = follower.wait(lambda items: items[:1], "the upload that waits")
        self.assertIn(first["state"], ("uploading", "paused"))
        (waiting,) = json.loads(world.run("pelliko", "status", "--json"))
        self.assertEqual((first["id"], 2, "Anna Berg"),
                         (waiting["id"], len(waiting["files"]), waiting["recipients"][0]["name"]))
        world.start_server()
        self.wait_sent_and_gone()
        last = follower.wait(lambda items: items[-1] if items[-1]["state"] == "available" else None, "the end of the upload")
        self.assertEqual((first["id"], 100), (last["id"], last["percent"]))
        self.assertEqual(0, follower.process.wait(world.LIMIT))
        self.assertRegex(world.run("pelliko", "status"), r"available until \d{4}-\d\d-\d\d \d\d:\d\d +2 files, .* for Anna Berg")
        self.assert_downloads_equal(self.messages(1)[0], data)


if __name__ == "__main__":
    unittest.main(verbosity=2)
