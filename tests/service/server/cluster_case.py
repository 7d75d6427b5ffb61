"""Several servers on one database and one directory of blobs."""

import contextlib
import os
import sys
import time

from harness import ServerCase
from watch import MODIFIED, Watch, wait_for_size

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

    def begin_upload(self, upload, content, until):
        """Sends content[:until] of a request for all of it; returns its connection once the server has stored that
        much."""
        self.assertEqual(self.patch(upload, 0, content[:1]).status, 204)
        (path,) = self.blob_files()
        with Watch(path, MODIFIED) as watch:
            connection = self.connect()
            connection.sendall(self.patch_head(upload, 1, len(content) - 1) + content[1:until])
            wait_for_size(watch, path, until)
        return connection

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

    def when_back(self, *request, **named):
        """The first answer of a server that can reach its database again."""
        deadline = time.monotonic() + PATIENCE
        while time.monotonic() < deadline:
            answer = self.request(*request, **named)
            if answer.status != 503:
                return answer
            time.sleep(0.2)
        self.fail("the server does not find its database again")

    def assert_content(self, share, content):
        link = self.finish(share)["url"][len(self.url):]
        self.assertEqual(self.get(link + "/0").body, content)
