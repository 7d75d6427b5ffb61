"""A proxy in front of an S3 store that makes it a bad one: slow, busy, forgetful, or away."""

import collections
import http.client
import http.server
import socket
import threading
import time
import urllib.parse

SLOW_DOWN = b"<?xml version=\"1.0\"?><Error><Code>SlowDown</Code></Error>"
FAILED = b"<?xml version=\"1.0\"?><Error><Code>InternalError</Code></Error>"
HOP_HEADERS = ("connection", "keep-alive", "transfer-encoding")
CHUNK = 256 * 1024

Call = collections.namedtuple("Call", "kind path")


def kind_of(method, target):
    """One word for what a request asks of the store."""
    query = urllib.parse.parse_qs(urllib.parse.urlsplit(target).query, keep_blank_values=True)
    if "partNumber" in query:
        return "part"
    if "uploads" in query:
        return "begin" if method == "POST" else "uploads"
    if "uploadId" in query:
        return {"POST": "complete", "DELETE": "abort", "GET": "parts"}[method]
    return "list" if "list-type" in query else method.lower()


class Handler(http.server.BaseHTTPRequestHandler):
    protocol_version = "HTTP/1.1"

    def log_message(self, *_):
        pass

    def serve(self):
        proxy = self.server
        call = Call(kind_of(self.command, self.path), urllib.parse.urlsplit(self.path).path)
        body = self.rfile.read(int(self.headers.get("Content-Length", 0)))
        fault = proxy.fault_for(call)
        if fault == "hold":
            proxy.hold()
        if fault == "slow_down":
            self.answer(503, SLOW_DOWN)
        elif fault == "failed_late":
            self.answer(200, FAILED)
        else:
            if isinstance(fault, float):
                time.sleep(fault)  # that is the fault: a store that takes its time
            self.forward(body, lose=fault == "lose_answer", cut=fault == "cut")
        proxy.note(call)

    do_GET = do_HEAD = do_PUT = do_POST = do_DELETE = serve

    def answer(self, status, body):
        self.send_response(status)
        self.send_header("Content-Length", str(len(body)))
        self.end_headers()
        self.wfile.write(body)

    def forward(self, body, lose, cut):
        host, port = self.server.store.split(":")
        store = http.client.HTTPConnection(host, int(port), timeout=60)
        store.putrequest(self.command, self.path, skip_host=True, skip_accept_encoding=True)
        for name, value in self.headers.items():
            store.putheader(name, value)
        store.endheaders(body)
        answer = store.getresponse()
        if lose:
            answer.read()
            self.close_connection = True
            self.connection.shutdown(socket.SHUT_RDWR)
        else:
            self.copy(answer, cut)
        store.close()

    def copy(self, answer, cut):
        length = answer.getheader("Content-Length")
        rest = answer.read() if length is None and self.command != "HEAD" else b""
        self.send_response_only(answer.status)
        for name, value in answer.getheaders():
            if name.lower() not in HOP_HEADERS:
                self.send_header(name, value)
        if length is None:
            self.send_header("Content-Length", str(len(rest)))
        self.end_headers()
        self.wfile.write(rest)
        while part := answer.read(CHUNK):
            self.wfile.write(part)
            if cut and answer.length < CHUNK:
                self.close_connection = True
                self.connection.shutdown(socket.SHUT_RDWR)
                return


class StoreProxy:
    """Passes everything on to `store` ("host:port") but for the faults that are asked for."""

    def __init__(self, store):
        self.store = store
        self.changed = threading.Condition()
        self.faults = []
        self.seen = collections.Counter()
        self.held = 0
        self.holding = True
        self.connections = set()
        self.port = 0
        self.listener = None
        self.restore()

    def restore(self):
        """Takes connections, the first time or again."""
        self.listener = socket.create_server(("127.0.0.1", self.port), backlog=128)
        self.port = self.listener.getsockname()[1]
        threading.Thread(target=self.accept, args=[self.listener], daemon=True).start()

    def refuse(self):
        """Is as if it were not there."""
        try:
            self.listener.shutdown(socket.SHUT_RDWR)
        except OSError:
            return  # did so already
        self.listener.close()
        with self.changed:
            connections = list(self.connections)
        for connection in connections:
            try:
                connection.shutdown(socket.SHUT_RDWR)
            except OSError:
                pass  # gone already

    close = refuse

    def accept(self, listener):
        while True:
            try:
                connection, address = listener.accept()
            except OSError:
                return
            threading.Thread(target=self.handle, args=[connection, address], daemon=True).start()

    def handle(self, connection, address):
        with self.changed:
            self.connections.add(connection)
        try:
            Handler(connection, address, self)
        except (OSError, http.client.HTTPException):
            pass  # either side is gone
        with self.changed:
            self.connections.discard(connection)
        connection.close()

    def fault(self, name, *kinds, times=1, each=1):
        """From now on, `times` times, each `each`-th call of these kinds meets the fault: "slow_down", "lose_answer",
        "failed_late" (status 200 and an error), "cut" (an end in mid-body), "hold" (until the release) or so many
        seconds."""
        with self.changed:
            self.faults.append({"name": name, "kinds": kinds, "times": times, "each": each, "calls": 0})

    def fault_for(self, call):
        with self.changed:
            for fault in self.faults:
                if fault["times"] == 0 or (fault["kinds"] and call.kind not in fault["kinds"]):
                    continue
                fault["calls"] += 1
                if fault["calls"] % fault["each"] == 0:
                    fault["times"] -= 1
                    return fault["name"]
        return None

    def hold(self):
        with self.changed:
            self.held += 1
            self.changed.notify_all()
            self.changed.wait_for(lambda: not self.holding)

    def wait_held(self, count, seconds=60):
        """Returns once so many calls are being held."""
        with self.changed:
            assert self.changed.wait_for(lambda: self.held >= count, seconds), f"{self.held} are held"

    def release(self):
        """Lets those go that are held, and all to come."""
        with self.changed:
            self.holding = False
            self.changed.notify_all()

    def met(self):
        """Whether every fault was met as often as it was asked for: otherwise a test tested nothing."""
        with self.changed:
            return all(fault["times"] <= 0 for fault in self.faults)

    def note(self, call):
        with self.changed:
            self.seen[call.kind] += 1
            self.changed.notify_all()

    def wait_for(self, kind, count, seconds=60):
        """Returns once the store has answered so many calls of the kind."""
        with self.changed:
            done = self.changed.wait_for(lambda: self.seen[kind] >= count, seconds)
        assert done, f"the store saw {dict(self.seen)}"
