"""Received shares: what the recipient is told of them, downloads, and their end."""

import time

import checking_suite
from harness import NUMBER
from push_case import BERTA, CARL, STRANGER, PushCase


class Received(PushCase):
    check, lose = checking_suite.Checking.check, checking_suite.Checking.lose

    def receive(self, *contents):
        stream = self.listen()
        share, finished = self.share_with(BERTA, STRANGER, contents=contents or (b"hello",))
        return share, finished, stream.next()

    def test_record_of_a_received_share(self):
        share, finished, (number, token) = self.receive(b"hello", b"")
        record = {"id": number, "sender": NUMBER, "created": share["created"], "expires": finished["expires"],
                  "state": "available",
                  "files": [{"index": 0, "name": "file0.txt", "size": 5, "type": "text/plain"},
                            {"index": 1, "name": "file1.txt", "size": 0, "type": "text/plain"}]}
        self.assertEqual(self.received(token).json(), record)
        self.assertEqual(self.received(number).json(), record)
        self.assertEqual(self.received().json(), {"received": [record]})
        self.acknowledge(number)
        self.kill()
        self.start()
        self.assertEqual(self.received(token).json(), record)
        self.assertEqual(self.received().json(), {"received": [record]})

    def test_list_is_newest_first_and_of_the_account_alone(self):
        self.share_with(BERTA)
        self.share_with(BERTA, NUMBER)
        self.assertEqual([r["id"] for r in self.received().json()["received"]], [2, 1])
        self.assertEqual([r["id"] for r in self.received(token=self.token).json()["received"]], [1])

    def test_a_token_is_for_one_account(self):
        carl = self.run_account("add", "--number", CARL).strip()
        _, _, (_, token) = self.receive()
        for account in [self.token, carl]:
            for path, method in [(token, "GET"), (token + "/files/0", "GET"), (token, "DELETE"), (1, "GET")]:
                self.assert_refused(self.received(path, account, method), 404, "not_found")
        self.assertEqual(self.received(token).status, 200)

    def test_texts_that_are_no_token(self):
        self.receive()
        for text in ["A" * 22, "A" * 21, "A" * 23, "A" * 1000, "%41" * 7 + "A", "", "0", "-1", "01x", "2",
                     str(2**63), "1" * 22, "../1", "'"]:
            for path in [text, text + "/files/0"]:
                with self.subTest(path):
                    self.assert_refused(self.received(path + ("/" if not text else "")), 404, "not_found")

    def test_downloads_like_those_of_links(self):
        _, finished, (number, token) = self.receive(b"0123456789", b"")
        answer = self.received(token + "/files/0")
        self.assertEqual((answer.status, answer.body), (200, b"0123456789"))
        self.assertIn("file0.txt", answer.headers["Content-Disposition"])
        etag = answer.headers["ETag"]
        self.assertEqual(etag, self.get(finished["url"][len(self.url):] + "/0").headers["ETag"])
        part = self.received(token + "/files/0", headers={"Range": "bytes=4-", "If-Range": etag})
        self.assertEqual((part.status, part.body), (206, b"456789"))
        self.assertEqual(part.headers["Content-Range"], "bytes 4-9/10")
        changed = self.received(token + "/files/0", headers={"Range": "bytes=4-", "If-Range": '"x"'})
        self.assertEqual((changed.status, changed.body), (200, b"0123456789"))
        self.assert_refused(self.received(token + "/files/0", headers={"Range": "bytes=10-"}),
                            416, "range_not_satisfiable")
        self.assertEqual(self.received(token + "/files/0", method="HEAD").headers["Content-Length"], "10")
        self.assertEqual(self.received(f"{number}/files/1").body, b"")
        for index in ["2", "-1", "x", "99999999999999999999", ""]:
            self.assert_refused(self.received(f"{token}/files/{index}"), 404, "not_found")

    def test_a_file_that_the_store_has_lost(self):
        share, finished, (_, token) = self.receive(b"hello", b"others stay")
        self.lose(b"hello")
        self.assertEqual([file.get("lost") for file in self.received(token).json()["files"]], [True, None])
        self.assert_refused(self.received(token + "/files/0"), 410, "gone")
        self.assertEqual(self.received(token + "/files/1").body, b"others stay")
        self.assertIn(b"1 more file is lost", self.get(finished["url"][len(self.url):]).body)
        self.withdraw(share)
        self.assertEqual([file.get("lost") for file in self.received(token).json()["files"]], [None, None])

    def test_a_withdrawn_share_tells_that_it_was_withdrawn(self):
        share, _, (number, token) = self.receive()
        self.acknowledge(number)
        self.withdraw(share)
        self.assertEqual(self.received(token).json()["state"], "withdrawn")
        self.assertEqual(self.received().json()["received"][0]["state"], "withdrawn")
        self.assert_refused(self.received(token + "/files/0"), 410, "gone")

    def test_a_share_withdrawn_between_push_and_acknowledgement(self):
        share, _, (number, token) = self.receive()
        self.withdraw(share)
        self.assertEqual(self.acknowledge(number).status, 204)
        self.assertEqual(self.received(token).json()["state"], "withdrawn")
        self.assertEqual(self.received().json(), {"received": []})

    def test_forgetting_is_for_one_recipient(self):
        stream, mine = self.listen(), self.listen(self.token)
        _, finished = self.share_with(BERTA, NUMBER)
        (number, token), (_, other) = stream.next(), mine.next()
        self.assertEqual(self.received(token, method="DELETE").status, 204)
        self.assertEqual(self.received(number, method="DELETE").status, 204, "again, by its id")
        for path in [token, number, f"{token}/files/0"]:
            self.assert_refused(self.received(path), 404, "not_found")
        self.assertEqual(self.received().json(), {"received": []})
        self.assertEqual(self.received(other + "/files/0", self.token).body, b"hello")
        self.assertEqual(self.get(finished["url"][len(self.url):]).status, 200)
        again = self.listen()
        self.marker()
        self.assertEqual(again.next()[0], number + 1, "it waits no more")

    def test_shares_go_with_the_senders_account(self):
        _, _, (number, token) = self.receive()
        self.run_account("remove", "--number", NUMBER)
        self.assert_refused(self.received(token), 404, "not_found")
        self.assertEqual(self.acknowledge(number).status, 204)


class Ends(PushCase):
    options = ["--share-lifetime", "2", "--keep-ended", "2", "--push-keepalive", "1"]

    def test_an_end_is_told_and_later_forgotten(self):
        stream = self.listen()
        _, finished = self.share_with(BERTA)
        number, token = stream.next()
        self.acknowledge(number)
        self.assertEqual(self.received(token).json()["state"], "available")
        for end in [finished["expires"], finished["expires"] + 2]:
            # A sign of life each second tells that time goes on.
            while time.time() < end + 0.5:
                stream.response.readline()
            if end == finished["expires"]:
                self.assertEqual(self.received(token).json()["state"], "expired")
                self.assert_refused(self.received(token + "/files/0"), 410, "gone")
        while time.time() < end + 1:
            stream.response.readline()
        self.assert_refused(self.received(token), 404, "not_found")
        self.assertEqual(self.received().json(), {"received": []})

    def test_an_expired_share_is_not_pushed_any_more(self):
        _, finished = self.share_with(BERTA)
        clock = self.listen(self.token)
        while time.time() < finished["expires"]:
            clock.response.readline()
        stream = self.listen()
        self.marker()
        self.assertEqual(stream.next()[0], 2)
