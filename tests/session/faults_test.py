"""What goes wrong on the phone itself: requests that make no sense, notifications that nobody shows, databases that
are damaged and a disk that is full. No program crashes, and what can be sent is sent once."""

import glob
import os
import re
import subprocess
import unittest

import share_case
import screen
import world
from gi.repository import Gio

SERVICES = os.path.join(os.environ["XDG_DATA_HOME"], "dbus-1", "services")
PLATFORM = os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-platform")
DATA = "/opt/usr/apps/com.velmora.pelliko/data"
CRASH = re.compile("AddressSanitizer|runtime error:|terminate called|Assertion")


class Faults(share_case.ShareCase):
    @classmethod
    def setUpClass(cls):
        cls.ann = world.add_contact("Ann Example", "+44 7700 900123")

    def tearDown(self):
        super().tearDown()
        for path in glob.glob(os.path.join(os.environ["PELLIKO_STATE"], "log", "*")):
            with open(path, encoding="utf-8", errors="replace") as file:
                self.assertNotRegex(file.read(), CRASH, path)

    # --- steps ---

    @staticmethod
    def reload_services():
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "ReloadConfig", None,
                      None, Gio.DBusCallFlags.NONE, 5000)

    def replace_service(self, name, change):
        """Starts a bus name differently until the case is over; None for a name that cannot be started."""
        path = os.path.join(SERVICES, name + ".service")
        with open(path, encoding="utf-8") as file:
            before = file.read()
        os.remove(path)

        def put_back():
            with open(path, "w", encoding="utf-8") as file:
                file.write(before)
            self.reload_services()

        self.addCleanup(put_back)
        if change:
            with open(path, "w", encoding="utf-8") as file:
                file.write(change(before))
        self.reload_services()

    def wait_progress(self, part):
        world.wait_for(lambda: any(i["progress"] >= part for i in self.posted(event="update")), f"{part} of the upload")

    # --- cases ---

    def test_requests_that_make_no_sense_leave_a_program_that_works(self):
        to_ann = world.recipients_option([self.ann])
        for operation in ["share", "multi_share", "share_text", "share_contact", "nonsense"]:
            world.launch(operation)
        long_path = "/" + "/".join(["x" * 200] * 25) + ".jpg"
        self.assertGreater(len(long_path), 5000)
        # A path that no file can have is cut, and its extension with it.
        subprocess.run(["app-launch", "--app", world.APP, "--operation", "appcontrol/operation/share", "--uri",
                        long_path, *to_ann], check=False, timeout=world.LIMIT)
        subprocess.run(["app-launch", "--app", world.APP, "--operation", "appcontrol/operation/multi_share",
                        "--extra-array", "appcontrol/data/path=" + long_path, *to_ann], check=False,
                       timeout=world.LIMIT)
        self.assertEqual([], self.messages(0))
        # A thousand recipients, and a file and a recipient that are no UTF-8.
        name = b"caf\xe9.jpg"
        path = os.path.join(os.fsencode(self.folder), name)
        with open(path, "wb") as file:
            file.write(b"bytes")
        world.run("app-launch", "--app", world.APP, "--operation", "appcontrol/operation/multi_share", "--extra-array",
                  b"appcontrol/data/path=" + path, *world.recipients_option([self.ann] * 999), "--extra-array",
                  b"appcontrol/data/to=\xff\xfe")
        screen.wait_for_control("Share", "button")
        world.put_banners_away()  # of the requests that were refused
        self.confirm()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"caf\ufffd.jpg": b"bytes"})

    def test_a_text_that_is_no_utf8_arrives_as_it_is(self):
        text = b"caf\xe9 \xf0\x9f"
        world.run("app-launch", "--app", world.APP, "--operation", "appcontrol/operation/share_text", "--extra",
                  b"appcontrol/data/text=" + text, *world.recipients_option([self.ann]))
        self.confirm()
        self.wait_sent_and_gone()
        found = world.download_all(world.link_in(self.messages(1)[0]["text"]))
        self.assertEqual([text], list(found.values()))

    def test_a_share_does_not_need_anybody_who_shows_notifications(self):
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="2000000")
        data = share_case.random_bytes(6_000_000)
        world.share([self.file("concert.mp4", data)], [self.ann])
        self.confirm()
        self.wait_progress(0.2)
        self.replace_service("org.freedesktop.Notifications", None)
        world.BusName("org.freedesktop.Notifications").kill()
        self.wait_progress(0.6)
        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"concert.mp4": data})

    def test_damaged_databases_do_not_stop_a_share(self):
        self.panel.close()  # while it begins to watch it would start the panel again
        world.BusName("com.velmora.quickpanel").kill()
        world.BusName(world.SERVICE).kill()
        paths = [os.path.join(PLATFORM, "notifications.db"), os.path.join(DATA, ".pelliko.db"),
                 os.path.join(PLATFORM, "preferences", world.APP + ".db"),
                 os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-service", "queue.db")]
        for path in paths:
            for more in glob.glob(path + "-*"):
                os.remove(more)
            with open(path, "wb") as file:
                file.write(b"x" * 20_000)
        self.panel = self._watch_panel()
        data = share_case.random_bytes(100_000)
        world.share([self.file("photo.jpg", data)], [self.ann])
        self.confirm()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"photo.jpg": data})
        for path in paths:
            self.assertTrue(os.path.exists(path + ".broken"), path)

    def test_a_full_disk_of_the_application_stops_no_share(self):
        self.replace_service(world.APP, lambda text: text.replace(
            "Exec=", f"Exec=/usr/bin/bwrap --dev-bind / / --size 200000 --tmpfs {DATA} --dir {DATA}/.app-logs "))
        world.stop_service()
        world.activation_environment(PELLIKO_UPLOAD_RATE="1000000")
        data = share_case.random_bytes(3_000_000)
        world.share([self.file("concert.mp4", data)], [self.ann])
        folder = f"/proc/{self.application.process_id()}/root{DATA}"
        small = os.open(folder, os.O_RDONLY)  # keeps the disk for a look at its end
        self.addCleanup(os.close, small)
        with open(folder + "/filler", "wb", buffering=0) as file, self.assertRaises(OSError):
            while True:
                file.write(bytes(4096))
        self.confirm()
        self.wait_progress(0.3)
        os.remove("filler", dir_fd=small)
        world.activation_environment(PELLIKO_UPLOAD_RATE="0")
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], {"concert.mp4": data})
        log = os.open(".app-logs/app.log", os.O_RDONLY, dir_fd=small)
        with os.fdopen(log, encoding="utf-8") as file:
            lines = file.read()
        self.assertIn("Upload Complete. Updating notification", lines)
        self.assertNotIn("Records created successfully", lines, "it was not as full as it should be")


if __name__ == "__main__":
    unittest.main(verbosity=2)
