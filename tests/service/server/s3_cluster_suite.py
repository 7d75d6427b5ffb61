"""Several servers on one database and one S3 store."""

import http.client
import os
import threading

from cluster_case import ClusterCase
from harness import read_until_closed
from s3_suite import PART, S3Case


class S3Cluster(S3Case, ClusterCase):
    go_on = ClusterCase.go_on

    def setUp(self):
        super().setUp()
        self.second = self.another()

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

            def write(node, upload=upload, content=content):
                client = http.client.HTTPConnection("127.0.0.1", node.port, timeout=60)
                try:
                    self.request_on(client, "PATCH", upload, content, self.tus_headers(0))
                except ConnectionError:
                    pass  # told while the body was still on its way
                finally:
                    client.close()

            writers = [threading.Thread(target=write, args=[node]) for node in self.nodes]
            for writer in writers:
                writer.start()
            for writer in writers:
                writer.join()
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
