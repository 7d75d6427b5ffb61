"""Accounts that share and receive, and streams that are listened on."""

import http.client
import json
import sqlite3
import time

from harness import ServerCase

BERTA = "+447700900123"
CARL = "+15555550100"
STRANGER = "+15555550199"


class Stream:
    """A push stream that is open once its head was read; by way of `client` where that is not the server's own port."""

    def __init__(self, port, token, last=None, client=None):
        self.client = client or http.client.HTTPConnection("127.0.0.1", port, timeout=30)
        headers = {"Authorization": "Bearer " + token}
        if last is not None:
            headers["Last-Event-ID"] = str(last)
        self.client.request("GET", "/api/v1/push", headers=headers)
        self.response = self.client.getresponse()

    def next(self):
        """The next event as (id, content token); None at the end of the stream. Skips comments."""
        fields, deadline = {}, time.monotonic() + 30
        while line := self.response.readline():
            assert time.monotonic() < deadline, "nothing but signs of life"
            line = line.rstrip(b"\n").decode()
            if line and not line.startswith(":"):
                name, value = line.split(": ", 1)
                fields[name] = value
            elif not line and fields:
                assert fields["event"] == "share", fields
                return int(fields["id"]), json.loads(fields["data"])["content_token"]
        return None

    def close(self):
        self.client.close()
        self.response.close()


class PushCase(ServerCase):
    """Anna, who shares, and Berta, who receives."""

    def setUp(self):
        super().setUp()
        self.berta = self.run_account("add", "--number", BERTA).strip()

    def listen(self, token=None, last=None):
        stream = Stream(self.port, token or self.berta, last)
        self.addCleanup(stream.close)
        self.assertEqual(stream.response.status, 200)
        return stream

    def share_with(self, *numbers, contents=(b"hello",), token=True):
        """Shares and finishes; returns the record and the answer to the finish."""
        files = [{"name": f"file{i}.txt", "size": len(content), "type": "text/plain"}
                 for i, content in enumerate(contents)]
        share = self.post_share({"files": files, "recipients": [{"number": n} for n in numbers]},
                                token=token).json()
        for file, content in zip(share["files"], contents):
            answer = self.request("PATCH", file["upload"], content, self.tus_headers(0), token)
            self.assertEqual(answer.status, 204)
        return share, self.finish_as(share, token)

    def finish_as(self, share, token=True):
        answer = self.request("POST", f"/api/v1/shares/{share['share']}/finish", token=token)
        self.assertEqual(answer.status, 200, answer.body)
        return answer.json()

    def withdraw(self, share):
        answer = self.request("DELETE", "/api/v1/shares/" + share["share"])
        self.assertEqual(answer.status, 204)

    def acknowledge(self, up_to, token=None):
        body = up_to if isinstance(up_to, str) else json.dumps({"up_to": up_to})
        return self.request("POST", "/api/v1/push/ack", body, token=token or self.berta)

    def received(self, key=None, token=None, method="GET", headers=None):
        path = "/api/v1/received" + ("" if key is None else f"/{key}")
        return self.request(method, path, headers=headers, token=token or self.berta)

    def let_wait(self, count, length=22):
        """Makes so many pushes wait for Berta, faster than by sharing, with tokens of this length."""
        share, _ = self.share_with(BERTA)
        self.stop()
        with sqlite3.connect(self.data + "/metadata.db") as metadata:
            account, = metadata.execute("SELECT account FROM pushes").fetchone()
            source = metadata.execute("SELECT id, account, state, created, deadline FROM shares").fetchone()
            numbers = range(2, count + 1)
            metadata.executemany("INSERT INTO shares (key, id, account, state, created, deadline)"
                                 " VALUES (?, ?, ?, ?, ?, ?)",
                                 [(f"copy{n}", source[0] + n, *source[1:]) for n in numbers])
            metadata.executemany("INSERT INTO pushes VALUES (?, ?, ?, 0, ?, ?)",
                                 [(account, n, source[0] + n, f"{n:0{length}}", f"{n}".encode()) for n in numbers])
            metadata.execute("UPDATE accounts SET last_push = ? WHERE number = ?", [count, BERTA])
        self.start()

    def marker(self):
        """Shares once more: whatever a stream has before this one's push came before it."""
        self.share_with(BERTA)
