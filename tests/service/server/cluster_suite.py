"""Several servers at once: writers, pushes, sweeping and deaths."""

import os
import signal

from cluster_case import MIB, ClusterCase
from harness import read_until_closed
from push_case import BERTA, Stream
from watch import DELETED, Watch


class Writers(ClusterCase):
    def setUp(self):
        super().setUp()
        self.second = self.another()

    def test_a_server_killed_in_mid_upload_is_replaced_by_another(self):
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            self.begin_upload(upload, content, 2 * MIB + 12345)
            told = self.offset(upload)
        self.assertGreater(told, 1)
        self.kill_node(self.first)
        kept = self.offset(upload)
        self.assertGreaterEqual(kept, told)
        self.assertEqual(self.patch(upload, kept, content[kept:]).status, 204)
        self.assert_content(share, content)
        self.assert_nothing_is_left()

    def test_a_server_that_hangs_is_replaced_and_cannot_go_on_unnoticed(self):
        content = os.urandom(4 * MIB)
        share = self.make_share(len(content))
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, content, MIB)
            kept = self.offset(upload)
        self.first.process.send_signal(signal.SIGSTOP)
        self.addCleanup(self.first.process.send_signal, signal.SIGCONT)
        self.assertEqual(self.patch(upload, kept, content[kept:-10]).status, 204)
        self.first.process.send_signal(signal.SIGCONT)
        self.assertIn(b" 409 ", read_until_closed(connection))
        self.assertEqual(self.offset(upload), len(content) - 10)
        self.assertEqual(self.patch(upload, len(content) - 10, content[-10:]).status, 204)
        self.assert_content(share, content)

    def test_a_second_writer_at_another_server_ends_the_first(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, b"1234567890", 4)
        answer = self.patch(upload, 4, b"567890")
        self.assertEqual((answer.status, answer.headers["Upload-Offset"]), (204, "10"))
        self.assertIn(b" 409 ", read_until_closed(connection))
        self.assert_content(share, b"1234567890")

    def test_of_the_same_append_at_two_servers_one_writes(self):
        for _ in range(5):
            content = os.urandom(MIB)
            share = self.make_share(len(content))
            upload = share["files"][0]["upload"]
            self.assertIn(sorted(self.append_everywhere(upload, content)), ([204, 409], [409, 409]))
            self.go_on(upload, content)
            self.assert_content(share, content)

    def test_withdrawing_at_one_server_ends_an_upload_at_another(self):
        share = self.make_share(10)
        upload = share["files"][0]["upload"]
        with self.at(self.first):
            connection = self.begin_upload(upload, b"1234567890", 4)
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)
        self.assertIn(b" 410 ", read_until_closed(connection))

    def test_a_download_at_one_server_outlives_the_withdrawal_at_another_and_no_other_begins(self):
        content = os.urandom(16 * MIB)
        share, link = self.make_finished(content)
        (path,) = self.blob_files()
        connection = self.connect()
        connection.sendall(f"GET {link}/0 HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n".encode())
        received = connection.recv(4096)
        with Watch(os.path.dirname(path), DELETED) as deletion:
            with self.at(self.first):
                self.request("DELETE", "/api/v1/shares/" + share["share"])
            for node in self.nodes:
                with self.at(node):
                    self.assertEqual(self.get(link + "/0").status, 410)
            deletion.wait()
        received += read_until_closed(connection)
        self.assertEqual(received.split(b"\r\n\r\n", 1)[1], content)

    def test_a_removed_accounts_bytes_are_deleted_by_whoever_sweeps(self):
        self.make_finished(b"12345")
        (path,) = self.blob_files()
        with Watch(os.path.dirname(path), DELETED) as deletion:
            self.stores = ["--metadata", self.engine.url()]
            self.run_account("remove", "--number", "+4915112345678")
            deletion.wait()
        self.assertEqual(self.request("GET", "/api/v1/account").status, 401)


class Pushes(ClusterCase):
    def setUp(self):
        super().setUp()
        self.second = self.another()
        self.berta = self.run_account("add", "--number", BERTA).strip()

    def listen(self, node):
        stream = Stream(node.port, self.berta)
        self.addCleanup(stream.close)
        self.assertEqual(stream.response.status, 200)
        return stream

    def share_with_berta(self):
        body = {"files": [{"name": "a", "size": 0}], "recipients": [{"number": BERTA}]}
        return self.finish(self.post_share(body).json())

    def test_a_push_reaches_who_listens_at_another_server(self):
        streams = [self.listen(node) for node in self.nodes]
        with self.at(self.first):
            self.assertEqual(self.share_with_berta()["sms"], [])
        self.share_with_berta()
        for stream in streams:
            self.assertEqual([stream.next()[0], stream.next()[0]], [1, 2])

    def test_what_was_told_while_a_server_was_cut_off_is_found_afterwards(self):
        stream = self.listen(self.first)
        self.first.process.send_signal(signal.SIGSTOP)
        self.addCleanup(self.first.process.send_signal, signal.SIGCONT)
        self.engine.sql("SELECT pg_terminate_backend(pid, 10000) FROM pg_stat_activity WHERE pid <> pg_backend_pid()")
        self.when_back("GET", "/api/v1/account")
        self.share_with_berta()
        self.first.process.send_signal(signal.SIGCONT)
        self.assertEqual(stream.next()[0], 1)

    def test_a_renewed_token_ends_the_former_phones_stream_at_another_server(self):
        stream = self.listen(self.first)
        code = self.run_account("renew", "--number", BERTA).strip()
        answer = self.request("POST", "/api/v1/accounts", f'{{"number": "{BERTA}", "code": "{code}"}}',
                              {"Idempotency-Key": "x"}, token=False)
        self.assertEqual(answer.status, 201)
        self.assertIsNone(stream.next())

    def test_a_removed_accounts_streams_end_at_every_server(self):
        streams = [self.listen(node) for node in self.nodes]
        self.run_account("remove", "--number", BERTA)
        for stream in streams:
            self.assertIsNone(stream.next())


class Sweeping(ClusterCase):
    options = ["--share-lifetime", "4"]

    def test_the_next_server_sweeps_when_the_one_that_did_is_killed(self):
        self.another()
        self.kill_node(self.first)
        _, link = self.make_finished(b"12345")
        (path,) = self.blob_files()
        with Watch(os.path.dirname(path), DELETED) as deletion:
            self.assertEqual(self.get(link + "/0").status, 200)
            deletion.wait()
        self.assertEqual(self.get(link + "/0").status, 410)

    def test_servers_that_do_not_sweep_keep_no_deleted_row(self):
        self.another()
        self.assertEqual(self.get("/readyz").status, 200)
        self.make_finished(b"12345")
        self.engine.sql("CREATE EXTENSION pgstattuple; UPDATE shares SET state = state")
        self.assertEqual(self.engine.sql("SELECT dead_tuple_count > 0 FROM pgstattuple('shares')"), "t")
        self.engine.sql("VACUUM shares")
        self.assertEqual(self.engine.sql("SELECT dead_tuple_count FROM pgstattuple('shares')"), "0")


class Draining(ClusterCase):
    options = ["--drain", "5"]

    def test_a_server_that_is_asked_to_end_loses_nothing_and_others_go_on(self):
        second = self.another()
        berta = self.run_account("add", "--number", BERTA).strip()
        contents = [os.urandom(2 * MIB), os.urandom(2 * MIB)]
        share = self.make_share(*map(len, contents))
        ending, cut = [file["upload"] for file in share["files"]]
        with self.at(self.first):
            ends = self.begin_upload(ending, contents[0], MIB)
            is_cut = self.begin_upload(cut, contents[1], MIB)
            stream = Stream(self.port, berta)
        self.addCleanup(stream.close)
        self.first.process.send_signal(signal.SIGTERM)
        self.assertIsNone(stream.next())
        ends.sendall(contents[0][MIB:])
        self.assertIn(b" 204 ", read_until_closed(ends))
        self.assertIn(b" 409 ", read_until_closed(is_cut))
        self.assertEqual(self.first.process.wait(30), 0)
        self.assertEqual([self.offset(ending), self.offset(cut)], [2 * MIB, MIB])
        self.go_on(cut, contents[1])
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual([self.get(link + "/0").body, self.get(link + "/1").body], contents)
        again = Stream(second.port, berta)
        self.addCleanup(again.close)
        self.assertEqual(again.response.status, 200)
        self.assert_nothing_is_left()
