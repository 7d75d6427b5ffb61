"""Several servers on one database and one S3 store."""

import contextlib
import os
import signal
import threading
import time

from cluster_case import MIB, ClusterCase
from full_database import FullDatabaseCase
from harness import read_head, read_until_closed
from partition import Partition
from s3_suite import PART, STORE, S3Case, fetch, signed


class S3ClusterCase(S3Case, ClusterCase):
    go_on = ClusterCase.go_on
    patience = 90

    def setUp(self):
        super().setUp()
        self.second = self.another()

    def stored_sizes(self):
        return {name.split(f"/{self.prefix}/", 1)[1]: size for name, size in self.object_sizes().items()}

    def assert_stored(self, *contents):
        self.assert_nothing_is_left()
        super().assert_stored(*contents)


class S3Cluster(S3ClusterCase):
    def test_after_kill_9_the_other_server_goes_on(self):
        content, share, upload = self.one_file(5 * PART)
        with self.at(self.first):
            self.begin_patch(upload, 0, content, 3 * PART + 4711)
            self.proxy.wait_for("part", 3)
            told = self.offset(upload)
        self.assertEqual(told, 3 * PART + 4711)
        self.kill_node(self.first)
        self.assertGreaterEqual(self.offset(upload), told)
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_one_upload_by_turns_at_two_servers(self):
        content, share, upload = self.one_file(2 * PART + 5)
        step = len(content) // 5 + 1
        for index, offset in enumerate(range(0, len(content), step)):
            with self.at(self.nodes[index % 2]):
                self.assertEqual(self.patch(upload, offset, content[offset:offset + step]).status, 204)
        self.assert_shared(share, content)
        self.assert_stored(content)

    def test_the_same_append_at_two_servers_at_once(self):
        for _ in range(3):
            content, share, upload = self.one_file(PART + 1000)
            self.append_everywhere(upload, content)
            self.go_on(upload, content)
            self.assert_shared(share, content)
            self.withdraw(share)
        self.assert_stored()

    def test_nothing_that_was_withdrawn_elsewhere_is_served(self):
        content = os.urandom(3 * PART)
        share, link = self.make_finished(content)
        connection = self.connect()
        connection.sendall(f"GET {link}/0 HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n".encode())
        received = connection.recv(4096)
        with self.at(self.first):
            self.withdraw(share)
        for node in self.nodes:
            with self.at(node):
                self.assertEqual(self.get(link + "/0").status, 410)
        # What runs already ends, or is cut: nobody takes half of it for the whole.
        received += read_until_closed(connection)
        head, body = received.split(b"\r\n\r\n", 1)
        self.assertIn(f"Content-Length: {len(content)}".encode(), head)
        self.assertTrue(content.startswith(body))
        self.assert_stored()


class CutOff(S3ClusterCase):
    """The first server is behind a network that can be cut; the second has another way to the store."""

    patience = 45  # a call gives up after some twenty seconds

    def another(self, *more):
        self.stores = [word.replace(f"127.0.0.1:{self.proxy.port}", STORE) for word in self.stores]
        return super().another(*more)

    def test_it_says_so_and_is_replaced_and_comes_back(self):
        network = Partition()
        self.addCleanup(network.mend)
        content, share, upload = self.one_file(4 * PART)
        small, small_share, small_upload = self.one_file(1000)
        with self.at(self.first):
            connection = self.begin_patch(upload, 0, content, 2 * PART + 1000)
            self.proxy.wait_for("part", 2)
            told = self.offset(upload)
        network.cut(self.proxy.port)
        with self.at(self.first):
            answer = self.patch(small_upload, 0, small)
            self.assert_refused(answer, 503, "unavailable")
            self.assertEqual(answer.headers["Retry-After"], "5")
            self.assertEqual(self.get("/readyz").status, 503)
            self.assertEqual(self.request("GET", "/api/v1/account").status, 200)
        self.assertEqual(self.get("/readyz").status, 200)
        self.assertGreaterEqual(self.offset(upload), told)
        self.go_on(upload, content)
        self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        self.assert_shared(share, content)

        network.mend()
        with self.at(self.first):
            self.assertEqual(self.when_back("GET", "/readyz", token=False).status, 200)
            self.go_on(small_upload, small)
            self.assert_shared(small_share, small)
        self.assert_stored(content, small)


class DatabaseCrash(S3ClusterCase):
    def test_an_upload_goes_on_after_a_crash_of_the_database(self):
        content, share, upload = self.one_file(4 * PART)
        connection = self.begin_patch(upload, 0, content, 2 * PART + 1000)
        self.proxy.wait_for("part", 2)
        told = self.offset(upload)
        self.assertEqual(told, 2 * PART + 1000)
        self.engine.restart(signal.SIGQUIT)
        self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        self.assertEqual(self.when_back("GET", "/api/v1/account").json()["used_bytes"], len(content))
        self.assertGreaterEqual(self.offset(upload), told)
        self.assert_it_comes_and_goes(share, content)


class FullDatabase(S3ClusterCase, FullDatabaseCase):
    def test_an_upload_that_cannot_be_noted_keeps_its_offset_and_goes_on(self):
        self.put_uploads_on_the_small_disk()
        content, share, upload = self.one_file(2 * PART + 5 * MIB)
        connection = self.begin_patch(upload, 0, content, 2 * PART + 1000)
        self.proxy.wait_for("part", 2)
        told = self.offset(upload)
        self.assertEqual(told, 2 * PART + 1000)
        self.fill_the_disk()
        connection.sendall(content[told:])
        self.assertIn(b" 507 ", read_head(connection))
        for node in self.nodes:
            with self.at(node):
                self.assert_refused(self.patch(upload, told, content[told:]), 507, "no_space")
                self.assertEqual(self.offset(upload), told)
        self.make_room()
        self.assert_it_comes_and_goes(share, content)
        self.assert_nobody_has_a_right()


class DatabaseCutOff(S3ClusterCase):
    """The second server reaches the database over a network that can be cut, and the store all the time."""

    engine_options = {"settings": {"listen_addresses": "127.0.0.1"}}

    def another(self, *more):
        self.stores = [word.replace(self.engine.url(), self.engine.tcp_url()) for word in self.stores]
        return super().another(*more)

    def test_what_it_puts_there_after_a_withdrawal_elsewhere_is_removed(self):
        network = Partition()
        self.addCleanup(network.mend)
        content, share, upload = self.one_file(3 * PART)
        connection = self.begin_patch(upload, 0, content, MIB)
        self.engine.wait_until("SELECT FROM blobs WHERE writer > 0")
        network.cut(5432)
        with self.at(self.first):
            self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)
        self.engine.wait_until("SELECT WHERE NOT EXISTS (SELECT FROM blobs)")
        # It has not noticed yet, and takes a part and something more.
        with contextlib.suppress(ConnectionError):
            connection.sendall(content[MIB:PART + MIB])
            self.assertRegex(read_until_closed(connection), b"^(HTTP/1.1 (409|503) |$)")
        network.mend()
        self.proxy.wait_for("delete", 1)
        self.assert_stored()


class SlowStore(S3ClusterCase):
    def test_it_holds_nobody_up_who_does_not_need_it(self):
        _, link = self.make_finished(b"12345", names=["a.bin"])
        share = self.make_share(*[1000] * 60)
        self.proxy.fault("hold", "put", times=60)
        self.addCleanup(self.proxy.release)
        answers = []
        uploads = [file["upload"] for file in share["files"]]
        sender = threading.Thread(target=self.all_at_once, args=[
            lambda upload: answers.append(self.patch(upload, 0, bytes(1000)).status), uploads])
        sender.start()
        # As many as the server asks of the store at once; the rest of the uploads waits for them.
        self.proxy.wait_held(48)
        for path in ["/api/v1/account", "/api/v1/shares/" + share["share"], link, "/readyz", "/healthz"]:
            self.assertEqual(self.request("GET", path).status, 200)
        self.make_share(1)
        self.assertEqual(answers, [])
        self.proxy.release()
        sender.join()
        self.assertEqual(answers, [204] * 60)


class Draining(S3ClusterCase):
    options = ["--drain", "1"]

    def test_what_has_arrived_is_in_the_store_when_the_server_has_ended(self):
        content, share, upload = self.one_file(4 * PART)
        with self.at(self.first):
            connection = self.begin_patch(upload, 0, content, 2 * PART + 1000)
            self.proxy.wait_for("part", 2)
            told = self.offset(upload)
        self.first.process.send_signal(signal.SIGTERM)
        self.assertIn(b" 409 ", read_until_closed(connection))
        self.assertEqual(self.first.process.wait(30), 0)
        self.assertGreaterEqual(self.offset(upload), told)
        self.go_on(upload, content)
        self.assert_shared(share, content)
        self.assert_stored(content)


class DatabasesClock(S3ClusterCase):
    """The database is a minute ahead of the servers and of the store."""

    engine_options = {"clock": 60}
    options = ["--share-lifetime", "6"]
    store_options = "&redirect=on"

    def test_nothing_is_served_anywhere_that_has_expired(self):
        content = os.urandom(3 * PART)
        share, link = self.make_finished(content)
        expires = self.request("GET", "/api/v1/shares/" + share["share"]).json()["expires"]
        self.assertAlmostEqual(share["created"], time.time() + 60, delta=30)
        with self.at(self.first):
            address = self.get(link + "/0").headers["Location"]
            running = self.connect()
            running.sendall(f"GET {link}/0 HTTP/1.1\r\nHost: x\r\nRange: bytes=1-\r\n"
                            "Connection: close\r\n\r\n".encode())
            received = running.recv(4096)
        self.assertLessEqual(signed(address)[1], 6)
        self.assertEqual(fetch(address)[0], 200)
        self.proxy.wait_for("delete", 1)
        self.assertGreaterEqual(float(self.engine.sql("SELECT extract(epoch FROM clock_timestamp())")), expires)
        for node in self.nodes:
            with self.at(node):
                for path in [link + "/0", link + "/all.zip", link]:
                    self.assertEqual(self.get(path).status, 410)
        self.assertIn(fetch(address)[0], (403, 404))
        # What runs already ends, or is cut: nobody takes half of it for the whole.
        received += read_until_closed(running)
        self.assertTrue(content[1:].startswith(received.split(b"\r\n\r\n", 1)[1]))
        self.assert_stored()
