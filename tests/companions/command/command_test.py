"""The command on a terminal: what it sends for which words, what it says when it cannot, how it tells of uploads."""

import json
import os
import subprocess
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "common"))
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "..", "scripts", "lib"))
sys.dont_write_bytecode = True

import doubles  # noqa: E402
import world  # noqa: E402
from gi.repository import Gio, GLib  # noqa: E402

OPERATION = "http://tizen.org/appcontrol/operation/"
DATA = "http://tizen.org/appcontrol/data/"
PICKER = world.APP + "-picker"
DONE, FAILED, USAGE, RECIPIENT, UNREACHABLE = range(5)


class Said:
    """What a run of the command came to."""

    def __init__(self, process, out, err):
        self.status, self.out = process.get_exit_status(), out
        # The platform's log goes there, too, where no journal is.
        self.err = "".join(line for line in err.splitlines(keepends=True) if not line.startswith("E/"))


def pelliko(*words, text=None, environment=None):
    """Runs the command while the loop goes on turning: who it calls may live in this process."""
    launcher = Gio.SubprocessLauncher.new(Gio.SubprocessFlags.STDIN_PIPE | Gio.SubprocessFlags.STDOUT_PIPE |
                                          Gio.SubprocessFlags.STDERR_PIPE)
    for name, value in (environment or {}).items():
        launcher.setenv(name, value, True)
    process = launcher.spawnv(["pelliko", *words])
    answers = []
    process.communicate_async(GLib.Bytes.new(text or b""), None,
                              lambda source, result: answers.append(source.communicate_finish(result)))
    world.wait_for(lambda: answers, f"pelliko {words} to end")
    _, out, err = answers[0]
    return Said(process, out.get_data().decode(), err.get_data().decode())


class CommandCase(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.folder = os.path.join(os.environ["PELLIKO_STATE"], "files")
        if not os.path.exists(cls.folder):
            os.mkdir(cls.folder)
            for name, number in (("Anna Berg", "+4915112345678"), ("Anna Klein", "+4915187654321"),
                                 ("Zoë Doe", "+447700900107"), ("Two Phones", "+447700900108"),
                                 ("Two Phones", "+447700900109")):
                world.add_contact(name, number)
        cls.ids = {(one["name"], one["number"]): str(one["number_id"]) for one in world.contacts()}

    def file(self, name, data=b"data"):
        path = os.path.join(self.folder, name)
        with open(path, "wb") as file:
            file.write(data)
        return path

    def application(self, name=world.APP):
        application = doubles.Application(name)
        self.addCleanup(application.close)
        return application

    def assert_says(self, said, status, *parts):
        self.assertEqual((status, ""), (said.status, said.out), said.err)
        self.assertTrue(said.err.startswith("pelliko: "), said.err)
        for part in parts:
            self.assertIn(part, said.err)


class Sharing(CommandCase):
    def test_one_file_is_a_share_with_the_person_of_that_name(self):
        application = self.application()
        path = self.file("a b.txt")
        said = pelliko("share", path, "--to", "zoë doe")
        self.assertEqual((DONE, "", ""), (said.status, said.out, said.err))
        (request,) = application.requests
        self.assertEqual(OPERATION + "share", request["operation"])
        self.assertEqual(path, request["uri"])
        self.assertEqual({DATA + "to": [self.ids["Zoë Doe", "+447700900107"]], "ct_app_id": world.APP}, request["extras"])

    def test_several_files_are_one_multi_share(self):
        application = self.application()
        paths = [self.file(name) for name in ("one.txt", "-two.txt", "three:3.txt")]
        said = pelliko("share", paths[0], "--to", "Klein", "--to", "+44 (7700) 900-107", "--to", "Zoë Doe", *paths[1:])
        self.assertEqual((DONE, ""), (said.status, said.err))
        (request,) = application.requests
        self.assertEqual(OPERATION + "multi_share", request["operation"])
        self.assertEqual(paths, request["extras"][DATA + "path"])
        self.assertEqual([self.ids["Anna Klein", "+4915187654321"], self.ids["Zoë Doe", "+447700900107"]],
                         request["extras"][DATA + "to"])

    def test_files_are_named_from_the_folder_one_is_in_and_by_address(self):
        picker = self.application(PICKER)
        self.file("here.txt")
        self.file("ü.txt")
        os.chdir(self.folder)
        said = pelliko("share", "here.txt", "file://" + self.folder + "/%C3%BC.txt")
        self.assertEqual((DONE, ""), (said.status, said.err))
        self.assertEqual([self.folder + "/here.txt", self.folder + "/ü.txt"],
                         picker.requests[0]["extras"][DATA + "path"])

    def test_without_recipients_the_picker_gets_the_request(self):
        application, picker = self.application(), self.application(PICKER)
        path = self.file("photo.jpg")
        self.assertEqual(DONE, pelliko("share", path).status)
        self.assertEqual([], application.requests)
        self.assertEqual((OPERATION + "share", path), (picker.requests[0]["operation"], picker.requests[0]["uri"]))
        self.assertNotIn(DATA + "to", picker.requests[0]["extras"])

    def test_a_number_that_nobody_has_becomes_a_contact(self):
        application = self.application()
        self.assertEqual(DONE, pelliko("share", self.file("n.txt"), "--to", "+447700900999").status)
        (added,) = [one for one in world.contacts() if one["number"] == "+447700900999"]
        self.assertEqual([str(added["number_id"])], application.requests[0]["extras"][DATA + "to"])

    def test_files_that_cannot_be_shared_are_named(self):
        application = self.application()
        good = self.file("good.txt")
        for name, reason in ((self.folder + "/none.txt", "there is no file"), (self.folder, "is a folder"),
                             (self.file("empty.txt", b""), "is empty"), ("/dev/null", "not a file that can be shared")):
            self.assert_says(pelliko("share", good, name, "--to", "Klein"), FAILED, name, reason)
        self.assertEqual([], application.requests)

    def test_people_who_are_not_known_for_certain_get_nothing(self):
        application = self.application()
        before = world.contacts()
        path = self.file("p.txt")
        self.assert_says(pelliko("share", path, "--to", "Anna"), RECIPIENT, "Anna Berg  +4915112345678",
                         "Anna Klein  +4915187654321")
        self.assert_says(pelliko("share", path, "--to", "two phones"), RECIPIENT, "+447700900108", "+447700900109")
        self.assert_says(pelliko("share", path, "--to", "+447700900888", "--to", "Nobody"), RECIPIENT, "“Nobody”")
        self.assert_says(pelliko("share", path, *(word for i in range(11) for word in ("--to", f"+44770090080{i}"))),
                         RECIPIENT, "at most 10")
        self.assertEqual((before, []), (world.contacts(), application.requests))

    def test_text_comes_from_words_or_from_standard_input(self):
        application, picker = self.application(), self.application(PICKER)
        self.assertEqual(DONE, pelliko("text", "See", "you", "--to", "Klein").status)
        self.assertEqual((OPERATION + "share_text", "See you"),
                         (application.requests[0]["operation"], application.requests[0]["extras"][DATA + "text"]))
        self.assertEqual(DONE, pelliko("text", text="Zwölf\nBoxkämpfer\n".encode()).status)
        self.assertEqual(DONE, pelliko("text", "-", text=b"minus").status)
        self.assertEqual(["Zwölf\nBoxkämpfer\n", "minus"], [one["extras"][DATA + "text"] for one in picker.requests])

    def test_what_is_no_text_is_refused(self):
        self.assert_says(pelliko("text", text=b" \n"), FAILED, "empty")
        self.assert_says(pelliko("text", text=b"\xff\xfe"), FAILED, "not text")
        self.assert_says(pelliko("text", text=b"a\0b"), FAILED, "not text")
        self.assert_says(pelliko("text", text=b"x" * (1 << 20) + b"x"), FAILED, "1 MiB")

    def test_a_bus_that_is_not_there_is_told(self):
        said = pelliko("share", self.file("f.txt"), "--to", "Klein",
                       environment={"DBUS_SESSION_BUS_ADDRESS": "unix:path=/nowhere"})
        self.assert_says(said, UNREACHABLE, "no session bus")
        said = pelliko("status", environment={"DBUS_SESSION_BUS_ADDRESS": "unix:path=/nowhere"})
        self.assert_says(said, UNREACHABLE, "upload service")

    def test_an_application_that_ends_meanwhile_is_told(self):
        application = self.application()
        application.on_Launch = lambda call, *_: call.return_dbus_error("org.example.Gone", "gone")
        self.assert_says(pelliko("share", self.file("g.txt"), "--to", "Klein"), UNREACHABLE, "Pelliko")


class Words(CommandCase):
    def test_every_command_has_help_and_mistakes_have_one_line(self):
        for words in ([], ["share"], ["text"], ["contacts"], ["status"]):
            said = pelliko(*words, "--help")
            self.assertEqual((DONE, ""), (said.status, said.err))
            self.assertIn("Usage: pelliko", said.out)
        self.assertRegex(pelliko("--version").out, r"^pelliko \d+\.\d+\.\d+\n$")
        for words in ([], ["share"], ["frobnicate"], ["status", "--fast"], ["share", "x", "--to"]):
            said = pelliko(*words)
            self.assert_says(said, USAGE, "--help")
            self.assertEqual(1, said.err.count("\n"), said.err)

    def test_contacts_are_listed_for_programs(self):
        self.assertEqual("Anna Berg\t+4915112345678\nAnna Klein\t+4915187654321\n", pelliko("contacts", "anna").out)
        self.assertEqual("Zoë Doe\t+447700900107\n", pelliko("contacts", "900107").out)
        (berg,) = json.loads(pelliko("contacts", "berg", "--json").out)
        self.assertEqual({"number_id": int(self.ids["Anna Berg", "+4915112345678"]), "name": "Anna Berg",
                          "number": "+4915112345678"}, berg)
        self.assert_says(pelliko("contacts", "nobody"), RECIPIENT, "“nobody”")


class Status(CommandCase):
    def setUp(self):
        self.service = doubles.SharesService()
        self.addCleanup(self.service.close)
        zoe = [("+447700900107", int(self.ids["Zoë Doe", "+447700900107"]), doubles.SMS)]
        files = [("a.jpg", 1_500_000, "image/jpeg"), ("b.pdf", 900_000, "")]
        self.share = lambda number, state, percent=0, error=0: doubles.sent(number, state, zoe, files, percent, error)

    def follow(self, *words):
        """A run of status --follow: its lines as they come, and its end."""
        process = subprocess.Popen(["pelliko", "status", "--follow", *words], stdout=subprocess.PIPE)
        os.set_blocking(process.stdout.fileno(), False)
        lines, rest = [], [b""]

        def read(*_):
            data = os.read(process.stdout.fileno(), 65536)
            *complete, rest[0] = (rest[0] + data).split(b"\n")
            lines.extend(line.decode() for line in complete)
            return bool(data)

        GLib.io_add_watch(process.stdout, GLib.PRIORITY_DEFAULT, GLib.IOCondition.IN | GLib.IOCondition.HUP, read)
        self.addCleanup(process.stdout.close)
        process.returncode = 0  # the loop waits for it
        ends = []
        GLib.child_watch_add(GLib.PRIORITY_DEFAULT, process.pid,
                             lambda _pid, status: ends.append(os.waitstatus_to_exitcode(status)))
        return lines, ends

    def test_a_list_of_all_uploads(self):
        self.assertIn("Nothing was shared", pelliko("status").out)
        self.service.sent = [self.share(3, doubles.UPLOADING, 43), self.share(2, doubles.FAILED, 5, -7),
                             self.share(1, doubles.AVAILABLE, 100)]
        lines = pelliko("status").out.splitlines()
        self.assertRegex(lines[0], r"^ +3  uploading 43 % +2 files, 2\.4.MB for Zoë Doe$")
        self.assertRegex(lines[1], r"^ +2  failed \(error -7\) ")
        found = json.loads(pelliko("status", "--json").out)
        self.assertEqual([(3, "uploading", 43), (2, "failed", 5), (1, "available", 100)],
                         [(one["id"], one["state"], one["percent"]) for one in found])
        self.assertEqual([{"name": "Zoë Doe", "number": "+447700900107", "told": "sms"}], found[0]["recipients"])
        self.assertEqual("a.jpg", found[0]["files"][0]["name"])

    def test_an_upload_is_followed_to_its_end(self):
        self.service.sent = [self.share(8, doubles.UPLOADING, 10), self.share(7, doubles.AVAILABLE, 100)]
        lines, ends = self.follow()
        world.wait_for(lambda: lines, "the first line")
        for state, percent in ((doubles.UPLOADING, 60), (doubles.NOTIFYING, 100), (doubles.AVAILABLE, 100)):
            self.service.sent[0] = self.share(8, state, percent)
            self.service.change()
            seen = len(lines)
            world.wait_for(lambda: len(lines) > seen, "a line for the change")
        world.wait_for(lambda: ends, "the end")
        self.assertEqual([DONE], ends)
        self.assertEqual([["8", "uploading", "10"], ["8", "uploading", "60"], ["8", "telling", "2"],
                          ["8", "available", "2"]], [line.split()[:3] for line in lines])

    def test_a_failed_upload_ends_following_with_a_failure(self):
        self.service.sent = [self.share(9, doubles.PAUSED, 10)]
        lines, ends = self.follow("--json")
        world.wait_for(lambda: lines, "the first line")
        self.service.sent = [self.share(9, doubles.FAILED, 10, -5)]
        self.service.change()
        world.wait_for(lambda: ends, "the end")
        self.assertEqual([FAILED], ends)
        self.assertEqual(["paused", "failed"], [json.loads(line)["state"] for line in lines])

    def test_without_uploads_on_their_way_following_ends_at_once(self):
        self.service.sent = [self.share(7, doubles.FAILED, 100)]
        self.assertEqual((DONE, ""), (pelliko("status", "--follow").status, ""))


if __name__ == "__main__":
    unittest.main(verbosity=2)
