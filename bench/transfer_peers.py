"""The parts that transfer-times measures: share server, background service, nginx, curl and tus-js-client, each with
the same few calls."""

import json
import os
import pathlib
import subprocess
import time

import gi

gi.require_version("Gio", "2.0")
from gi.repository import Gio, GLib  # noqa: E402

import nginx  # noqa: E402
import share_server  # noqa: E402
import watch  # noqa: E402
from share_server import RECIPIENT, ROOT, SENDER  # noqa: E402

SERVICE, SERVICE_PATH = "com.velmora.pelliko.Service", "/com/velmora/pelliko/Service"
UPLOADED = 3  # the service's report that a share is ready for its recipients
ENDS = (4, 5, 7)  # failed, cancelled, shared
LARGE = 32 * 1024 * 1024  # files whose removal takes the disk a while


def seconds_of(command, **options):
    """How long a program runs; one that fails ends the measuring."""
    begin = time.monotonic()
    subprocess.run(command, check=True, stdout=subprocess.DEVNULL, **options)
    return time.monotonic() - begin


class ShareServer(share_server.ShareServer):
    """One account that sends and one that receives, all on one disk."""

    def __init__(self, build, directory):
        self.data = os.path.join(directory, "server")
        super().__init__(share_server.program_of(build), ["--data", self.data])
        self.sender = self.client(SENDER)
        self.token = self.sender.token
        self.account("add", "--number", RECIPIENT)

    def make_share(self, files):
        """The share's record, and where each of the files goes."""
        share = self.sender.share([(os.path.basename(file), os.path.getsize(file)) for file in files])
        return share, [self.url + entry["upload"] for entry in share["files"]]

    def finish(self, share):
        """Ends the upload; returns the share's link."""
        return self.sender.finish(share)

    def clear(self):
        """Withdraws all shares and returns when no large file is left on the disk."""
        blobs = [path for path in pathlib.Path(self.data, "blobs").glob("*/*") if path.stat().st_size >= LARGE]
        watches = [watch.Watch(str(path.parent), watch.DELETED) for path in blobs]
        for share in self.sender.ask("GET", "shares")["shares"]:
            if share["state"] in ("uploading", "finished"):
                self.sender.ask("DELETE", "shares/" + share["share"])
        for path, seen in zip(blobs, watches):
            with seen:
                while path.exists():
                    seen.wait()


class Service:
    """pelliko-service on a session bus of its own."""

    def __init__(self, build, directory, server):
        program = os.path.join(build, "bin", "pelliko-service")
        home = os.path.join(directory, "service")
        for folder in ("config", "data", "run"):
            os.makedirs(os.path.join(home, folder), mode=0o700)
        self.bus_process = subprocess.Popen(
            ["dbus-daemon", "--session", "--nofork", "--print-address=1", f"--address=unix:dir={home}/run"],
            stdout=subprocess.PIPE, stderr=subprocess.DEVNULL, text=True)
        address = self.bus_process.stdout.readline().strip()
        environment = {**os.environ, "DBUS_SESSION_BUS_ADDRESS": address, "XDG_CONFIG_HOME": home + "/config",
                       "XDG_DATA_HOME": home + "/data", "XDG_RUNTIME_DIR": home + "/run"}
        subprocess.run([program, "account", "--server", server.url, "--number", SENDER], check=True,
                       input=server.token, text=True, env=environment)
        self.loop = GLib.MainLoop()
        self.reports = []
        self.bus = Gio.DBusConnection.new_for_address_sync(
            address, Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION,
            None, None)
        self.bus.signal_subscribe(None, SERVICE + "1", "UploadStatus", SERVICE_PATH, None, Gio.DBusSignalFlags.NONE,
                                  self.on_report)
        watch_id = Gio.bus_watch_name_on_connection(self.bus, SERVICE, Gio.BusNameWatcherFlags.NONE,
                                                    lambda *_: self.loop.quit(), None)
        with open(os.path.join(home, "log"), "wb") as log:
            self.process = subprocess.Popen([program], env=environment, stdout=log, stderr=log)
        self.loop.run()
        Gio.bus_unwatch_name(watch_id)

    def on_report(self, _bus, _sender, _path, _interface, _signal, values):
        request, status, _input, _percent, _expires, error = values.unpack()
        if status == UPLOADED or status in ENDS:
            self.reports.append((request, status, error, time.monotonic()))
            self.loop.quit()

    def call(self, method, arguments):
        return self.bus.call_sync(SERVICE, SERVICE_PATH, SERVICE + "1", method, arguments, None,
                                  Gio.DBusCallFlags.NONE, 60000).unpack()

    def upload(self, files):
        """Seconds from asking for a share of the files to the report that all of it is on the server."""
        names = [os.fsencode(file) + b"\0" for file in files]
        begin = time.monotonic()
        error, request = self.call("RequestUpload", GLib.Variant(
            "((ii)a(ssi)aayb)", ((0, 0), [("44", RECIPIENT, 1)], names, False)))
        if error:
            raise RuntimeError(f"the service refused the share: {error}")
        uploaded = None
        while True:
            while not self.reports:
                self.loop.run()
            _, status, error, when = self.reports.pop(0)
            uploaded = when if status == UPLOADED else uploaded
            if status in ENDS:
                break
        if uploaded is None:
            raise RuntimeError(f"the share ended with status {status}, error {error}")
        self.call("ConfirmEnd", GLib.Variant("(i)", (request,)))
        return uploaded - begin

    def stop(self):
        for process in (self.process, self.bus_process):
            process.terminate()
            process.wait()


class Nginx(nginx.Nginx):
    """PUT into a folder on the same disk."""

    def __init__(self, directory):
        home = os.path.join(directory, "nginx")
        self.root = home + "/root"
        os.makedirs(self.root)
        listen = f"127.0.0.1:{nginx.free_port()}"
        self.url = "http://" + listen
        super().__init__(home, f"server {{ listen {listen}; root {self.root}; client_max_body_size 0;"
                               " dav_methods PUT; }")

    def clear(self):
        for path in pathlib.Path(self.root).iterdir():
            path.unlink()


def curl_append(server, file, upload):
    """Uploads with one append that curl streams from the file."""
    return ["curl", "-sS", "--fail", "-X", "PATCH", "-T", file, "-H", f"Authorization: Bearer {server.token}",
            "-H", "Tus-Resumable: 1.0.0", "-H", "Upload-Offset: 0",
            "-H", "Content-Type: application/offset+octet-stream", upload]


def curl_put(file, url):
    return ["curl", "-sS", "--fail", "-T", file, url]


def curl_get(url):
    return ["curl", "-sS", "--fail", "-o", "/dev/null", url]


class TusClient:
    """tus-js-client in one Node.js process, which starts before the clock does."""

    def __init__(self, build):
        subprocess.run([ROOT / "tests" / "browser" / "run", build], check=True,
                       stdout=subprocess.DEVNULL)
        self.environment = {**os.environ, "PELLIKO_NODE_MODULES": os.path.join(build, "browser")}

    def upload(self, server, files, uploads):
        orders = {"token": server.token, "files": [{"path": p, "url": u} for p, u in zip(files, uploads)]}
        done = subprocess.run(["node", pathlib.Path(__file__).parent / "tus_upload.js"], input=json.dumps(orders),
                              check=True, capture_output=True, text=True, env=self.environment)
        return float(done.stdout)


def versions(build):
    """One line that names what is compared."""
    def first(*command):
        done = subprocess.run(command, check=True, text=True, stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
        return done.stdout.splitlines()[0].strip()
    package = json.loads(pathlib.Path(build, "browser", "node_modules", "tus-js-client", "package.json").read_text(
        encoding="utf-8"))
    return "; ".join([" ".join(first("curl", "--version").split()[:2]),
                      nginx.version(),
                      f"tus-js-client {package['version']} on Node.js {first('node', '--version')}",
                      f"Linux {os.uname().release}, {os.cpu_count()} processors"])
