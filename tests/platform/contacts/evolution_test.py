"""Contacts of Evolution's address books come in, from the real data server on the private bus."""

import base64
import json
import subprocess
import unittest

from gi.repository import Gio, GLib

PICTURE = b"\x89PNG\r\n\x1a\n" + bytes(range(256)) * 8
BOOK = "org.gnome.evolution.dataserver.AddressBook"
CARDS = [
    "BEGIN:VCARD\r\nVERSION:3.0\r\nUID:one\r\nFN:Anna Müller\r\nN:Müller;Anna;;;\r\nTEL;TYPE=CELL:+49 151 1\r\n"
    "TEL;TYPE=WORK:+49 30 2\r\nPHOTO;ENCODING=b;TYPE=PNG:" + base64.b64encode(PICTURE).decode() + "\r\nEND:VCARD\r\n",
    "BEGIN:VCARD\r\nVERSION:3.0\r\nUID:two\r\nFN:王小明\r\nTEL:+86 10 1\r\nEND:VCARD\r\n",
    "BEGIN:VCARD\r\nVERSION:3.0\r\nUID:three\r\nFN:Friends\r\nX-EVOLUTION-LIST:TRUE\r\n"
    "EMAIL:anna@example.org\r\nEND:VCARD\r\n",
]


class Book:
    """The address book that every user of the data server has, over its own interface."""

    def __init__(self):
        self.bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        self.name = next(name for name in self._names() if name.startswith(BOOK))
        self.path, self.owner = self._call(self.name, "/org/gnome/evolution/dataserver/AddressBookFactory",
                                           BOOK + "Factory", "OpenAddressBook",
                                           GLib.Variant("(s)", ("system-address-book",)))
        self.call("Open", None)

    def _names(self):
        return self.bus.call_sync("org.freedesktop.DBus", "/", "org.freedesktop.DBus", "ListActivatableNames", None,
                                  None, 0, -1).unpack()[0]

    def _call(self, name, path, interface, method, arguments):
        return self.bus.call_sync(name, path, interface, method, arguments, None, 0, 60_000).unpack()

    def call(self, method, arguments):
        return self._call(self.owner, self.path, BOOK, method, arguments)


def tool(*words):
    return subprocess.run(["contacts-tool", *words], check=False, capture_output=True, text=True)


def numbers():
    return json.loads(tool("list", "--json").stdout)


class EvolutionImport(unittest.TestCase):
    def test_contacts_come_in_once_and_keep_their_number_ids(self):
        book = Book()
        uids = book.call("CreateContacts", GLib.Variant("(asu)", (CARDS, 0)))[0]
        self.assertEqual(3, len(uids))

        first = tool("import", "--evolution")
        self.assertEqual((0, "2 added, 0 updated, 1 skipped\n"), (first.returncode, first.stdout), first.stderr)
        self.assertIn("Friends: it is a group of people and no person; the card was skipped.", first.stderr)
        rows = numbers()
        self.assertEqual([("Anna Müller", "+49 151 1"), ("Anna Müller", "+49 30 2"), ("王小明", "+86 10 1")],
                         sorted((row["name"], row["number"]) for row in rows))

        anna = next(row["contact_id"] for row in rows if row["name"] == "Anna Müller")
        written = tool("export", str(anna), "--to", "/tmp")
        with open(written.stdout.strip(), encoding="utf-8", newline="") as file:
            text = file.read().replace("\r\n ", "")
        self.assertIn(base64.b64encode(PICTURE).decode(), text)

        again = tool("import", "--evolution")
        self.assertEqual("0 added, 2 updated, 1 skipped\n", again.stdout)
        self.assertEqual(rows, numbers())

        renamed = CARDS[1].replace("王小明", "Xiaoming Wang").replace("UID:two", "UID:" + uids[1])
        book.call("ModifyContacts", GLib.Variant("(asu)", ([renamed], 0)))
        self.assertEqual("0 added, 2 updated, 1 skipped\n", tool("import", "--evolution").stdout)
        self.assertEqual([row["number_id"] for row in rows], [row["number_id"] for row in numbers()])
        self.assertIn("Xiaoming Wang", [row["name"] for row in numbers()])


if __name__ == "__main__":
    unittest.main(verbosity=2)
