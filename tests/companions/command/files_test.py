"""Files that a desktop hands over: opened by the bus, by the desktop's launcher and from the menu of Files."""

import contextlib
import importlib.util
import os
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "common"))
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "..", "scripts", "lib"))
sys.dont_write_bytecode = True
SHARE = os.path.join(os.environ["PELLIKO_BUILD"], "share")
# Menu entries are where the installation lays them, in the user's language: read once, at the first look.
os.environ.update(XDG_DATA_DIRS=f"{SHARE}:/usr/share", LANGUAGE="de")

import doubles  # noqa: E402
import gi  # noqa: E402
import world  # noqa: E402

gi.require_version("Nautilus", "4.0")
from gi.repository import Gio, GLib, GObject, Nautilus  # noqa: E402

ENTRY = os.path.join(SHARE, "applications", world.APP + ".desktop")
OPERATION = "http://tizen.org/appcontrol/operation/"
PATHS = "http://tizen.org/appcontrol/data/path"


class ChosenFile(GObject.GObject, Nautilus.FileInfo):
    """A file that was chosen in Files."""

    def __init__(self, uri, folder=False):
        super().__init__()
        self.uri, self.folder = uri, folder

    def do_get_uri(self):
        return self.uri

    def do_get_uri_scheme(self):
        return self.uri.split(":")[0]

    def do_is_directory(self):
        return self.folder


class Files(unittest.TestCase):
    def setUp(self):
        self.picker = doubles.Application(world.APP + "-picker")
        self.addCleanup(self.picker.close)
        self.application = world.BusName(world.APP)
        self.folder = os.path.join(os.environ["PELLIKO_STATE"], "files")
        os.makedirs(self.folder, exist_ok=True)

    def file(self, name):
        path = os.path.join(self.folder, name)
        with open(path, "w", encoding="utf-8") as file:
            file.write("something")
        return path

    def run_turning(self, *command):
        """Runs a program while the picker of this process can answer."""
        launcher = Gio.SubprocessLauncher.new(Gio.SubprocessFlags.STDOUT_PIPE | Gio.SubprocessFlags.STDERR_MERGE)
        answers = []
        launcher.spawnv(command).communicate_utf8_async(
            None, None, lambda source, result: answers.append((source.get_successful(),
                                                               source.communicate_utf8_finish(result)[1])))
        world.wait_for(lambda: answers, f"{command[0]} to end")
        self.assertTrue(answers[0][0], answers[0][1])

    def wait_one_share(self, *paths):
        """One request for all of them."""
        request = self.picker.wait_request()
        if len(paths) == 1:
            self.assertEqual((OPERATION + "share", paths[0]), (request["operation"], request["uri"]))
        else:
            self.assertEqual((OPERATION + "multi_share", list(paths)), (request["operation"], request["extras"][PATHS]))
        self.assertEqual(1, len(self.picker.requests))

    def test_opened_by_the_bus_they_are_one_share(self):
        one, two = self.file("one.jpg"), self.file("two ü.pdf")
        self.run_turning("gdbus", "call", "--session", "--dest", world.APP, "--object-path", "/com/velmora/pelliko",
                         "--method", "org.freedesktop.Application.Open",
                         str([f"file://{one}", GLib.filename_to_uri(two)]), "{}")
        self.wait_one_share(one, two)
        # This caller has asked for a description first, which is a start like any other: the application may stay.
        with contextlib.suppress(GLib.Error, ProcessLookupError):
            os.kill(self.application.process_id(), 9)
        self.application.wait_gone()

    def test_opened_by_the_menu_entry_they_are_one_share(self):
        one, two = self.file("one.jpg"), self.file("two.txt")
        self.run_turning("gio", "launch", ENTRY, one, two)
        self.wait_one_share(one, two)
        # It was started on the way and has nothing to do.
        self.application.wait_gone()

    def test_a_kind_of_file_can_belong_to_it(self):
        with open(os.path.join(os.environ["XDG_CONFIG_HOME"], "mimeapps.list"), "w", encoding="utf-8") as file:
            file.write(f"[Default Applications]\ntext/vcard={world.APP}.desktop\n")
        path = self.file("card.vcf")
        self.run_turning("gio", "open", path)
        self.wait_one_share(path)
        self.application.wait_gone()

    def test_the_menu_of_files_offers_it_for_files(self):
        place = importlib.util.spec_from_file_location(
            "pelliko_send", os.path.join(SHARE, "nautilus-python", "extensions", "pelliko_send.py"))
        extension = importlib.util.module_from_spec(place)
        place.loader.exec_module(extension)
        provider = extension.PellikoSend()
        one, two = self.file("one.jpg"), self.file("two.txt")
        files = [ChosenFile(GLib.filename_to_uri(path)) for path in (one, two)]
        self.assertEqual([], provider.get_file_items([*files, ChosenFile("file:///tmp", folder=True)]))
        self.assertEqual([], provider.get_file_items([ChosenFile("sftp://example.org/a.txt")]))
        self.assertEqual([], provider.get_file_items([]))
        (item,) = provider.get_file_items(files)
        self.assertEqual("Mit Pelliko senden", item.props.label)
        item.activate()
        self.wait_one_share(one, two)
        self.application.wait_gone()


if __name__ == "__main__":
    unittest.main(verbosity=2)
