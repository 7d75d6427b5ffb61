"""The recipient picker: what it shows of a request and of the contacts, and the request that goes on."""

import base64
import json
import os
import shutil
import subprocess
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "common"))

import companion_case  # noqa: E402
import doubles  # noqa: E402
import reach  # noqa: E402
import screen  # noqa: E402
import world  # noqa: E402

NAMESPACE = "http://tizen.org/appcontrol/"
TO = NAMESPACE + "data/to"
STORE = os.path.join(os.environ["XDG_DATA_HOME"], "pelliko-platform", "contacts.db")
ONE_CHOSEN = "1 person is chosen. At most 10 people at once."
TWO_CHOSEN = "2 people are chosen. At most 10 people at once."
SEARCH = "Search for a name or number"
PICTURE = os.path.join(os.environ["PELLIKO_BUILD"], "app", "shared", "res", "com.velmora.pelliko.png")


def add_people(*people):
    """Adds (name, number, base64 of a picture), all at once."""
    path = os.path.join(os.environ["HOME"], "people.vcf")
    with open(path, "w", encoding="utf-8") as file:
        for name, number, picture in people:
            photo = f"PHOTO;ENCODING=b;TYPE=PNG:{picture}\n" if picture else ""
            file.write(f"BEGIN:VCARD\nVERSION:3.0\nFN:{name}\nTEL;TYPE=CELL:{number}\n{photo}END:VCARD\n")
    world.run("contacts-tool", "import", path)


class PickerCase(companion_case.CompanionCase):
    program = "com.velmora.pelliko-picker"

    @classmethod
    def setUpClass(cls):
        with open(PICTURE, "rb") as file:
            picture = base64.b64encode(file.read()).decode()
        world.run("contacts-tool", "add", "--name", "Bo Example", "--number", "+44 7700 900456", "--joined")
        add_people(("Ann Example", "+44 7700 900123", ""), ("Ann Example", "+44 20 7946 0123", ""),
                   ("Zoë Älbrecht", "+49 151 12345678", picture), ("ليلى العربية", "+971501234567", ""),
                   ("A name that goes on and on, as those of a lodge or of a parish council do", "+44 7700 900999", ""),
                   *((f"Person {n:02}", f"+44 7700 9010{n:02}", "") for n in range(10)))
        ids = {contact["number"]: contact["number_id"] for contact in world.contacts()}
        cls.ann, cls.office, cls.bo = ids["+44 7700 900123"], ids["+44 20 7946 0123"], ids["+44 7700 900456"]
        cls.ten = [ids[f"+44 7700 9010{n:02}"] for n in range(10)]

    def setUp(self):
        super().setUp()
        self.pelliko = doubles.Application("com.velmora.pelliko")
        self.addCleanup(self.pelliko.close)

    def row(self, start):
        return screen.wait_for_row(start, "list item")

    def choose(self, start, seen):
        screen.press_row(self.row(start), seen)

    def type(self, text):
        screen.type_into(SEARCH, text)

    @staticmethod
    def move_store(old, new):
        for end in ("", "-wal", "-shm"):
            if os.path.exists(new + end):
                os.remove(new + end)
            if os.path.exists(old + end):
                shutil.move(old + end, new + end)

    def share_photo(self, *options):
        self.launch("share", "--uri", "file:///home/me/photo.jpg", *options)
        self.see("\u2068photo.jpg\u2069")


class Requests(PickerCase):
    def test_the_same_request_goes_on_with_the_people(self):
        self.launch("multi_share", "--extra-array", "appcontrol/data/path=/tmp/plan.pdf", "--extra-array",
                    "appcontrol/data/path=/tmp/photo.jpg", "--extra", "of_the_sender=kept")
        self.see("2 files · \u2068plan.pdf\u2069, \u2068photo.jpg\u2069")
        self.picture("start")
        self.choose("Bo Example, +44 7700 900456, Sees it in Pelliko", ONE_CHOSEN)
        self.row("Chosen: \u2068Bo Example")
        self.type("albr")  # neither case nor dots matter
        self.choose("Zoë Älbrecht, +49 151 12345678, Gets an SMS with the link", TWO_CHOSEN)
        self.picture("two")
        self.press("Remove \u2068Zoë Älbrecht\u2069")
        self.see(ONE_CHOSEN)
        self.type("+44 7700 900777")
        self.choose("Send to \u2068+447700900777\u2069, Not in your contacts", TWO_CHOSEN)
        self.press("Share")
        request = self.pelliko.wait_request()
        self.application.wait_gone()
        added = [contact for contact in world.contacts() if contact["number"] == "+447700900777"]
        self.assertEqual(["+447700900777"], [contact["name"] for contact in added])
        self.assertEqual(NAMESPACE + "operation/multi_share", request["operation"])
        self.assertEqual({NAMESPACE + "data/path": ["/tmp/plan.pdf", "/tmp/photo.jpg"], "of_the_sender": "kept",
                          TO: [str(self.bo), str(added[0]["number_id"])], "ct_app_id": "com.velmora.pelliko"},
                         request["extras"])

    def test_a_sender_that_waits_is_told_how_it_ended(self):
        contacts = world.contacts()
        for button, result in (("Cancel", -2), ("Share", 0)):
            sender = subprocess.Popen(["app-launch", "--app", self.program, "--operation", "appcontrol/operation/share",
                                       "--uri", "/tmp/photo.jpg", "--extra-array", f"appcontrol/data/to={self.ann}|x",
                                       "--wait-reply"], stdout=subprocess.PIPE)
            self.see(ONE_CHOSEN)  # whom the request names
            self.press(button)
            if button == "Share":
                self.pelliko.wait_request()
            self.assertEqual(result, json.loads(sender.communicate(timeout=world.LIMIT)[0])["result"])
            self.application.wait_gone()
        self.assertEqual([[str(self.ann)]], [request["extras"][TO] for request in self.pelliko.requests])
        self.assertEqual(contacts, world.contacts())

    def test_a_sender_whose_picker_is_killed_is_told_and_asks_again(self):
        request = ["app-launch", "--app", self.program, "--operation", "appcontrol/operation/share", "--uri",
                   "/tmp/photo.jpg", "--extra-array", f"appcontrol/data/to={self.ann}"]
        sender = subprocess.Popen([*request, "--wait-reply"], stdout=subprocess.PIPE)
        self.see(ONE_CHOSEN)
        self.assertTrue(self.application.kill())
        self.assertEqual(-2, json.loads(sender.communicate(timeout=world.LIMIT)[0])["result"])
        self.assertEqual([], self.pelliko.requests)
        world.run(*request)
        self.see(ONE_CHOSEN)
        self.press("Share")
        self.assertEqual([str(self.ann)], self.pelliko.wait_request()["extras"][TO])

    def test_each_request_has_its_window(self):
        self.share_photo()
        self.launch("share_text", "--extra", "appcontrol/data/text=Meet at 7\nat the harbour")
        self.see("A text · \u2068Meet at 7 at the harbour\u2069")
        self.picture("text")
        screen.key("Escape")
        self.wait_away("A text · \u2068Meet at 7 at the harbour\u2069")
        self.see("\u2068photo.jpg\u2069")
        self.assertEqual([], self.pelliko.requests)

    def test_an_earlier_share_is_told_by_its_files(self):
        service = doubles.SharesService()
        self.addCleanup(service.close)
        questions = []
        service.on_ListSent = lambda call, _sender: questions.append(call)
        self.launch("share", "--extra", "pk_reshare=7")
        self.see("Files that you have shared before")
        world.wait_for(lambda: questions, "the question what was shared")
        sent = doubles.sent(7, doubles.AVAILABLE, [], files=[("plan.pdf", 1, "")] * 5)
        questions[0].return_value(doubles.GLib.Variant("(aa{sv})", ([sent],)))
        self.see("5 files · " + ", ".join(["\u2068plan.pdf\u2069"] * 3) + " and 2 more")

    def test_a_start_without_anything_to_share_says_what_to_do(self):
        self.launch()
        self.see("There is nothing to share here. Choose files in another application and share them from there.")
        self.picture("nothing")
        screen.wait_active("pelliko-picker")
        screen.key("Return")
        self.application.wait_gone()


class People(PickerCase):
    def test_every_control_has_a_name_for_readers(self):
        self.share_photo(*world.recipients_option([self.bo]))
        self.row("Chosen: \u2068Bo Example")
        self.assertEqual([], reach.unnamed())

    def test_the_keyboard_is_enough(self):
        self.share_photo()
        screen.wait_active("pelliko-picker")
        for text in ("020 7946", "bo"):
            world.run("xdotool", "type", "--delay", "5", text)
            screen.wait_seen(lambda: screen.text_of(SEARCH) == text, "what is typed")
            screen.key("Return")
            screen.wait_seen(lambda: screen.text_of(SEARCH) == "", "the next search")
        self.see(TWO_CHOSEN)
        screen.wait_still()
        for name in ("Tab", "Tab", "Tab", "Tab", "Tab", "Return"):  # both people, the list and Cancel lie between
            screen.key(name)
        self.assertEqual([str(self.office), str(self.bo)], self.pelliko.wait_request()["extras"][TO])

    def test_nobody_comes_after_the_tenth(self):
        self.share_photo(*world.recipients_option(self.ten))
        self.see("10 people are chosen. At most 10 people at once.")
        self.choose("Bo Example", "At most 10 people at once.")
        self.picture("ten")
        self.press("Share")
        self.assertEqual([str(one) for one in self.ten], self.pelliko.wait_request()["extras"][TO])

    def test_a_number_is_offered_once_it_is_whole(self):
        self.share_photo()
        self.type("7700")
        self.row("Ann Example")
        self.type("0999 12")
        self.see("Type the whole number with its country code, such as +44 7700 900123.")
        self.picture("half-a-number")
        self.type("+49 151 12345678")  # somebody has it
        self.row("Zoë Älbrecht")
        self.wait_away("Send to \u2068+4915112345678\u2069, Not in your contacts, Gets an SMS with the link")
        self.type("nobody")
        self.see("Nobody is called so.")

    def test_contacts_that_cannot_be_read_are_asked_for_again(self):
        away = STORE + ".away"
        self.move_store(STORE, away)
        self.addCleanup(self.move_store, away, STORE)
        with open(STORE, "w", encoding="utf-8") as file:
            file.write("This is no database. " * 100)
        self.share_photo()
        self.see("The contacts cannot be read.")
        self.picture("unreadable")
        os.remove(STORE)
        self.press("Try again")
        self.see("No contacts yet. Type a phone number to share with.")
        self.picture("empty")
        screen.key("Escape")
        self.application.wait_gone()

    def test_it_changes_its_language_while_it_is_open(self):
        self.share_photo()
        self.choose("Ann Example, \u2066+44 20 7946 0123\u2069 · Mobile", ONE_CHOSEN)
        self.addCleanup(self.language, "en_GB.UTF-8")
        for language, title in (("de_DE.UTF-8", "Teilen mit"), ("ar", "المشاركة مع")):
            self.language(language)
            self.see(title)
            self.picture(language[:2])
        self.row("تم اختيار: ")


if __name__ == "__main__":
    unittest.main(verbosity=2)
