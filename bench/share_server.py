"""A share server as the benches start and ask it."""

import contextlib
import http.client
import json
import os
import pathlib
import subprocess
import sys
import uuid

ROOT = pathlib.Path(__file__).resolve().parent.parent
for folder in ("scripts/lib", "tests/service/server"):
    sys.path.insert(0, str(ROOT / folder))
from postgres_engine import BIN as POSTGRES_BIN, PostgresEngine  # noqa: E402, F401  for those who import this

SENDER, RECIPIENT = "+447700900100", "+447700900199"
NO_LIMIT = ["--daily-limit", str(2**50), "--share-limit", str(2**50)]
PATIENCE = 600


def program_of(build):
    return os.path.join(build, "bin", "pelliko-server")


def processor_seconds(pid):
    """Processor time that the process has used since its start."""
    with open(f"/proc/{pid}/stat", encoding="ascii") as stat:
        fields = stat.read().rsplit(")", 1)[1].split()
    return (int(fields[11]) + int(fields[12])) / os.sysconf("SC_CLK_TCK")


def children_of(pid):
    with open(f"/proc/{pid}/task/{pid}/children", encoding="ascii") as children:
        return [int(word) for word in children.read().split()]


def database_seconds(engine):
    """Processor time of all sessions and helpers of a PostgresEngine that run; one thread each, to the microsecond."""
    with open(engine.data + "/postmaster.pid", encoding="ascii") as file:
        first = int(file.readline())
    seconds = 0
    for pid in [first, *children_of(first)]:
        # A session may end just now.
        with contextlib.suppress(FileNotFoundError), open(f"/proc/{pid}/schedstat", encoding="ascii") as schedule:
            seconds += int(schedule.read().split()[0]) / 1e9
    return seconds


class Client:
    """Calls of one account, each over a connection of its own, or all over one that is `kept`."""

    def __init__(self, address, token=None, kept=False):
        self.connection = http.client.HTTPConnection(address, timeout=PATIENCE)
        self.token, self.kept = token, kept

    def request(self, method, path, body=None, headers=None):
        """Status and content of the answer, whatever it is."""
        headers = {**({"Authorization": f"Bearer {self.token}"} if self.token else {}), **(headers or {})}
        self.connection.request(method, path, body, headers)
        answer = self.connection.getresponse()
        content = answer.read()
        if not self.kept:
            self.connection.close()
        return answer.status, content

    def ask(self, method, path, body=None):
        """What the answer says; a refusal ends the measuring. `path` is below /api/v1/."""
        status, content = self.request(method, "/api/v1/" + path, None if body is None else json.dumps(body),
                                       {"Idempotency-Key": uuid.uuid4().hex})
        if status not in (200, 201, 204):
            raise RuntimeError(f"the server refused {method} {path}: {content.decode()}")
        return json.loads(content) if content else None

    def share(self, files, number=RECIPIENT):
        """Makes a share of files (name and size of each); returns its record."""
        return self.ask("POST", "shares", {"files": [{"name": name, "size": size} for name, size in files],
                                           "recipients": [{"number": number}]})

    def append(self, upload, size, pieces):
        """Sends a whole file as one append of these pieces; returns the status."""
        headers = {"Tus-Resumable": "1.0.0", "Upload-Offset": "0", "Content-Length": str(size),
                   "Content-Type": "application/offset+octet-stream"}
        return self.request("PATCH", upload, pieces, headers)[0]

    def finish(self, share):
        """Ends the upload; returns the share's link."""
        return self.ask("POST", f"shares/{share['share']}/finish")["url"]


class ShareServer:
    """pelliko-server on these stores (options), without a daily limit. Ask it by `client`."""

    def __init__(self, program, stores, *options):
        self.program, self.stores = program, stores
        reading, writing = os.pipe()
        self.process = subprocess.Popen(
            [program, "serve", *stores, "--listen", "127.0.0.1:0", "--ready-fd", str(writing), *NO_LIMIT, *options],
            pass_fds=[writing], stderr=subprocess.DEVNULL)
        os.close(writing)
        with os.fdopen(reading) as ready:
            self.url = ready.readline().strip()
        if not self.url:
            raise RuntimeError(f"{program} did not start")
        self.address = self.url.removeprefix("http://")
        self.port = int(self.url.rsplit(":", 1)[1])

    def account(self, *words):
        return subprocess.run([self.program, "account", *words, *self.stores], check=True, capture_output=True,
                              text=True).stdout.strip()

    def client(self, number, kept=False):
        """Makes an account for the number; returns who calls in its name."""
        return Client(self.address, self.account("add", "--number", number), kept)

    def memory(self, line, file="status"):
        """Kilobytes that the kernel tells in the line of this name."""
        with open(f"/proc/{self.process.pid}/{file}", encoding="ascii") as told:
            return sum(int(text.split()[1]) for text in told if text.startswith(line))

    def stop(self):
        self.process.terminate()
        self.process.wait()
