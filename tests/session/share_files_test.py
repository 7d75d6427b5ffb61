"""Files that another application hands over reach every recipient's link unchanged."""

import unittest

import share_case
import world


class ShareFiles(share_case.ShareCase):
    def test_one_file_reaches_two_recipients(self):
        data = share_case.random_bytes(300_000)
        path = self.file("holiday photo.jpg", data)
        ids = [world.add_contact("Ann Example", "+44 7700 900123"), world.add_contact("Bo Example", "+44 7700 900456")]
        world.share([path], ids)
        self.confirm()
        sent = self.wait_sent_and_gone()
        self.assertEqual("Succeeded: 1", sent["content"])
        messages = self.messages(2)
        self.assertEqual(["+447700900123", "+447700900456"], [m["to"] for m in messages])
        self.assertEqual(1, len({m["text"] for m in messages}), "every recipient gets the same text")
        for message in messages:
            self.assert_downloads_equal(message, {"holiday photo.jpg": data})
        self.assertEqual([], self.pending_rows())
        with open(path, "rb") as own:
            self.assertEqual(data, own.read(), "the person's own file stays")

    def test_a_hundred_files_arrive_as_one_share(self):
        files = {f"page {n:03}.txt": share_case.random_bytes(1_000 + 37 * n, seed=n) for n in range(100)}
        paths = [self.file(name, data) for name, data in files.items()]
        number_id = world.add_contact("Cy Example", "+44 7700 900789")
        world.share(paths, [number_id])
        self.confirm()
        sent = self.wait_sent_and_gone()
        self.assertEqual("Succeeded: 100", sent["content"])
        self.assert_downloads_equal(self.messages(1)[0], files)
        self.assertEqual([], self.pending_rows())

    def test_names_with_quotes_and_other_scripts_come_back_as_they_were(self):
        files = {'say "hi".txt': b"quoted", "写真 фото صورة.jpg": b"\xff\xd8scripts", "semi;colon.pdf": b"%PDF-1.4"}
        paths = [self.file(name, data) for name, data in files.items()]
        world.share(paths, [world.add_contact("Di Example", "+44 7700 900321")])
        self.confirm()
        self.wait_sent_and_gone()
        self.assert_downloads_equal(self.messages(1)[0], files)


if __name__ == "__main__":
    unittest.main(verbosity=2)
