"""Several servers on one database and one directory of blobs."""

import contextlib
import http.client
import os
import sys
import threading
import time

from harness import ServerCase

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../../scripts/lib"))
from postgres_engine import PostgresEngine  # noqa: E402

MIB = 1024 * 1024
PATIENCE = 30


class Node:
    """One of the servers."""

    def __init__(self, case):
        self.process, self.port, self.url = case.process, case.port, case.url


class ClusterCase(ServerCase):
    """Begins with one server, `first`; requests go to the one that `at` names, else to the last one started."""

    engine_options = {}

    @classmethod
    def setUpClass(cls):
        cls.engine = PostgresEngine(**cls.engine_options)
        cls.addClassCleanup(cls.engine.close)

    def setUp(self):
        self.nodes = []
        super().setUp()
        self.first = self.nodes[0]

    def other_stores(self):
        self.engine.sql("DROP SCHEMA public CASCADE; CREATE SCHEMA public")
        return ["--metadata", self.engine.url()]

    def start(self, *more):
        super().start(*more)
        self.nodes.append(Node(self))

    def another(self, *more):
        self.start(*more)
        return self.nodes[-1]

    def kill(self):
        for node in self.nodes:
            if node.process.poll() is None:
                node.process.kill()
                node.process.wait()

    def kill_node(self, node):
        node.process.kill()
        node.process.wait()

    @contextlib.contextmanager
    def at(self, node):
        former = self.port, self.url
        self.port, self.url = node.port, node.url
        try:
            yield
        finally:
            self.port, self.url = former

    def append_everywhere(self, upload, content):
        """The same append at every server at once; the answers' statuses."""
        statuses = []

        def write(node):
            client = http.client.HTTPConnection("127.0.0.1", node.port, timeout=60)
            try:
                statuses.append(self.request_on(client, "PATCH", upload, content, self.tus_headers(0)).status)
            except ConnectionError:
                statuses.append(409)  # told while the body was still on its way
            finally:
                client.close()

        self.all_at_once(write, self.nodes)
        return statuses

    def all_at_once(self, work, things):
        """Does the work with each of the things on a thread of its own; returns when all is done."""
        threads = [threading.Thread(target=work, args=[thing]) for thing in things]
        for thread in threads:
            thread.start()
        for thread in threads:
            thread.join()

    def go_on(self, upload, content):
        """Uploads what is missing, as a client does that was cut off or told to come again."""
        deadline = time.monotonic() + PATIENCE
        while time.monotonic() < deadline:
            head = self.request("HEAD", upload, headers={"Tus-Resumable": "1.0.0"})
            if head.status == 200:
                offset = int(head.headers["Upload-Offset"])
                if offset == len(content) or self.patch(upload, offset, content[offset:]).status == 204:
                    return
            time.sleep(0.2)
        self.fail("the upload does not get on")

    def withdraw(self, share):
        self.assertEqual(self.request("DELETE", "/api/v1/shares/" + share["share"]).status, 204)

    # What there is, seen from outside

    def stored_sizes(self):
        """By the names that the database has for them."""
        return {os.path.basename(path): os.path.getsize(path) for path in self.blob_files()}

    def stored_contents(self):
        contents = []
        for path in self.blob_files():
            with open(path, "rb") as file:
                contents.append(file.read())
        return contents

    def assert_nothing_is_left(self):
        """After a sweep there is what the database knows, as long as it says, and it knows of nothing that nobody has."""
        self.engine.wait_until("SELECT WHERE NOT EXISTS (SELECT FROM blobs WHERE doomed)")
        rows = [row.split("|") for row in self.engine.sql("SELECT key, received FROM blobs").splitlines()]
        known = {key: int(received) for key, received in rows}
        self.assertEqual({key: size for key, size in self.stored_sizes().items() if size or key not in known},
                         {key: received for key, received in known.items() if received})
        self.assertEqual(self.engine.sql("SELECT key FROM blobs b WHERE NOT EXISTS"
                                         " (SELECT FROM files f WHERE f.blob = b.id)"), "")

    def assert_nobody_has_a_right(self):
        """To write an upload; those that end are given back in a moment."""
        self.engine.wait_until("SELECT WHERE NOT EXISTS (SELECT FROM pg_locks WHERE locktype = 'advisory'"
                               " AND objsubid = 1)")

    def assert_stored(self, *contents):
        """After a sweep there are exactly these contents."""
        self.assert_nothing_is_left()
        self.assertEqual(sorted(self.stored_contents()), sorted(contents))

    def assert_content(self, share, content):
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)

    def assert_it_comes_and_goes(self, share, content):
        """What is missing of the share's file can be uploaded, and once it is withdrawn nothing is left of it."""
        self.go_on(share["files"][0]["upload"], content)
        self.assert_content(share, content)
        self.assert_stored(content)
        self.withdraw(share)
        self.assert_stored()
