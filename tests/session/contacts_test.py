"""Contacts that are shared arrive as a vCard that another program reads."""

import base64
import subprocess
import unittest

import vobject

import share_case
import world

CONTACT_MIME = "application/vnd.tizen.contact"
PICTURE = b"\x89PNG\r\n\x1a\n" + share_case.random_bytes(20_000)
CARDS = """BEGIN:VCARD
VERSION:3.0
FN:Anna Müller; the one, "A" \\\\ B
TEL;TYPE=CELL,PREF:+49 151 1
TEL;TYPE=WORK:+49 30 2
PHOTO;ENCODING=b;TYPE=PNG:{photo}
END:VCARD
BEGIN:VCARD
VERSION:4.0
FN:王小明
TEL;VALUE=uri:tel:+86-10-1
END:VCARD
"""


def share_contacts(contact_ids, number_ids, operation="multi_share", *more):
    if operation == "share":
        ids = [word for i in contact_ids for word in ("--extra", f"appcontrol/data/id={i}")]
    else:
        ids = [word for i in contact_ids for word in ("--extra-array", f"appcontrol/data/id={i}")]
    return world.launch(operation, "--mime", CONTACT_MIME, *ids, *more, *world.recipients_option(number_ids))


class Contacts(share_case.ShareCase):
    def import_cards(self, text):
        world.run("contacts-tool", "import", self.file("cards.vcf", text.encode()))
        return {row["name"]: row["contact_id"] for row in world.contacts()}

    def download(self):
        """The one file behind the link of the one message: its name and its cards."""
        found = world.download_all(world.link_in(self.messages(1)[0]["text"]))
        self.assertEqual(1, len(found), found.keys())
        name, data = next(iter(found.items()))
        return name, list(vobject.readComponents(data.decode()))

    def test_several_contacts_arrive_in_one_file(self):
        ids = self.import_cards(CARDS.format(photo=base64.b64encode(PICTURE).decode()))
        names = ['Anna Müller; the one, "A" \\ B', "王小明"]
        recipient = world.add_contact("Rita Example", "+44 7700 900111")
        share_contacts([ids[name] for name in names], [recipient])
        self.confirm()
        self.wait_sent_and_gone()
        name, cards = self.download()
        self.assertEqual("contacts.vcf", name)
        self.assertEqual(names, [card.fn.value for card in cards])
        self.assertEqual(["+49 151 1", "+49 30 2"], [tel.value for tel in cards[0].contents["tel"]])
        self.assertEqual([["CELL", "PREF"], ["WORK"]], [tel.params["TYPE"] for tel in cards[0].contents["tel"]])
        self.assertEqual(PICTURE, cards[0].photo.value)
        self.assertEqual("+86-10-1", cards[1].tel.value)

    def test_two_hundred_contacts_arrive_too(self):
        text = "".join(f"BEGIN:VCARD\nVERSION:3.0\nFN:Many {n:03}\nTEL:+4930{n:05}\nEND:VCARD\n" for n in range(200))
        ids = self.import_cards(text)
        recipient = world.add_contact("Sam Example", "+44 7700 900222")
        wanted = [f"Many {n:03}" for n in range(200)]
        share_contacts([ids[name] for name in wanted], [recipient])
        self.confirm()
        self.wait_sent_and_gone()
        _name, cards = self.download()
        self.assertEqual(wanted, [card.fn.value for card in cards])
        self.assertIn("Contact file count is 100 or more. Showing Preparing... popup", self.log_lines())

    def test_the_own_card_is_shared(self):
        world.run("contacts-tool", "profile", "set", "--name", "Me Myself", "--number", "+49 1", "--number", "+49 2")
        recipient = world.add_contact("Tom Example", "+44 7700 900333")
        share_contacts(["0"], [recipient], "share", "--extra", "appcontrol/data/type=my_profile")
        self.confirm()
        self.wait_sent_and_gone()
        name, cards = self.download()
        self.assertEqual("Me Myself.vcf", name)
        self.assertEqual(["+49 1", "+49 2"], [tel.value for tel in cards[0].contents["tel"]])

    def test_a_contact_that_does_not_exist_shares_nothing(self):
        log = world.Follower(world.APP_LOG)
        share_contacts(["99999"], [], "share")
        log.wait(lambda lines: any(line.endswith("_createVcf failed!") for line in lines), "the log to say that it failed")
        self.assertEqual([], self.posted())
        subprocess.run(["kill", str(self.application.process_id())], check=True)
        self.application.wait_gone()


if __name__ == "__main__":
    unittest.main(verbosity=2)
