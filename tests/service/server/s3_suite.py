"""The server on an S3 store: what stands there, and what becomes of uploads when the store fails or a server dies."""

import calendar
import contextlib
import http.client
import os
import shutil
import socket
import subprocess
import tempfile
import threading
import time
import urllib.parse

from harness import ServerCase, read_head, read_until_closed
from store_proxy import StoreProxy

MIB = 1024 * 1024
PART = 8 * MIB
TUS = {"Tus-Resumable": "1.0.0"}
STORE = os.environ["PELLIKO_S3_HOST"]
BUCKET = os.environ["PELLIKO_S3_BUCKET"]


def fetch(address):
    """What an address of the store gives: the status, the body, and the Content-Disposition."""
    where = urllib.parse.urlsplit(address)
    client = http.client.HTTPConnection(where.netloc)
    try:
        client.request("GET", where.path + "?" + where.query)
        answer = client.getresponse()
        return answer.status, answer.read(), answer.getheader("Content-Disposition")
    finally:
        client.close()


def signed(address):
    """When an address was signed, and for how many seconds."""
    query = urllib.parse.parse_qs(urllib.parse.urlsplit(address).query)
    date = time.strptime(query["X-Amz-Date"][0], "%Y%m%dT%H%M%SZ")
    return calendar.timegm(date), int(query["X-Amz-Expires"][0])


def s3cmd(*arguments):
    return subprocess.run(["s3cmd", "-c", os.environ["PELLIKO_S3_CONFIG"], *arguments], check=True, capture_output=True,
                          text=True).stdout


class S3Case(ServerCase):
    """A server whose store is behind a proxy of its own, and has a folder of its own there."""

    store_options = ""

    def setUp(self):
        self.proxy = StoreProxy(STORE)
        self.addCleanup(self.proxy.close)
        self.prefix = self.id().rsplit(".", 1)[1]
        super().setUp()

    def other_stores(self):
        return [*super().other_stores(), "--blobs",
                f"s3://127.0.0.1:{self.proxy.port}/{BUCKET}/{self.prefix}?tls=off{self.store_options}"]

    # The store, seen from outside

    def object_sizes(self):
        lines = s3cmd("ls", "--recursive", f"s3://{BUCKET}/{self.prefix}/").splitlines()
        words = [line.split(None, 3) for line in lines]
        return {name: int(size) for _, _, size, name in words}

    def objects(self):
        return list(self.object_sizes())

    def open_uploads(self):
        lines = s3cmd("multipart", f"s3://{BUCKET}").splitlines()
        return [line.split("\t")[1:3] for line in lines if f"/{self.prefix}/" in line]

    def content_of(self, name):
        with tempfile.TemporaryDirectory() as folder:
            s3cmd("get", name, folder + "/object")
            with open(folder + "/object", "rb") as file:
                return file.read()

    def assert_stored(self, *contents):
        """The store has exactly these contents, and nothing of their making."""
        self.assertEqual(self.open_uploads(), [])
        self.assertEqual(sorted(map(self.content_of, self.objects())), sorted(contents))

    # Uploads

    def begin_patch(self, upload, offset, content, until):
        connection = self.connect()
        connection.sendall(self.patch_head(upload, offset, len(content) - offset) + content[offset:until])
        return connection

    def go_on(self, upload, content):
        """What a client does after a failure: asks for the offset and sends the rest."""
        offset = self.offset(upload)
        answer = self.patch(upload, offset, content[offset:])
        self.assertEqual(answer.status, 204, answer.body)
        return offset

    def come_back(self):
        """Returns when the server has found the store again."""
        self.proxy.restore()
        self.assertEqual(self.when_back("GET", "/readyz", token=False).status, 200)

    def one_file(self, size):
        content = os.urandom(size)
        share = self.make_share(size)
        return content, share, share["files"][0]["upload"]

    def assert_shared(self, share, content):
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)
        return link

    def withdraw(self, share):
        """Returns once the store was asked to delete the last of the share's objects."""
        deleted = self.proxy.seen["delete"] + len(self.objects())
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)
        self.proxy.wait_for("delete", deleted)


class WholeFiles(S3Case):
    def test_what_was_uploaded_is_in_the_store_until_withdrawn(self):
        contents = [os.urandom(2 * PART + 12345), os.urandom(1000), os.urandom(PART)]
        share, link = self.make_finished(*contents)
        self.assert_stored(*contents)
        for index, content in enumerate(contents):
            self.assertEqual(self.get(f"{link}/{index}").body, content)
        answer = self.get(link + "/0", Range=f"bytes={PART - 10}-{PART + 9}")
        self.assertEqual((answer.status, answer.body), (206, contents[0][PART - 10:PART + 10]))
        self.assertEqual(self.get(link + "/0", Range="bytes=-7").body, contents[0][-7:])
        self.assertEqual(self.get(link + "/all.zip").status, 200)
        self.withdraw(share)
        self.assertEqual(self.get(link + "/0").status, 410)
        self.assert_stored()

    def test_a_withdrawn_upload_leaves_nothing(self):
        content, share, upload = self.one_file(3 * PART)
        self.assertEqual(self.patch(upload, 0, content[:PART + 1000]).status, 204)
        self.assertEqual(len(self.open_uploads()), 1)
        self.withdraw(share)
        self.assert_stored()

    def test_small_appends_make_one_object(self):
        content, share, upload = self.one_file(9 * MIB)
        for offset in range(0, len(content), 3 * MIB):
            self.assertEqual(self.patch(upload, offset, content[offset:offset + 3 * MIB]).status, 204)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_a_cut_connection_keeps_what_arrived_and_the_rest_follows(self):
        content, share, upload = self.one_file(2 * PART)
        connection = self.begin_patch(upload, 0, content, PART + 3 * MIB)
        # Half a close: the server's own close then tells that it has kept what came.
        connection.shutdown(socket.SHUT_WR)
        self.assertEqual(read_until_closed(connection), b"")
        self.assertEqual(self.go_on(upload, content), PART + 3 * MIB)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_who_asks_for_the_offset_beside_an_upload_does_not_disturb_it(self):
        content, share, upload = self.one_file(PART + 3 * MIB)
        connection = self.begin_patch(upload, 0, content, MIB)
        for at in range(MIB, len(content), MIB):
            # Each question has what arrived made durable while more of it arrives.
            while (told := self.offset(upload)) < at:
                pass
            self.assertEqual(told, at)
            connection.sendall(content[at:at + MIB])
        self.assertIn(b" 204 ", read_head(connection))
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_what_the_database_does_not_know_is_swept_and_strangers_stay(self):
        self.stop()
        shutil.copytree(self.data, self.data + ".copy")
        self.start()
        content, share, upload = self.one_file(2 * PART)
        self.assertEqual(self.patch(upload, 0, content[:PART + 1000]).status, 204)
        self.make_finished(b"hello")
        self.kill()
        stranger = f"s3://{BUCKET}/{self.prefix}/somebody-elses.txt"
        s3cmd("put", __file__, stranger)
        self.assertEqual((len(self.objects()), len(self.open_uploads())), (3, 1))
        shutil.rmtree(self.data)
        os.rename(self.data + ".copy", self.data)
        self.start()
        self.proxy.wait_for("delete", 2)
        self.assertEqual((self.objects(), self.open_uploads()), ([stranger], []))


class Faults(S3Case):
    patience = 60  # a call to a silent store gives up after some thirty seconds

    def test_a_busy_store_is_asked_again(self):
        self.proxy.fault("slow_down", times=4, each=2)
        content, share, upload = self.one_file(3 * PART + 5)
        self.assertEqual(self.patch(upload, 0, content).status, 204)
        self.assert_shared(share, content)
        self.assert_stored(content)
        self.assertTrue(self.proxy.met())

    def test_a_slow_store_holds_nobody_else_up(self):
        self.proxy.fault(1.0, "put", "part", times=40)
        share = self.make_share(*[1000] * 30)
        with self.filled(share) as statuses:
            for _ in range(10):
                self.assertEqual(self.get("/healthz").status, 200)
        self.assertEqual(statuses, [204] * 30)

    @contextlib.contextmanager
    def filled(self, share):
        """Sends all files of the share at once, 1000 bytes each; the answers' statuses are there at the end."""
        statuses = []

        def send(upload):
            statuses.append(self.patch(upload, 0, bytes(1000)).status)

        senders = [threading.Thread(target=send, args=[file["upload"]]) for file in share["files"]]
        for sender in senders:
            sender.start()
        yield statuses
        for sender in senders:
            sender.join()

    def test_a_silent_store_is_given_up(self):
        content, share, upload = self.one_file(1000)
        others = self.make_share(*[1000] * 20)
        self.proxy.fault("hold", times=1000)
        self.addCleanup(self.proxy.release)
        self.assert_refused(self.patch(upload, 0, content), 503, "unavailable")
        tried = self.proxy.held
        with self.filled(others) as statuses:
            pass
        self.assertEqual(statuses, [503] * 20)
        self.assertLess(self.proxy.held - tried, 30)  # each alone makes two calls, and waits for both
        self.assertEqual(self.get("/readyz").status, 503)
        self.assertEqual(self.request("GET", "/api/v1/account").status, 200)
        self.proxy.release()
        self.assertEqual(self.when_back("GET", "/readyz", token=False).status, 200)
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_lost_answers_lose_nothing_and_leave_nothing(self):
        for kind in ("begin", "part", "complete"):
            self.proxy.fault("lose_answer", kind)
        content, share, upload = self.one_file(3 * PART + 5)
        self.assertEqual(self.patch(upload, 0, content).status, 204)
        self.assertTrue(self.proxy.met())
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_a_completion_that_fails_late_is_made_again(self):
        self.proxy.fault("failed_late", "complete", times=2)
        content, share, upload = self.one_file(PART + 5)
        self.assertEqual(self.patch(upload, 0, content).status, 204)
        self.assertTrue(self.proxy.met())
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_a_download_that_breaks_goes_on(self):
        content, share, upload = self.one_file(2 * PART)
        self.assertEqual(self.patch(upload, 0, content).status, 204)
        self.proxy.fault("cut", "get", times=2)
        self.assert_shared(share, content)
        self.assertTrue(self.proxy.met())

    def test_a_lost_part_makes_the_upload_begin_again(self):
        content, share, upload = self.one_file(2 * PART)
        self.assertEqual(self.patch(upload, 0, content[:PART + 1000]).status, 204)
        for name, number in self.open_uploads():
            s3cmd("abortmp", name, number)
        answer = self.patch(upload, PART + 1000, content[PART + 1000:])
        self.assert_refused(answer, 409, "conflict")
        self.assertEqual(answer.headers["Upload-Offset"], "0")
        self.assertEqual(self.go_on(upload, content), 0)
        self.assert_shared(share, content)
        self.proxy.wait_for("delete", 1)
        self.assert_stored(content)

    def test_a_store_that_is_away_costs_nothing(self):
        content, share, upload = self.one_file(2 * PART)
        self.assertEqual(self.patch(upload, 0, content[:1000]).status, 204)
        self.proxy.refuse()
        self.assert_refused(self.patch(upload, 1000, content[1000:]), 503, "unavailable")
        self.assertEqual(self.get("/healthz").status, 200)
        self.assertEqual(self.offset(upload), 1000)
        self.come_back()
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_a_store_that_is_away_during_an_upload(self):
        content, share, upload = self.one_file(4 * PART)
        connection = self.begin_patch(upload, 0, content, 2 * PART + 1000)
        self.proxy.wait_for("part", 2)
        told = self.offset(upload)
        self.assertEqual(told, 2 * PART + 1000)
        self.proxy.refuse()
        with contextlib.suppress(ConnectionError):
            connection.sendall(content[told:])
            self.assertIn(b" 503 ", read_head(connection))
        self.come_back()
        self.assertGreaterEqual(self.go_on(upload, content), told)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_after_kill_9_another_server_goes_on(self):
        content, share, upload = self.one_file(5 * PART)
        self.begin_patch(upload, 0, content, 3 * PART + 4711)
        self.proxy.wait_for("part", 3)
        told = self.offset(upload)
        self.assertEqual(told, 3 * PART + 4711)
        self.kill()
        self.start()
        self.assertGreaterEqual(self.offset(upload), told)
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_parts_count_without_being_asked_for(self):
        content, share, upload = self.one_file(10 * PART)
        self.begin_patch(upload, 0, content, 9 * PART)
        self.proxy.wait_for("part", 9)
        self.kill()
        self.start()
        # At most the last step of each kind is not noted.
        self.assertGreaterEqual(self.offset(upload), 2 * PART)
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_kill_9_between_whole_and_noted(self):
        content, share, upload = self.one_file(2 * PART + 5)
        self.proxy.fault("lose_answer", "complete")
        connection = self.begin_patch(upload, 0, content, len(content))
        self.proxy.wait_for("complete", 1)
        self.kill()
        connection.close()
        self.start()
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)


class Redirects(S3Case):
    store_options = "&redirect=on"

    def test_whole_files_come_from_the_store(self):
        content = os.urandom(100000)
        _, link = self.make_finished(content, b"", names=["grüße.bin", "empty"])
        answer = self.get(link + "/0")
        self.assertEqual((answer.status, answer.body), (307, b""))
        address = answer.headers["Location"]
        _, lifetime = signed(address)
        self.assertTrue(0 < lifetime <= 172800, lifetime)
        status, body, disposition = fetch(address)
        self.assertEqual((status, body), (200, content))
        self.assertIn("filename*=UTF-8''gr%C3%BC%C3%9Fe.bin", disposition)
        # What the store cannot know is answered here.
        self.assertEqual(self.get(link + "/1").status, 200)
        self.assertEqual(self.get(link + "/0", Range="bytes=5-9").body, content[5:10])
        self.assertEqual(self.request("HEAD", link + "/0", token=False).headers["Content-Length"], "100000")
