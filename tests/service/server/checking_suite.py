"""`check`: what is known about files and the bytes that there are agree, or it says what does not."""

import io
import os
import re
import subprocess
import zipfile

import harness
from harness import ServerCase


class Checking(ServerCase):
    def check(self, *options, status=0):
        done = subprocess.run([harness.PROGRAM, "check", *self.stores, *options], capture_output=True, text=True)
        self.assertEqual(done.returncode, status, done.stdout + done.stderr)
        return done.stdout

    def lose(self, *contents):
        """Takes the bytes of these files away and has it noted."""
        for path in self.blob_files():
            with open(path, "rb") as file:
                lost = file.read() in contents
            if lost:
                os.unlink(path)
        self.assertIn(f"{len(contents)} lost", self.check("--mend"))

    def test_sound_data_beside_an_upload_that_runs(self):
        self.make_finished(b"hello", b"")
        share = self.make_share(100000)
        connection = self.connect()
        connection.sendall(self.patch_head(share["files"][0]["upload"], 0, 100000) + bytes(50000))
        self.assertEqual(self.offset(share["files"][0]["upload"]) <= 50000, True)
        self.assertIn("0 lost, 0 strays", self.check("--mend"))
        connection.sendall(bytes(50000))
        self.assertIn(b" 204 ", connection.recv(65536))

    def test_a_lost_file_is_told_and_its_page_says_so(self):
        share, link = self.make_finished(b"hello", b"others stay")
        path, = [file for file in self.blob_files() if os.stat(file).st_size == 5]
        os.unlink(path)
        found = self.check(status=1)
        self.assertIn(f"lost: 0 of 5 bytes are there of file 1 of the share {share['share']}", found)
        self.assertIn("1 lost, 0 strays", found)
        self.assertIn("1 lost, 0 strays, 0 with leftovers, 0 unused rows; 1 mended", self.check("--mend"))
        self.assertIn("0 lost", self.check())
        page = self.get(link + "/0")
        self.assertEqual(page.status, 410)
        self.assertIn(b"<h1>This file is lost</h1>", page.body)
        for asked in ({"If-None-Match": "*"}, {"Range": "bytes=99-"}):
            self.assertEqual(self.request("GET", link + "/0", headers=asked, token=False).status, 410, asked)
        self.assertEqual(self.get(link + "/1").body, b"others stay")
        again = self.post_share({"reshare_of": share["share"], "recipients": [{"number": "+491511111"}]})
        self.assert_refused(again, 410, "gone")

    def test_the_page_of_a_share_offers_what_is_left(self):
        kept = [b"others stay", b"and so do these"]
        share, link = self.make_finished(b"hello", *kept, names=["<gone>.jpg", "a.jpg", "b.jpg"])
        self.lose(b"hello")
        page = self.get(link)
        self.assertEqual(page.status, 200)
        for there in ("<h1>2 files from ", "1 more file is lost", "26 bytes in all", "Download all (<bdi>26 bytes</bdi>)",
                      "<s><bdi>&lt;gone&gt;.jpg</bdi></s>", "Lost: ask the sender to share it again."):  # fmt: skip
            self.assertIn(there, page.body.decode())
        addresses = re.findall(r'href="[^"]*(/[^"/]+)" download', page.body.decode())
        self.assertEqual(addresses, ["/all.zip", "/1", "/2"])
        with zipfile.ZipFile(io.BytesIO(self.get(link + "/all.zip").body)) as archive:
            self.assertIsNone(archive.testzip())
            self.assertEqual([(name, archive.read(name)) for name in archive.namelist()],
                             list(zip(["a.jpg", "b.jpg"], kept)))  # fmt: skip
        record = self.request("GET", "/api/v1/shares/" + share["share"]).json()
        self.assertEqual([file.get("lost") for file in record["files"]], [True, None, None])
        self.request("DELETE", "/api/v1/shares/" + share["share"])
        record = self.request("GET", "/api/v1/shares/" + share["share"]).json()
        self.assertEqual([file.get("lost") for file in record["files"]], [None] * 3, "what has ended is not lost")

    def test_the_last_file_that_is_left_needs_no_zip(self):
        _, link = self.make_finished(b"hello", b"others stay")
        self.lose(b"hello")
        page = self.get(link).body.decode()
        self.assertIn("<h1>1 file from ", page)
        self.assertIn("Download (<bdi>11 bytes</bdi>)", page)
        self.assertEqual(re.findall(r'href="[^"]*(/[^"/]+)" download', page), ["/1", "/1"])
        with zipfile.ZipFile(io.BytesIO(self.get(link + "/all.zip").body)) as archive:
            self.assertEqual(archive.namelist(), ["file1"])

    def test_a_share_of_which_nothing_is_left_says_so(self):
        _, several = self.make_finished(b"hello", b"world")
        _, one = self.make_finished(b"text that the page would show", names=["memo.txt"])
        self.lose(b"hello", b"world", b"text that the page would show")
        for path, heading in ((several, "These files are lost"), (several + "/all.zip", "These files are lost"),
                              (one, "This file is lost"), (one + "/all.zip", "This file is lost")):  # fmt: skip
            page = self.get(path)
            self.assertEqual(page.status, 410, path)
            self.assertIn(f"<h1>{heading}</h1>", page.body.decode())

    def test_an_upload_whose_bytes_are_lost_begins_again(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        self.assertEqual(self.patch(upload, 0, b"01234").status, 204)
        os.truncate(self.blob_files()[0], 3)
        self.assertIn("lost: 3 of 5 bytes are there of file 1 of the unfinished share", self.check(status=1))
        self.check("--mend")
        self.assertEqual(self.offset(upload), 0)
        self.assertEqual(self.patch(upload, 0, b"0123456789").status, 204)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, b"0123456789")

    def test_strays_are_removed(self):
        _, link = self.make_finished(b"hello")
        stray = os.path.join(self.data, "blobs", "AA", "A" * 22)
        os.makedirs(os.path.dirname(stray), exist_ok=True)
        with open(stray, "wb") as file:
            file.write(b"12345")
        self.assertIn(f"stray: nobody knows {'A' * 22}, 5 bytes", self.check(status=1))
        self.assertTrue(os.path.exists(stray))
        self.assertIn("1 strays, 0 with leftovers, 0 unused rows; 1 mended", self.check("--mend"))
        self.assertFalse(os.path.exists(stray))
        self.assertEqual(self.get(link + "/0").body, b"hello")

    def test_without_accounts_nothing_is_removed(self):
        self.make_finished(b"hello")
        self.stop()
        self.change_database("DELETE FROM files")
        self.change_database("DELETE FROM blobs")
        self.change_database("DELETE FROM accounts")
        self.assertIn("1 strays", self.check("--mend", status=1))
        self.assertEqual(len(self.blob_files()), 1)

    def test_a_row_without_a_file_goes(self):
        self.make_finished(b"hello")
        self.change_database("DELETE FROM files")
        self.assertIn("unused: no file has", self.check(status=1))
        self.assertIn("1 unused rows; 1 mended", self.check("--mend"))
        self.check()

    def test_what_it_cannot_look_at(self):
        done = subprocess.run([harness.PROGRAM, "check", "--data", self.directory + "/nowhere"], capture_output=True,
                              text=True)
        self.assertEqual(done.returncode, 2)
        self.assertRegex(done.stderr, "^pelliko-server: [^\n]+\n$")
