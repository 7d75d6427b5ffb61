"""What a recipient sees: page, files, ranges, the zip of all."""

import io
import os
import re
import zipfile
from urllib.parse import quote, unquote

from harness import ServerCase


class Downloads(ServerCase):
    def test_page_headers_keep_browsers_in_bounds(self):
        _, link = self.make_finished(b"12345")
        for path in [link, "/s/unknown"]:
            headers = self.get(path).headers
            self.assertEqual(headers["Content-Type"], "text/html; charset=utf-8")
            self.assertIn("default-src 'none'; img-src data:; style-src 'sha256-",
                          headers["Content-Security-Policy"])
            self.assertEqual(headers["X-Content-Type-Options"], "nosniff")
            self.assertEqual(headers["X-Frame-Options"], "DENY")
            self.assertEqual(headers["Referrer-Policy"], "no-referrer")
            self.assertIn("noindex", headers["X-Robots-Tag"])

    def test_whoever_comes_without_a_link_is_told_what_this_is(self):
        page = self.get("/", Accept_Language="he")
        self.assertEqual((page.status, page.headers["Content-Language"]), (200, "he"))
        self.assertIn("מאדם לאדם", page.body.decode())
        self.assertEqual(self.request("HEAD", "/", token=False).body, b"")

    def test_a_text_is_read_in_the_page_and_stays_a_text(self):
        text = "\ufeffGrüße <script>alert(1)</script>\r\n\x1bשלום"
        _, link = self.make_finished(text.encode(), names=["memo.txt"])
        shown = 'dir="auto">Grüße &lt;script&gt;alert(1)&lt;/script&gt;\nשלום</div>'
        self.assertIn(shown, self.get(link).body.decode())
        self.assertEqual(self.get(link + "/0").body, text.encode())
        long = self.make_finished(b"x" * 65537, names=["long.txt"])[1]
        strange = self.make_finished(b"\xff\xfeA\0", names=["strange.txt"])[1]
        for path in (long, strange):
            page = self.get(path)
            self.assertEqual(page.status, 200)
            self.assertNotIn(b'class="text"', page.body)

    def test_looking_at_a_page_changes_nothing(self):
        """Messengers fetch every link that they see, with HEAD or GET, before its reader does."""
        _, link = self.make_finished(b"12345")
        for method in ("HEAD", "GET"):
            for path in (link, link + "/0", link + "/all.zip"):
                self.assertEqual(self.request(method, path, token=False).status, 200)
        self.assertEqual(self.get(link + "/0").body, b"12345")

    def test_a_file_is_an_attachment_with_its_bytes(self):
        content = os.urandom(3000000)
        _, link = self.make_finished(content, b"", names=["ü \"1\".jpg", "empty"])
        answer = self.get(link + "/0")
        self.assertEqual((answer.status, answer.body), (200, content))
        self.assertEqual(answer.headers["Content-Disposition"],
                         "attachment; filename=\"_ _1_.jpg\"; filename*=UTF-8''" +
                         quote("ü \"1\".jpg"))
        self.assertEqual(answer.headers["Accept-Ranges"], "bytes")
        self.assertEqual(self.get(link + "/1").body, b"")

    def test_no_name_leaves_its_place_in_the_header_or_its_folder(self):
        names = {"../../etc/passwd": "passwd", "..\\..\\boot.ini": "boot.ini", "..": "file", "a/": "file",
                 "x.jpg\r\nSet-Cookie: a=b": "x.jpgSet-Cookie: a=b", "a\nb\0c.txt": "abc.txt",
                 "\"; filename=\"evil.exe": "\"; filename=\"evil.exe", "it's 100% *sure*;.txt": None,
                 "ไฟล์ – 写真 🎉.png": None, "\u202egpj.exe": "gpj.exe", "ü" * 200 + ".jpg": "ü" * 125 + ".jpg"}
        _, link = self.make_finished(*[b"1"] * len(names), names=list(names))
        for index, (name, shown) in enumerate(names.items()):
            headers = self.get(f"{link}/{index}").headers
            found = re.fullmatch(r"attachment; filename=\"([ -!#-\[\]-~]*)\"; filename\*=UTF-8''([!-~]+)",
                                 headers["Content-Disposition"])
            self.assertTrue(found, headers["Content-Disposition"])
            self.assertEqual(unquote(found[2], errors="strict"), shown or name)
            # Outside of the letters that the form allows plainly everything is written in percents.
            self.assertRegex(found[2], r"^([A-Za-z0-9!#$&+.^_`|~-]|%[0-9A-F]{2})+$")
            self.assertNotIn("Set-Cookie", headers)

    def test_head_has_the_length_and_no_body(self):
        _, link = self.make_finished(b"12345")
        for path in [link, link + "/0", link + "/all.zip"]:
            answer = self.request("HEAD", path, token=False)
            self.assertEqual((answer.status, answer.body), (200, b""))
        self.assertEqual(self.request("HEAD", link + "/0").headers["Content-Length"], "5")

    def test_ranges(self):
        _, link = self.make_finished(b"0123456789")
        for wanted, body, told in [("bytes=2-4", b"234", "bytes 2-4/10"),
                                   ("bytes=7-", b"789", "bytes 7-9/10"),
                                   ("bytes=-2", b"89", "bytes 8-9/10")]:
            answer = self.get(link + "/0", Range=wanted)
            self.assertEqual((answer.status, answer.body), (206, body))
            self.assertEqual(answer.headers["Content-Range"], told)
        self.assertEqual(self.get(link + "/0", Range="bytes=0-1,3-4").status, 200)

    def test_if_range_and_if_none_match(self):
        _, link = self.make_finished(b"0123456789", b"0123456789")
        etag = self.get(link + "/0").headers["ETag"]
        self.assertNotEqual(self.get(link + "/1").headers["ETag"], etag)
        self.assertEqual(self.get(link + "/0", Range="bytes=1-1", If_Range=etag).status, 206)
        self.assertEqual(self.get(link + "/0", Range="bytes=1-1", If_Range='"x"').status, 200)
        answer = self.get(link + "/0", If_None_Match=etag)
        self.assertEqual((answer.status, answer.body), (304, b""))

    def test_unknown_links_and_files_are_pages_too(self):
        _, link = self.make_finished(b"12345")
        for path in ["/s/", "/s/x", "/s/" + "A" * 22, link + "/1", link + "/x", link + "/-1",
                     link + "/0/0", link + "/99999999999999999999", "/s/../../etc/passwd",
                     link + "/../../metadata.db", link + "/%2e%2e"]:
            answer = self.get(path)
            self.assertEqual(answer.status, 404, path)
            self.assertIn(b"<h1>Nothing here</h1>", answer.body)

    def test_pages_speak_the_language_that_the_browser_asks_for(self):
        _, path = self.make_finished(b"12345")
        for asked, tag, words in (("pl, en;q=0.5", "pl", "Pobierz (<bdi>5 bajtów</bdi>)"), ("sw", "en", "Download (<bdi>5 bytes</bdi>)"),
                                  ("zh-HK", "zh-TW", "下載")):  # fmt: skip
            page = self.get(path, Accept_Language=asked)
            self.assertEqual(page.headers["Content-Language"], tag)
            self.assertEqual(page.headers["Vary"], "Accept-Language")
            self.assertIn(words, page.body.decode())
        unknown = self.get("/s/" + "A" * 22, Accept_Language="ar")
        self.assertEqual(unknown.status, 404)
        self.assertIn('<html lang="ar" dir="rtl">', unknown.body.decode())

    def test_zip_of_all_has_every_file_under_its_own_name(self):
        contents = [os.urandom(1000000), b"two", b"", b"three"]
        names = ["写真.jpg", "a.txt", "a.txt", "A.TXT"]
        _, link = self.make_finished(*contents, names=names)
        answer = self.get(link + "/all.zip")
        self.assertEqual(answer.headers["Content-Type"], "application/zip")
        with zipfile.ZipFile(io.BytesIO(answer.body)) as archive:
            self.assertIsNone(archive.testzip())
            self.assertEqual(archive.namelist(), ["写真.jpg", "a.txt", "a (2).txt", "A (3).TXT"])
            self.assertEqual([archive.read(name) for name in archive.namelist()], contents)
            self.assertTrue(all(i.compress_type == 0 for i in archive.infolist()))

    def test_zip_for_an_old_client_ends_with_the_connection(self):
        _, link = self.make_finished(b"1", b"2")
        connection = self.connect()
        connection.sendall(f"GET {link}/all.zip HTTP/1.0\r\n\r\n".encode())
        received = b""
        while part := connection.recv(65536):
            received += part
        head, body = received.split(b"\r\n\r\n", 1)
        self.assertNotIn(b"chunked", head)
        self.assertEqual(len(zipfile.ZipFile(io.BytesIO(body)).namelist()), 2)

    def test_lost_bytes_are_not_taken_for_the_whole(self):
        _, link = self.make_finished(b"12345")
        os.remove(self.blob_files()[0])
        page = self.get(link + "/0")
        self.assertEqual(page.status, 500)
        self.assertIn(b"The server could not answer. Try again later.", page.body)
