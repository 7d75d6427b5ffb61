"""Ends of shares and of unfinished uploads, seen from outside."""

import os
import time

from harness import ServerCase
from watch import DELETED, Watch

class WatchingCase(ServerCase):
    def watch_blobs(self):
        """Notices when the only blob is deleted."""
        watch = Watch(os.path.dirname(self.blob_files()[0]), DELETED)
        self.addCleanup(watch.__exit__)
        return watch


class Expiry(WatchingCase):
    options = ["--share-lifetime", "3"]

    def test_bytes_are_deleted_at_the_second_without_being_asked(self):
        share, link = self.make_finished(b"12345")
        deletions = self.watch_blobs()
        expires = self.request("GET", "/api/v1/shares/" + share["share"]).json()["expires"]
        self.assertEqual(self.get(link + "/0").status, 200)
        self.assertLess(time.time(), expires)
        deletions.wait(10)
        self.assertGreaterEqual(time.time(), expires)
        self.assertLess(time.time(), expires + 2)
        page = self.get(link)
        self.assertEqual(page.status, 410)
        self.assertIn(b"<h1>The time is over</h1>", page.body)
        self.assertEqual(self.blob_files(), [])
        record = self.request("GET", "/api/v1/shares/" + share["share"]).json()
        self.assertEqual(record["state"], "expired")

    def test_what_expired_while_the_server_was_down_is_deleted_at_its_start(self):
        self.make_finished(b"12345")
        self.assertEqual(self.stop(), 0)
        self.change_database(f"UPDATE shares SET deadline = {int(time.time()) - 1}")
        deletions = self.watch_blobs()
        self.start()
        deletions.wait(10)

    def test_a_withdrawn_share_is_deleted_at_once(self):
        share, _ = self.make_finished(b"12345")
        deletions = self.watch_blobs()
        self.request("DELETE", "/api/v1/shares/" + share["share"])
        deletions.wait(10)


class Strays(WatchingCase):
    def put_stray(self):
        """A blob as a copy of the database leaves it that is older than the blobs."""
        folder = os.path.join(self.data, "blobs", "AA")
        os.makedirs(folder, exist_ok=True)
        self.stray = os.path.join(folder, "A" * 22)
        with open(self.stray, "wb") as file:
            file.write(b"12345")
        watch = Watch(folder, DELETED)
        self.addCleanup(watch.__exit__)
        return watch

    def test_bytes_that_the_database_does_not_know_are_removed_at_the_start(self):
        _, link = self.make_finished(b"12345")
        unfinished = self.make_share(10)["files"][0]["upload"]
        self.patch(unfinished, 0, b"1234")
        self.assertEqual(self.stop(), 0)
        deletions = self.put_stray()
        foreign = os.path.join(self.data, "blobs", "AA", "README")
        open(foreign, "w", encoding="ascii").close()
        self.start()
        deletions.wait(10)
        self.assertFalse(os.path.exists(self.stray))
        self.assertTrue(os.path.exists(foreign))
        self.assertEqual(self.get(link + "/0").body, b"12345")
        self.assertEqual(self.patch(unfinished, 4, b"567890").status, 204)

    def test_a_database_that_is_still_to_be_put_back_costs_no_bytes(self):
        self.assertEqual(self.stop(), 0)
        self.put_stray()
        for end in ["", "-wal", "-shm"]:
            if os.path.exists(self.data + "/metadata.db" + end):
                os.remove(self.data + "/metadata.db" + end)
        self.start()
        self.assertEqual(self.get("/healthz").status, 200)
        self.assertEqual(self.stop(), 0)
        self.assertTrue(os.path.exists(self.stray))


class Unfinished(WatchingCase):
    options = ["--unfinished-lifetime", "2"]

    def test_an_unfinished_upload_is_given_up(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        self.patch(upload, 0, b"1234")
        deletions = self.watch_blobs()
        deletions.wait(10)
        self.assert_refused(self.patch(upload, 4, b"5"), 410, "gone")
        self.assertEqual(self.request("GET", "/api/v1/account").json()["used_bytes"], 4)
