"""Pushes: who gets one, when, how often, and for how long it waits."""

import hashlib
import json
import socket
import time

from harness import NUMBER, read_until_closed
from push_case import BERTA, CARL, STRANGER, PushCase


class Recipients(PushCase):
    def test_who_has_joined_gets_a_push_and_the_others_an_sms(self):
        stream = self.listen()
        _, finished = self.share_with(STRANGER, BERTA, STRANGER)
        self.assertEqual(finished["sms"], [STRANGER])
        number, token = stream.next()
        self.assertEqual(number, 1)
        self.assertRegex(token, "^[A-Za-z0-9_-]{22}$")

    def test_only_the_one_form_of_a_number_is_an_account(self):
        _, finished = self.share_with("+44 7700 900123", "07700900123")
        self.assertEqual(finished["sms"], ["+44 7700 900123", "07700900123"])
        self.assertEqual(self.received().json(), {"received": []})

    def test_finishing_again_makes_no_second_push(self):
        stream = self.listen()
        share, _ = self.share_with(BERTA, STRANGER)
        first = stream.next()
        self.assertEqual(self.finish_as(share)["sms"], [STRANGER])
        self.assertEqual(self.acknowledge(first[0]).status, 204)
        self.finish_as(share)
        self.assertEqual(self.received(first[1], method="DELETE").status, 204)
        self.finish_as(share)
        self.marker()
        self.assertEqual(stream.next()[0], first[0] + 1)

    def test_who_joins_between_two_finishes_gets_a_push(self):
        share, finished = self.share_with(CARL)
        self.assertEqual(finished["sms"], [CARL])
        carl = self.run_account("add", "--number", CARL).strip()
        self.assertEqual(self.finish_as(share)["sms"], [])
        self.assertIsNotNone(self.listen(carl).next())

    def test_a_number_named_twice_and_a_share_to_oneself_are_pushed_once(self):
        mine, hers = self.listen(self.token), self.listen()
        _, finished = self.share_with(NUMBER, BERTA, BERTA, NUMBER)
        self.assertEqual(finished["sms"], [])
        self.assertNotEqual(mine.next()[1], hers.next()[1])
        self.share_with(NUMBER, BERTA)
        self.assertEqual((mine.next()[0], hers.next()[0]), (2, 2))

    def test_a_share_again_is_a_push_of_its_own(self):
        share, _ = self.share_with(BERTA)
        again = self.post_share({"reshare_of": share["share"], "recipients": [{"number": BERTA}]})
        self.finish_as(again.json())
        stream = self.listen()
        self.assertNotEqual(stream.next()[1], stream.next()[1])
        self.assertEqual(len(self.received().json()["received"]), 2)


class Streams(PushCase):
    options = ["--push-keepalive", "1"]

    def test_head_of_a_stream(self):
        headers = self.listen().response.headers
        self.assertEqual(headers["Content-Type"], "text/event-stream")
        self.assertEqual(headers["Transfer-Encoding"], "chunked")
        self.assertEqual(headers["Cache-Control"], "no-store")
        self.assertEqual(self.request("HEAD", "/api/v1/push", token=self.berta).status, 200)

    def test_only_accounts_listen(self):
        for token in [False, "A" * 22, "A" * 1000]:
            for path in ["/api/v1/push", "/api/v1/received", "/api/v1/received/" + "A" * 22]:
                self.assert_refused(self.request("GET", path, token=token), 401, "unauthorized")
        self.assert_refused(self.request("POST", "/api/v1/push/ack", "{}", token=False), 401, "unauthorized")

    def test_methods_and_addresses(self):
        for method, path, allow in [("POST", "push", "GET, HEAD"), ("GET", "push/ack", "POST"),
                                    ("POST", "received", "GET, HEAD"),
                                    ("PUT", "received/" + "A" * 22, "GET, HEAD, DELETE"),
                                    ("DELETE", f"received/{'A' * 22}/files/0", "GET, HEAD")]:
            answer = self.request(method, "/api/v1/" + path, "{}")
            self.assert_refused(answer, 405, "method_not_allowed")
            self.assertEqual(answer.headers["Allow"], allow)
        for path in ["push/x", "push/ack/x", "received/a/b", f"received/{'A' * 22}/files/0/x"]:
            self.assert_refused(self.request("GET", "/api/v1/" + path), 404, "not_found")

    def test_what_waits_comes_first_and_in_order(self):
        for _ in range(3):
            self.share_with(BERTA)
        stream = self.listen()
        self.marker()
        self.assertEqual([stream.next()[0] for _ in range(4)], [1, 2, 3, 4])

    def test_more_than_one_batch_waits(self):
        self.let_wait(200)
        stream = self.listen()
        self.assertEqual([stream.next()[0] for _ in range(200)], list(range(1, 201)))

    def test_a_broken_stream_goes_on_after_the_last_event(self):
        stream = self.listen()
        self.marker()
        self.marker()
        self.assertEqual(stream.next()[0], 1)
        stream.close()
        self.assertEqual(self.listen(last=1).next()[0], 2)
        self.assertEqual(self.listen().next()[0], 1, "it was not acknowledged")
        self.assertEqual(self.listen(last="").next()[0], 1)

    def test_an_event_id_that_was_never_given_out_counts_as_none(self):
        self.marker()
        stream = self.listen(last=2**62)
        self.assertEqual(stream.next()[0], 1)
        self.marker()
        self.assertEqual(stream.next()[0], 2)
        for last in ["x", "-1", "1.5", str(2**63), "9" * 40, "1 2"]:
            with self.subTest(last):
                answer = self.request("GET", "/api/v1/push", headers={"Last-Event-ID": last}, token=self.berta)
                self.assert_refused(answer, 400, "bad_request")

    def test_signs_of_life(self):
        stream = self.listen()
        lines = [stream.response.readline() for _ in range(4)]
        self.assertEqual(lines, [b":\n", b"\n"] * 2)

    def test_every_stream_of_an_account_gets_everything(self):
        streams = [self.listen() for _ in range(3)]
        self.marker()
        self.assertEqual(len({stream.next() for stream in streams}), 1)

    def test_a_ninth_stream_ends_the_oldest(self):
        other = self.listen(self.token)
        streams = [self.listen() for _ in range(9)]
        self.assertIsNone(streams[0].next())
        self.marker()
        self.assertEqual({stream.next()[0] for stream in streams[1:]}, {1})
        self.share_with(NUMBER)
        self.assertEqual(other.next()[0], 1)

    def test_a_stream_ends_cleanly_when_the_server_stops(self):
        streams = [self.listen(), self.listen(self.token)]
        self.assertEqual(self.stop(), 0)
        for stream in streams:
            self.assertIsNone(stream.next(), "the last chunk came, or reading it would have failed")

    def test_many_streams_of_many_accounts(self):
        code = self.run_account("invite", "--uses", "150").strip()
        self.kill()
        self.start("--registration-limit", "1000")
        streams, numbers = [], [f"+4915110000{i:03}" for i in range(150)]
        for number in numbers:
            answer = self.request("POST", "/api/v1/accounts", json.dumps({"number": number, "code": code}),
                                  {"Idempotency-Key": number}, token=False)
            streams.append(self.listen(answer.json()["token"]))
        self.share_with(*numbers[:100])
        self.share_with(*numbers[100:])
        self.assertEqual({stream.next()[0] for stream in streams}, {1})

    def test_a_renewed_account_is_told_on_the_new_phone_only(self):
        former = self.listen()
        code = self.run_account("renew", "--number", BERTA).strip()
        answer = self.request("POST", "/api/v1/accounts", json.dumps({"number": BERTA, "code": code}),
                              {"Idempotency-Key": "k"}, token=False)
        self.assertIsNone(former.next())
        stream = self.listen(answer.json()["token"])
        self.marker()
        self.assertEqual(stream.next()[0], 1)

    def test_a_removed_account_is_told_by_sms_and_its_stream_ends(self):
        stream = self.listen()
        self.share_with(BERTA)
        self.assertEqual(stream.next()[0], 1)
        self.run_account("remove", "--number", BERTA)
        self.assertEqual(self.share_with(BERTA)[1]["sms"], [BERTA])
        self.assertIsNone(stream.next(), "another process removed it, a later beat notices")


class SlowReaders(PushCase):
    options = ["--push-keepalive", "1", "--progress-timeout", "1"]

    def test_a_request_after_the_stream_does_not_end_it(self):
        connection = self.connect()
        head = f"GET /api/v1/push HTTP/1.1\r\nHost: x\r\nAuthorization: Bearer {self.berta}\r\n\r\n"
        connection.sendall(head.encode() + b"GET /healthz HTTP/1.1\r\nHost: x\r\n\r\n")
        self.marker()
        received = b""
        while b"content_token" not in received and (part := connection.recv(4096)):
            received += part
        self.assertIn(b"content_token", received)
        self.assertNotIn(b"\r\nok\n", received)

    def test_a_reader_that_takes_nothing_is_cut_off_and_loses_nothing(self):
        # More than the system's buffers hold.
        self.let_wait(20_000, 400)
        clock = self.listen(self.token)
        slow = socket.socket()
        self.addCleanup(slow.close)
        slow.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, 2048)
        slow.settimeout(30)
        slow.connect(("127.0.0.1", self.port))
        slow.sendall(f"GET /api/v1/push HTTP/1.1\r\nHost: x\r\nAuthorization: Bearer {self.berta}\r\n\r\n"
                     .encode())
        # The server's clock goes on meanwhile, as the signs of life on another stream tell.
        lines = 0
        while self.is_served(slow):
            clock.response.readline()
            lines += 1
            self.assertLess(lines, 120, "it is not cut off")
        slow.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, 1 << 20)
        received = read_until_closed(slow)
        self.assertIn(b"\nid: 1\n", received)
        self.assertNotIn(b"\nid: 20000\n", received)
        self.assertFalse(received.endswith(b"0\r\n\r\n"), "it did not end, it was cut")
        self.assertEqual(self.listen().next()[0], 1)

    def is_served(self, reader):
        """Whether the server's side of the connection is open, as the system tells: the reader itself comes to its end
        only behind all that waits for it."""
        with open("/proc/net/tcp", encoding="ascii") as table:
            next(table)
            for line in table:
                _, near, far, state, *_ = line.split()
                if (port_of(near), port_of(far)) == (self.port, reader.getsockname()[1]):
                    return state == "01"  # established
        return False


def port_of(address):
    return int(address.rpartition(":")[2], 16)


class LeavingReaders(PushCase):
    def test_a_reader_that_leaves_is_noticed_before_the_next_sign_of_life(self):
        stream = self.listen()
        before = time.monotonic()
        stream.client.sock.shutdown(socket.SHUT_WR)
        self.assertIsNone(stream.next())
        self.assertLess(time.monotonic(), before + 20)

    def test_a_place_is_free_again_when_its_reader_left(self):
        streams = [self.listen() for _ in range(8)]
        streams[7].client.sock.shutdown(socket.SHUT_WR)
        self.assertIsNone(streams[7].next())
        last = self.listen()
        self.marker()
        self.assertEqual({stream.next()[0] for stream in [*streams[:7], last]}, {1})


class FewDescriptors(PushCase):
    wrapper = ["prlimit", "--nofile=160:160"]

    def test_when_no_stream_fits_the_rest_goes_on(self):
        tokens = [self.token, self.berta]
        tokens += [self.run_account("add", "--number", f"+491511000000{i}").strip() for i in range(4)]
        streams = [self.listen(token) for token in tokens[:5] for _ in range(8)]
        refused = self.request("GET", "/api/v1/push", token=tokens[5])
        self.assert_refused(refused, 503, "busy")
        self.assertGreater(int(refused.headers["Retry-After"]), 0)
        self.marker()
        self.assertEqual(streams[8].next()[0], 1)
        streams[0].client.sock.shutdown(socket.SHUT_WR)
        self.assertIsNone(streams[0].next())
        self.listen(tokens[5])


class Acknowledging(PushCase):
    def test_acknowledged_pushes_are_never_sent_again(self):
        stream = self.listen()
        for _ in range(3):
            self.marker()
        ids = [stream.next()[0] for _ in range(3)]
        self.assertEqual(self.acknowledge(ids[1]).status, 204)
        self.assertEqual(self.acknowledge(ids[0]).status, 204, "again, and less")
        self.assertEqual(self.listen().next()[0], ids[2])
        self.kill()
        self.start()
        self.assertEqual(self.listen().next()[0], ids[2])
        self.assertEqual(self.acknowledge(ids[2]).status, 204)
        self.kill()
        self.start()
        stream = self.listen()
        self.marker()
        self.assertEqual(stream.next()[0], ids[2] + 1)

    def test_a_push_waits_over_restarts_of_the_server(self):
        self.share_with(BERTA)
        for end in [self.kill, self.stop]:
            end()
            self.start()
            self.assertEqual(self.listen().next()[0], 1)

    def test_an_id_that_was_never_given_out_acknowledges_nothing(self):
        for up_to in [1, 2**62]:
            self.assert_refused(self.acknowledge(up_to), 409, "conflict")
        self.assertEqual(self.acknowledge(0).status, 204)
        self.marker()
        self.assert_refused(self.acknowledge(2), 409, "conflict")
        self.assertEqual(self.listen().next()[0], 1)

    def test_another_account_acknowledges_its_own_only(self):
        self.share_with(BERTA, NUMBER)
        self.assertEqual(self.acknowledge(1, self.token).status, 204)
        self.assertEqual(self.listen().next()[0], 1)

    def test_malformed_acknowledgements(self):
        self.marker()
        for body in ["", "[]", "1", "{}", '{"up_to": -1}', '{"up_to": "1"}', '{"up_to": 1.0}',
                     '{"up_to": null}', '{"up_to": %d}' % 2**63, '{"up_to": 1e400}']:
            with self.subTest(body):
                self.assert_refused(self.acknowledge(body), 400, "bad_request")
        self.assert_refused(self.acknowledge("x" * 5000), 413, "too_large")
        self.assertEqual(self.listen().next()[0], 1)

    def test_a_share_withdrawn_before_it_was_told_is_told_to_nobody(self):
        share, _ = self.share_with(BERTA)
        self.withdraw(share)
        stream = self.listen()
        self.marker()
        self.assertEqual(stream.next()[0], 2)
        self.assertEqual([r["id"] for r in self.received().json()["received"]], [2])
        self.assertEqual(self.acknowledge(1).status, 204)

    def test_a_plain_token_is_kept_only_while_it_waits(self):
        stream = self.listen()
        self.marker()
        number, token = stream.next()
        self.acknowledge(number)
        self.assertEqual(self.stop(), 0)
        with open(self.data + "/metadata.db", "rb") as file:
            stored = file.read()
        self.assertIn(hashlib.sha256(token.encode()).digest(), stored)
        self.assertNotIn(token.encode(), stored)
