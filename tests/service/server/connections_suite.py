"""The connection itself: heads, order, slow and rude clients."""

import http.client
import socket

from harness import ServerCase, read_until_closed


class Connections(ServerCase):
    options = ["--head-timeout", "1", "--idle-timeout", "2", "--progress-timeout", "1"]

    def ask(self, *parts):
        connection = self.connect()
        for part in parts:
            connection.sendall(part)
        return read_until_closed(connection)

    def test_a_head_of_a_mebibyte_is_refused(self):
        connection = self.connect()
        connection.sendall(b"GET / HTTP/1.1\r\nHost: x\r\nX: " + b"a" * 1024 * 1024)
        received = read_until_closed(connection)
        self.assertTrue(received.startswith(b"HTTP/1.1 431 "), received[:80])
        self.assertIn(b"header_too_large", received)

    def test_heads_around_the_limit(self):
        for size, status in [(15000, b" 404 "), (17000, b" 431 ")]:
            head = b"GET /x HTTP/1.1\r\nHost: x\r\nConnection: close\r\nX: " + b"a" * size
            self.assertIn(status, self.ask(head + b"\r\n\r\n")[:20])

    def test_malformed_heads_are_refused(self):
        for head in [b"nonsense\r\n\r\n", b"GET / HTTP/1.1\r\n\r\n", b"GET /\r\n\r\n",
                     b"GET / HTTP/1.1\r\nHost: x\r\nContent-Length: x\r\n\r\n",
                     b"POST / HTTP/1.1\r\nHost: x\r\nContent-Length: 1\r\n"
                     b"Transfer-Encoding: chunked\r\n\r\n",
                     b"GET / HTTP/1.1\r\nHost : x\r\n\r\n",
                     b"GET / HTTP/1.1\r\nHost: x\r\nA: b\0c\r\n\r\n"]:
            received = self.ask(head)
            self.assertTrue(received.startswith(b"HTTP/1.1 400 "), (head, received))
        self.assertEqual(self.get("/healthz").status, 200)

    def test_malformed_chunks_are_refused_and_keep_what_came_before(self):
        upload = self.make_share(10)["files"][0]["upload"]
        head = self.patch_head(upload, 0, 0).replace(b"Content-Length: 0", b"Transfer-Encoding: chunked")
        received = self.ask(head + b"4\r\n1234\r\n" + b"zz\r\n12\r\n0\r\n\r\n")
        self.assertTrue(received.startswith(b"HTTP/1.1 400 "), received)
        self.assertIn(b"bad_request", received)
        self.assertEqual(self.offset(upload), 4)
        json = (b"POST /api/v1/shares HTTP/1.1\r\nHost: x\r\nAuthorization: Bearer " + self.token.encode() +
                b"\r\nIdempotency-Key: k\r\nTransfer-Encoding: chunked\r\n\r\n5\r\n{1234\r\nzz\r\n")
        self.assertTrue(self.ask(json).startswith(b"HTTP/1.1 400 "))

    def test_chunks_that_end_too_early_keep_what_came(self):
        upload = self.make_share(10)["files"][0]["upload"]
        head = self.patch_head(upload, 0, 0).replace(b"Content-Length: 0", b"Transfer-Encoding: chunked")
        connection = self.connect()
        connection.sendall(head + b"9\r\n1234")
        connection.shutdown(socket.SHUT_WR)
        self.assertEqual(read_until_closed(connection), b"")
        self.assertEqual(self.offset(upload), 4)

    def test_pipelined_requests_are_answered_in_order(self):
        share = self.make_share(5)
        upload = share["files"][0]["upload"]
        last = b"GET /x HTTP/1.1\r\nHost: x\r\nConnection: close\r\n\r\n"
        received = self.ask(b"GET /healthz HTTP/1.1\r\nHost: x\r\n\r\n" +
                            self.patch_head(upload, 0, 5) + b"12345" +
                            b"POST /y HTTP/1.1\r\nHost: x\r\nContent-Length: 3\r\n\r\nabc" + last)
        statuses = [line.split()[1] for line in received.split(b"\n")
                    if line.startswith(b"HTTP/1.1 ")]
        self.assertEqual(statuses, [b"200", b"204", b"404", b"404"])
        self.assertEqual(self.offset(upload), 5)

    def test_one_connection_serves_many_requests(self):
        client = http.client.HTTPConnection("127.0.0.1", self.port, timeout=30)
        self.addCleanup(client.close)
        for _ in range(3):
            self.assertEqual(self.request_on(client, "GET", "/api/v1/account").status, 200)
            self.assertIsNotNone(client.sock)

    def test_continue_is_sent_only_for_a_wanted_body(self):
        upload = self.make_share(5)["files"][0]["upload"]
        head = self.patch_head(upload, 0, 5).replace(b"\r\n\r\n",
                                                     b"\r\nExpect: 100-continue\r\n\r\n")
        connection = self.connect()
        connection.sendall(head)
        self.assertEqual(connection.recv(1024), b"HTTP/1.1 100 Continue\r\n\r\n")
        connection.sendall(b"12345")
        self.assertTrue(connection.recv(4096).startswith(b"HTTP/1.1 204 "))
        received = self.ask(head)
        self.assertTrue(received.startswith(b"HTTP/1.1 409 "), received)

    def test_a_refused_large_body_still_gets_its_answer(self):
        upload = self.make_share(5)["files"][0]["upload"]
        connection = self.connect()
        connection.sendall(self.patch_head(upload, 0, 50 * 1024 * 1024))
        connection.sendall(bytes(8 * 1024 * 1024))
        self.assertTrue(connection.recv(4096).startswith(b"HTTP/1.1 413 "))

    def test_a_trickled_head_is_cut(self):
        connection = self.connect()
        connection.sendall(b"GET / HTTP/1.1\r\n")
        self.assertEqual(read_until_closed(connection), b"")

    def test_an_idle_connection_is_cut(self):
        self.assertEqual(read_until_closed(self.connect()), b"")

    def test_a_stalled_body_is_cut_and_kept(self):
        upload = self.make_share(10)["files"][0]["upload"]
        connection = self.connect()
        connection.sendall(self.patch_head(upload, 0, 10) + b"1234")
        self.assertEqual(read_until_closed(connection), b"")
        self.assertEqual(self.offset(upload), 4)

    def test_a_receiver_that_does_not_read_is_cut(self):
        _, link = self.make_finished(bytes(30 * 1024 * 1024))
        connection = socket.socket()
        self.addCleanup(connection.close)
        connection.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, 4096)
        connection.connect(("127.0.0.1", self.port))
        connection.sendall(f"GET {link}/0 HTTP/1.1\r\nHost: x\r\n\r\n".encode())
        # The stop waits for requests in hand: it ends only when the server gave this one up.
        self.assertEqual(self.stop(), 0)
        self.assertLess(len(read_until_closed(connection)), 30 * 1024 * 1024)
