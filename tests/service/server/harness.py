"""A real pelliko-server for each case, on a port of its own, and a plain HTTP client for it."""

import http.client
import json
import os
import shutil
import signal
import socket
import sqlite3
import subprocess
import tempfile
import time
import unittest

from watch import MODIFIED, Watch, wait_for_size

PROGRAM = None  # set by http_test.py
POSTGRES = os.environ.get("PELLIKO_POSTGRES")  # by scripts/with-postgres
NUMBER = "+4915112345678"


class Answer:
    def __init__(self, response, body):
        self.status = response.status
        self.headers = response.headers
        self.body = body

    def json(self):
        return json.loads(self.body)


class ServerCase(unittest.TestCase):
    """Starts a server with `options` and one account; everything is gone at the end of the case."""

    options = []
    wrapper = []  # a command that the server is started by
    patience = 30  # seconds for an answer

    def setUp(self):
        self.directory = tempfile.mkdtemp(prefix="pelliko-server-")
        self.addCleanup(shutil.rmtree, self.directory)
        self.data = os.path.join(self.directory, "data")
        self.stores = ["--data", self.data, *self.other_stores()]
        self.token = self.run_account("add", "--number", NUMBER, "--name", "Anna").strip()
        self.process = None
        self.addCleanup(self.kill)
        self.start()

    def other_stores(self):
        """Options that say where the server's data are when not all of them in its directory; begins anew."""
        if POSTGRES is None:
            return []
        self.change_database("DROP SCHEMA public CASCADE; CREATE SCHEMA public")
        return ["--metadata", POSTGRES]

    def change_database(self, statement):
        """Something that only time, or an older server, brings about."""
        if POSTGRES is None:
            with sqlite3.connect(self.data + "/metadata.db") as database:
                database.execute(statement)
        else:
            subprocess.run(["psql", "-XqAt", "-d", POSTGRES, "-c", statement], check=True, stderr=subprocess.DEVNULL)

    def whole_database(self):
        """Everything that the stopped server has kept, but for the blobs."""
        if POSTGRES is None:
            with open(self.data + "/metadata.db", "rb") as file:
                return file.read()
        return subprocess.run(["pg_dump", "-d", POSTGRES], check=True, capture_output=True).stdout

    def run_account(self, command, *arguments, ok=True):
        done = subprocess.run([PROGRAM, "account", command, *self.stores, *arguments],
                              capture_output=True, text=True)
        self.assertEqual(done.returncode == 0, ok, done.stderr)
        return done.stdout if ok else done.stderr

    def start(self, *more):
        reading, writing = os.pipe()
        self.process = subprocess.Popen(
            [*self.wrapper, PROGRAM, "serve", *self.stores, "--listen", "127.0.0.1:0", "--ready-fd",
             str(writing), *self.options, *more],
            pass_fds=[writing], stderr=subprocess.DEVNULL)
        os.close(writing)
        with os.fdopen(reading) as ready:
            self.url, *monitoring = ready.read().splitlines()
        self.assertRegex(self.url, r"^http://127\.0\.0\.1:\d+$")
        self.port = int(self.url.rsplit(":", 1)[1])
        self.monitoring_port = int(monitoring[0].rsplit(":", 1)[1]) if monitoring else None

    def stop(self):
        self.process.send_signal(signal.SIGTERM)
        return self.process.wait(30)

    def kill(self):
        if self.process and self.process.poll() is None:
            self.process.kill()
            self.process.wait()

    # Requests

    def connect(self):
        """A raw socket, for what no client library would send."""
        connection = socket.create_connection(("127.0.0.1", self.port), timeout=self.patience)
        self.addCleanup(connection.close)
        return connection

    def request(self, method, path, body=None, headers=None, token=True):
        client = http.client.HTTPConnection("127.0.0.1", self.port, timeout=self.patience)
        try:
            return self.request_on(client, method, path, body, headers, token)
        finally:
            client.close()

    def request_on(self, client, method, path, body=None, headers=None, token=True):
        headers = dict(headers or {})
        if token:
            headers["Authorization"] = "Bearer " + (self.token if token is True else token)
        client.request(method, path, body, headers)
        response = client.getresponse()
        return Answer(response, response.read())

    def when_back(self, *request, **named):
        """The first answer of a server that can reach its stores again."""
        deadline = time.monotonic() + 30
        while time.monotonic() < deadline:
            answer = self.request(*request, **named)
            if answer.status != 503:
                return answer
            time.sleep(0.2)
        self.fail("the server does not find its stores again")

    def get(self, path, **headers):
        headers = {name.replace("_", "-"): value for name, value in headers.items()}
        return self.request("GET", path, headers=headers, token=False)

    def post_share(self, body, key=None, token=True):
        if not isinstance(body, (bytes, str)):
            body = json.dumps(body)
        headers = {"Idempotency-Key": key or os.urandom(8).hex()}
        return self.request("POST", "/api/v1/shares", body, headers, token)

    def make_share(self, *sizes, names=None):
        files = [{"name": names[i] if names else f"file{i}", "size": size}
                 for i, size in enumerate(sizes)]
        answer = self.post_share({"files": files, "recipients": [{"number": "+491511111"}]})
        self.assertEqual(answer.status, 201, answer.body)
        return answer.json()

    def tus_headers(self, offset):
        return {"Tus-Resumable": "1.0.0", "Upload-Offset": str(offset),
                "Content-Type": "application/offset+octet-stream"}

    def patch(self, upload, offset, body):
        return self.request("PATCH", upload, body, self.tus_headers(offset))

    def offset(self, upload):
        answer = self.request("HEAD", upload, headers={"Tus-Resumable": "1.0.0"})
        self.assertEqual(answer.status, 200)
        return int(answer.headers["Upload-Offset"])

    def patch_head(self, upload, offset, length):
        """The bytes of a PATCH request's head, for raw sockets."""
        lines = [f"PATCH {upload} HTTP/1.1", "Host: x", f"Authorization: Bearer {self.token}",
                 f"Content-Length: {length}"]
        lines += [f"{name}: {value}" for name, value in self.tus_headers(offset).items()]
        return "\r\n".join(lines + ["", ""]).encode()

    def begin_upload(self, upload, content, until):
        """Sends content[:until] of a request for all of it; returns its connection once the server has stored that
        much. For blobs in a directory."""
        others = set(self.blob_files())
        self.assertEqual(self.patch(upload, 0, content[:1]).status, 204)
        (path,) = set(self.blob_files()) - others
        with Watch(path, MODIFIED) as watch:
            connection = self.connect()
            connection.sendall(self.patch_head(upload, 1, len(content) - 1) + content[1:until])
            wait_for_size(watch, path, until)
        return connection

    def finish(self, share):
        answer = self.request("POST", f"/api/v1/shares/{share['share']}/finish")
        self.assertEqual(answer.status, 200, answer.body)
        return answer.json()

    def make_finished(self, *contents, names=None):
        """Shares the contents; returns the share's record and its link's path."""
        share = self.make_share(*map(len, contents), names=names)
        for file, content in zip(share["files"], contents):
            if content:
                self.assertEqual(self.patch(file["upload"], 0, content).status, 204)
        finished = self.finish(share)
        self.assertTrue(finished["url"].startswith(self.url + "/s/"))
        return share, finished["url"][len(self.url):]

    def blob_files(self):
        found = []
        for folder, _, files in os.walk(os.path.join(self.data, "blobs")):
            found += [os.path.join(folder, file) for file in files]
        return found

    # Checks

    def assert_refused(self, answer, status, name):
        self.assertEqual((answer.status, answer.json()["error"]), (status, name), answer.body)
        self.assertTrue(answer.json()["message"])


def read_head(connection):
    """The head of the answer that comes."""
    received = b""
    while b"\r\n\r\n" not in received and (part := connection.recv(65536)):
        received += part
    return received


def read_until_closed(connection):
    """Everything the other side still sends; a reset ends it as well. Fails when it sends for longer than a minute."""
    received, deadline = b"", time.monotonic() + 60
    try:
        while part := connection.recv(65536):
            received += part
            assert time.monotonic() < deadline, f"there is no end behind {len(received)} bytes"
    except ConnectionResetError:
        pass
    return received
