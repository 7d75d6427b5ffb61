"""What monitors and balancers are told, and how a server ends without losing what it has in hand."""

import http.client
import os
import re
import signal
import time

import harness

TOP = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..", "..")


class MonitoringCase(harness.ServerCase):
    options = ["--monitoring", "127.0.0.1:0"]

    def monitor(self, path, method="GET"):
        client = http.client.HTTPConnection("127.0.0.1", self.monitoring_port, timeout=30)
        try:
            client.request(method, path)
            response = client.getresponse()
            return harness.Answer(response, response.read())
        finally:
            client.close()

    def metric(self, name):
        """The value of a line of /metrics, by its name with its labels."""
        text = self.monitor("/metrics").body.decode()
        found = re.search(f"^{re.escape(name)} (.*)$", text, re.MULTILINE)
        return float(found.group(1)) if found else None

    def wait_metric(self, name, value):
        deadline = time.monotonic() + 20
        while self.metric(name) != value:
            self.assertLess(time.monotonic(), deadline, f"{name} did not become {value}")


class Metrics(MonitoringCase):
    def test_a_share_shows_in_the_counters(self):
        _, link = self.make_finished(b"x" * 1000)
        self.assertEqual(200, self.get(link).status)
        self.assertEqual(200, self.get(link + "/0").status)
        self.assertEqual(404, self.get("/s/" + "A" * 22).status)
        expected = {
            'pelliko_requests_total{endpoint="upload",status="2xx"}': 1,
            'pelliko_requests_total{endpoint="api",status="2xx"}': 2,
            'pelliko_requests_total{endpoint="page",status="2xx"}': 1,
            'pelliko_requests_total{endpoint="page",status="4xx"}': 1,
            'pelliko_requests_total{endpoint="download",status="2xx"}': 1,
            'pelliko_request_seconds_count{endpoint="upload"}': 1,
            "pelliko_uploads": 0, "pelliko_push_streams": 0, "pelliko_storage_calls": 0, "pelliko_draining": 0,
            'pelliko_storage_failures_total{kind="unavailable"}': 0,
        }
        for name, value in expected.items():
            with self.subTest(name):
                self.wait_metric(name, value)
        self.assertGreaterEqual(self.metric("pelliko_received_bytes_total"), 1000)
        self.assertGreaterEqual(self.metric("pelliko_sent_bytes_total"), 1000)

    def test_what_has_ended_is_counted_as_removed(self):
        share, _ = self.make_finished(b"x")
        self.assertEqual(204, self.request("DELETE", f"/api/v1/shares/{share['share']}").status)
        self.wait_metric("pelliko_removed_blobs_total", 1)

    def test_alerts_and_pages_name_only_what_is_told(self):
        _, link = self.make_finished(b"x" * 1000)
        self.get(link)
        self.wait_metric('pelliko_requests_total{endpoint="page",status="2xx"}', 1)
        told = set()
        for name, kind in re.findall(r"^# TYPE (\S+) (\S+)$", self.monitor("/metrics").body.decode(), re.MULTILINE):
            told |= {name + end for end in ("", "_bucket", "_count", "_sum")} if kind == "histogram" else {name}
        for page in ("docs/operation.md", "docs/server-operation.md", "service/server/prometheus-rules.yml"):
            with open(os.path.join(TOP, page), encoding="utf-8") as file:
                named = set(re.findall(r"pelliko_[a-z_]+", file.read()))
            self.assertTrue(named, page)
            self.assertLessEqual(named, told, page)

    def test_clients_are_not_told(self):
        self.assertEqual(404, self.get("/metrics").status)
        self.assertEqual(200, self.get("/readyz").status)
        self.assertEqual(404, self.monitor("/api/v1/shares").status)
        self.assertEqual(405, self.monitor("/metrics", "POST").status)

    def test_a_damaged_store_is_not_ready(self):
        self.assertEqual(200, self.monitor("/readyz").status)
        with open(os.path.join(self.data, "metadata.db"), "r+b") as file:
            file.truncate(0)
        self.assertEqual(503, self.monitor("/readyz").status)
        self.assertEqual(500, self.monitor("/healthz").status)


class DrainingCase(MonitoringCase):
    """SIGTERM while a body is on its way."""

    def begin(self, total, sent):
        self.share = self.make_share(total)
        self.upload = self.share["files"][0]["upload"]
        self.connection = self.connect()
        self.connection.sendall(self.patch_head(self.upload, 0, total) + b"x" * sent)
        self.wait_metric("pelliko_uploads", 1)

    def ask_to_end(self):
        self.process.send_signal(signal.SIGTERM)
        self.wait_metric("pelliko_draining", 1)


class Draining(DrainingCase):
    def test_an_upload_in_hand_ends_whole_and_nobody_new_is_taken(self):
        self.begin(1000, 500)
        self.ask_to_end()
        self.assertEqual(503, self.monitor("/readyz").status)
        with self.assertRaises(ConnectionRefusedError):
            self.connect()
        self.connection.sendall(b"x" * 500)
        answer = harness.read_until_closed(self.connection)
        self.assertRegex(answer, rb"^HTTP/1.1 204 ")
        self.assertIn(b"Upload-Offset: 1000", answer)
        self.assertEqual(0, self.process.wait(30))
        self.start()
        self.assertEqual(1000, self.offset(self.upload))

    def test_an_idle_connection_does_not_hold_it_up(self):
        idle = self.connect()
        self.wait_metric("pelliko_connections", 1)
        self.process.send_signal(signal.SIGTERM)
        self.assertEqual(b"", harness.read_until_closed(idle))
        self.assertEqual(0, self.process.wait(30))

    def test_who_connected_before_is_answered(self):
        self.process.send_signal(signal.SIGSTOP)
        connections = [self.connect() for _ in range(20)]
        for connection in connections:
            connection.sendall(b"GET /healthz HTTP/1.1\r\nHost: x\r\n\r\n")
        self.process.send_signal(signal.SIGTERM)
        self.process.send_signal(signal.SIGCONT)
        for connection in connections:
            self.assertRegex(harness.read_until_closed(connection), rb"^HTTP/1.1 200 (.|\r\n)*\r\nConnection: close\r\n")
        self.assertEqual(0, self.process.wait(30))

    def test_a_second_signal_ends_it_at_once_and_keeps_what_arrived(self):
        self.begin(1000, 500)
        self.ask_to_end()
        self.process.send_signal(signal.SIGTERM)
        self.assertEqual(0, self.process.wait(8))  # far less than what --drain gives
        self.start()
        self.assertLessEqual(self.offset(self.upload), 500)


class ShortDraining(DrainingCase):
    options = [*MonitoringCase.options, "--drain", "1"]

    def test_an_upload_that_takes_too_long_keeps_what_arrived(self):
        self.begin(1000, 500)
        self.ask_to_end()
        self.assertEqual(0, self.process.wait(30))
        self.assertIn(b" 409 ", harness.read_until_closed(self.connection))
        self.start()
        self.assertEqual(500, self.offset(self.upload))
