"""Three servers behind the balancers that the examples set up, as clients see them."""

import os
import shutil
import tempfile
import threading
import time

import harness
from push_case import BERTA, Stream
from cluster_case import MIB, PostgresEngine
from watch import MODIFIED, Watch
import kernel_limits
from server_cluster import PLAIN_PORT, ServerCluster, store_address

PATIENCE = 60


class BalancedCase(harness.ServerCase):
    """Requests go to the balancer, by TLS."""

    balancer = "nginx"

    @classmethod
    def setUpClass(cls):
        kernel_limits.apply()
        cls.engine = PostgresEngine()
        cls.addClassCleanup(cls.engine.close)

    def setUp(self):
        folder = tempfile.mkdtemp(prefix="pelliko-cluster-")
        self.addCleanup(shutil.rmtree, folder)
        self.engine.sql("DROP SCHEMA public CASCADE; CREATE SCHEMA public")
        self.cluster = ServerCluster(harness.PROGRAM, folder + "/cluster", self.engine.url(), store_address(self.id()),
                                     self.options, balancer=self.balancer)
        self.addCleanup(self.cluster.close)
        self.url = self.cluster.url
        self.token = self.cluster.account("add", "--number", harness.NUMBER)

    def request(self, method, path, body=None, headers=None, token=True):
        client = self.cluster.connect()
        try:
            return self.request_on(client, method, path, body, headers, token)
        finally:
            client.close()

    def wait_metric(self, node, name, value):
        deadline = time.monotonic() + PATIENCE
        while node.metric(name) != value:
            self.assertLess(time.monotonic(), deadline, f"{name} of {node.name} did not become {value}")

    def receiver(self):
        """The server that receives an upload now, once there is one."""
        deadline = time.monotonic() + PATIENCE
        while time.monotonic() < deadline:
            for node in self.cluster.nodes:
                if node.metric("pelliko_uploads") == 1:
                    return node
        return self.fail("no server receives: the balancer collects bodies")


class Listener(threading.Thread):
    """A phone that keeps a push stream open and comes back when it ends."""

    def __init__(self, cluster, token):
        super().__init__(daemon=True)
        self.cluster, self.token = cluster, token
        self.changed = threading.Condition()
        self.tokens, self.refused, self.streams, self.last, self.ends = [], [], 0, None, False

    def run(self):
        while not self.ends:
            stream = Stream(None, self.token, self.last, client=self.cluster.connect())
            with self.changed:
                self.streams += 1
                if stream.response.status != 200:
                    self.refused.append(stream.response.status)
                    self.changed.notify_all()
                    return
            self.listen(stream)

    def listen(self, stream):
        while (event := stream.next()) is not None:
            with self.changed:
                self.last = event[0]
                if event[1] not in self.tokens:
                    self.tokens.append(event[1])
                self.changed.notify_all()
        stream.close()

    def wait_for(self, count):
        with self.changed:
            return self.changed.wait_for(lambda: self.refused or len(self.tokens) >= count, PATIENCE)


class Sharer(threading.Thread):
    """Shares with Berta again and again and looks at what comes back; every answer is written down."""

    def __init__(self, case):
        super().__init__(daemon=True)
        self.case = case
        self.changed = threading.Condition()
        self.answers, self.done, self.failure, self.ends = [], 0, None, False

    def run(self):
        try:
            while not self.ends:
                self.share(os.urandom(3 * MIB))
                with self.changed:
                    self.done += 1
                    self.changed.notify_all()
        except Exception as failure:  # told by the test's own thread
            with self.changed:
                self.failure = failure
                self.changed.notify_all()

    def ask(self, *request, **named):
        answer = self.case.request(*request, **named)
        self.answers.append((request[0], answer.status))
        if answer.status >= 300:
            raise AssertionError(f"{request[:2]} was answered with {answer.status}: {answer.body}")
        return answer

    def share(self, content):
        body = harness.json.dumps({"files": [{"name": "a.bin", "size": len(content)}], "recipients": [{"number": BERTA}]})
        share = self.ask("POST", "/api/v1/shares", body, {"Idempotency-Key": os.urandom(8).hex()}).json()
        for offset in range(0, len(content), MIB):
            self.ask("PATCH", share["files"][0]["upload"], content[offset:offset + MIB], self.case.tus_headers(offset))
        link = self.ask("POST", f"/api/v1/shares/{share['share']}/finish").json()["url"][len(self.case.url):]
        self.ask("GET", link, token=False)
        if self.ask("GET", link + "/0", token=False).body != content:
            raise AssertionError("another file came back")

    def wait_for(self, count):
        """Returns once so many shares are through."""
        with self.changed:
            self.changed.wait_for(lambda: self.failure or self.done >= count, PATIENCE)
        if self.failure:
            raise self.failure
        if self.done < count:
            raise AssertionError("sharing does not get on")


class Upgrade:
    """For each of the balancers."""

    options = ["--daily-limit", str(2**40)]

    def test_servers_restarted_one_after_the_other_leave_no_gap(self):
        listener = Listener(self.cluster, self.cluster.account("add", "--number", BERTA))
        sharer = Sharer(self)
        listener.start()
        sharer.start()
        for node in self.cluster.nodes:
            sharer.wait_for(sharer.done + 2)
            node.ask_to_end()
            self.assertEqual(node.wait(), 0)
            sharer.wait_for(sharer.done + 2)
            node.start()
            self.wait_until_used(node, sharer)
        sharer.ends = True
        sharer.join(PATIENCE)
        self.assertIsNone(sharer.failure)
        self.assertTrue(listener.wait_for(sharer.done))
        self.assertEqual((listener.refused, len(listener.tokens)), ([], sharer.done))
        listener.ends = True
        self.assertGreater(listener.streams, 1, "the stream was on none of the servers that ended")

    def wait_until_used(self, node, sharer):
        """Returns when the balancer has noticed that a server is back."""
        deadline = time.monotonic() + PATIENCE
        while node.metric('pelliko_requests_total{endpoint="api",status="2xx"}') == 0:
            self.assertLess(time.monotonic(), deadline, f"{node.name} gets no requests any more")
            sharer.wait_for(sharer.done + 1)

    def test_an_append_in_hand_ends_at_the_server_that_is_about_to_leave(self):
        content = os.urandom(2 * MIB)
        share = self.make_share(len(content))
        client = self.cluster.connect()
        self.addCleanup(client.close)
        client.putrequest("PATCH", share["files"][0]["upload"])
        headers = {**self.tus_headers(0), "Content-Length": str(len(content)), "Authorization": "Bearer " + self.token}
        for name, value in headers.items():
            client.putheader(name, value)
        client.endheaders(content[:MIB])
        node = self.receiver()
        node.ask_to_end()
        self.wait_metric(node, "pelliko_draining", 1)
        self.assertEqual(self.request("GET", "/api/v1/account").status, 200)
        client.send(content[MIB:])
        answer = client.getresponse()
        self.assertEqual((answer.status, answer.headers["Upload-Offset"]), (204, str(len(content))))
        self.assertEqual(node.wait(), 0)
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def test_a_server_that_is_gone_is_passed_by(self):
        share, link = self.make_finished(b"hello")
        self.cluster.nodes[0].kill()
        for _ in range(20):
            self.assertEqual(self.get(link + "/0").body, b"hello")
            self.make_share(1)
        self.cluster.nodes[1].kill()
        self.assertEqual(self.get(link + "/0").body, b"hello")
        self.make_finished(b"abc")

    def test_that_the_database_is_away_is_told_in_the_servers_words(self):
        with Watch(str(self.cluster.balancer.log), MODIFIED) as watch:
            self.engine.stop()
            self.addCleanup(self.engine.restart)
            while self.balancer == "haproxy" and self.cluster.balancer.log.read_bytes().count(b" is DOWN") < 3:
                watch.wait()
        answer = self.request("GET", "/api/v1/account")
        self.assert_refused(answer, 503, "unavailable")
        self.assertEqual(answer.headers["Retry-After"], "5")
        self.engine.start()
        deadline = time.monotonic() + PATIENCE
        while self.request("GET", "/api/v1/account").status != 200:
            self.assertLess(time.monotonic(), deadline, "the database is not found again")

    def test_what_only_monitors_may_know_stays_inside(self):
        for path, status in [("/metrics", 404), ("/readyz", 404), ("/healthz", 200), ("/", 200)]:
            self.assertEqual(self.get(path).status, status, path)

    def test_a_call_that_is_too_large_is_refused_in_the_servers_words(self):
        self.assert_refused(self.post_share(b" " * (MIB + 1)), 413, "too_large")

    def test_the_kernel_has_the_limits_of_the_example(self):
        limits = {file.name: value.split() for file, value in kernel_limits.advised()}
        self.assertEqual({file.name: file.read_text(encoding="ascii").split() for file, _ in kernel_limits.advised()}, limits)
        self.assertEqual({"tcp_rmem", "tcp_notsent_lowat"}, set(limits))

    def test_plain_requests_are_led_to_tls(self):
        client = harness.http.client.HTTPConnection("localhost", PLAIN_PORT, timeout=PATIENCE)
        self.addCleanup(client.close)
        client.request("GET", "/s/abc")
        answer = client.getresponse()
        self.assertEqual((answer.status, answer.headers["Location"].split("/")[:2]), (301, ["https:", ""]))


class Guessing:
    options = ["--registration-limit", "3"]

    def test_nobody_gets_more_attempts_by_naming_other_addresses(self):
        body = harness.json.dumps({"number": "+4915199999999", "code": "A" * 22})
        statuses = []
        for i in range(30):
            headers = {"Idempotency-Key": "k", "X-Forwarded-For": f"203.0.113.{i}"}
            statuses.append(self.request("POST", "/api/v1/accounts", body, headers, token=False).status)
        self.assertEqual((statuses.count(403), statuses.count(429)), (9, 21), "three at each server")


class NginxUpgrade(Upgrade, BalancedCase):
    pass


class NginxGuessing(Guessing, BalancedCase):
    pass


class HaproxyUpgrade(Upgrade, BalancedCase):
    balancer = "haproxy"


class HaproxyGuessing(Guessing, BalancedCase):
    balancer = "haproxy"
