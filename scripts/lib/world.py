"""What scripts and whole-program tests do inside a private world: launch, wait and read back.

Everything waits for something that the other side announces (a D-Bus signal, a line of output, a
change of a file); the time limits only end a wait that will never be answered.
"""

import hashlib
import html.parser
import json
import os
import re
import select
import signal
import subprocess
import urllib.parse
import urllib.request

import gi

gi.require_version("Gio", "2.0")
from gi.repository import Gio, GLib  # noqa: E402

APP = "com.velmora.pelliko"
SERVICE = "com.velmora.pelliko.Service"
APP_LOG = "/opt/usr/apps/com.velmora.pelliko/data/.app-logs/app.log"
LIMIT = float(os.environ.get("PELLIKO_WAIT_LIMIT", "60"))
LINK = re.compile(r"https?://[^\s/]+/s/[A-Za-z0-9_-]{22}")


class WorldError(Exception):
    """Something that was waited for did not come, or a program refused; the text says what."""


def run(*command, **options):
    """Runs a program and returns what it printed; its error output becomes the error's text."""
    done = subprocess.run(command, capture_output=True, text=True, **options)
    if done.returncode != 0:
        said = (done.stderr or done.stdout).strip().splitlines()
        raise WorldError(f"{command[0]} ended with {done.returncode}: {said[-1] if said else 'no message'}")
    return done.stdout


# --- waiting ----------------------------------------------------------------------------------------


def wait_for(condition, what, limit=LIMIT):
    """Turns the main loop until condition() is true and returns its value.

    The condition is looked at again after every event of the loop, so whoever knows of the change
    must be a source of the loop: a Follower, a bus subscription, an accessibility listener.
    """
    context = GLib.MainContext.default()
    expired = []
    timer = GLib.timeout_add(int(limit * 1000), lambda: expired.append(True) or True)
    try:
        while not (value := condition()):
            if expired:
                raise WorldError(f"waited {limit:.0f} s in vain for {what}")
            context.iteration(True)
        return value
    finally:
        GLib.source_remove(timer)


def let_pass(seconds):
    """Turns the main loop for so long."""
    over = []
    GLib.timeout_add(int(seconds * 1000), lambda: over.append(True))
    wait_for(lambda: over, "time to pass", seconds + LIMIT)


class Follower:
    """Hands out the complete lines of a file that others append to, as they come."""

    def __init__(self, path):
        self.path = path
        self.position = 0
        self.rest = b""
        self.lines = []
        self.monitor = Gio.File.new_for_path(path).monitor_file(Gio.FileMonitorFlags.NONE, None)
        self.monitor.set_rate_limit(1)
        self.monitor.connect("changed", lambda *_: self.read())

    def read(self):
        try:
            with open(self.path, "rb") as file:
                file.seek(self.position)
                data = file.read()
        except FileNotFoundError:
            return self.lines
        self.position += len(data)
        *complete, self.rest = (self.rest + data).split(b"\n")
        self.lines += [line.decode("utf-8", "replace") for line in complete]
        return self.lines

    def wait(self, condition, what, limit=LIMIT):
        """Waits until condition(lines) is true and returns its value."""
        return wait_for(lambda: condition(self.read()), what, limit)


class Stream:
    """A program that prints one JSON object per line, for example `quickpanel-tool watch`."""

    def __init__(self, *command):
        self.process = subprocess.Popen(command, stdout=subprocess.PIPE)
        os.set_blocking(self.process.stdout.fileno(), False)
        self.rest = b""
        self.items = []
        self.source = GLib.io_add_watch(self.process.stdout, GLib.PRIORITY_DEFAULT,
                                        GLib.IOCondition.IN | GLib.IOCondition.HUP, self._read)

    def _read(self, *_):
        try:
            data = os.read(self.process.stdout.fileno(), 65536)
        except BlockingIOError:
            return True
        if not data:
            self.source = None
            return False
        *complete, self.rest = (self.rest + data).split(b"\n")
        self.items += [json.loads(line) for line in complete if line.strip()]
        return True

    def wait(self, condition, what, limit=LIMIT):
        """Waits until condition(items) is true and returns its value."""
        return wait_for(lambda: condition(self.items), what, limit)

    def close(self):
        if self.source:
            GLib.source_remove(self.source)
        self.process.terminate()
        self.process.wait()
        self.process.stdout.close()


class BusName:
    """Whether a program is running, told by the session bus: what it announces wakes the loop, but may come late, so
    who has the name is asked."""

    def __init__(self, name):
        self.name = name
        self.known = False
        self.was_here = False
        self.left = False
        self.watch = Gio.bus_watch_name(Gio.BusType.SESSION, name, Gio.BusNameWatcherFlags.NONE,
                                        self._appeared, self._vanished)
        wait_for(lambda: self.known, f"the bus to tell who owns {name}")

    def _appeared(self, _connection, _name, _owner):
        self.known, self.was_here, self.left = True, True, False

    def _vanished(self, _connection, _name):
        self.known, self.left = True, self.was_here

    def _ask_bus(self, method):
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        return bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
                             GLib.Variant("(s)", (self.name,)), None, Gio.DBusCallFlags.NONE, 5000).unpack()[0]

    def here(self):
        return self._ask_bus("NameHasOwner")

    def wait_gone(self, limit=LIMIT):
        wait_for(lambda: not self.here(), f"{self.name} to leave the bus", limit)

    def wait_here(self, limit=LIMIT):
        wait_for(self.here, f"{self.name} to come to the bus", limit)

    def process_id(self):
        return self._ask_bus("GetConnectionUnixProcessID")

    def kill(self):
        """Ends the program and waits until it is gone; False when it had left, or was leaving, by itself."""
        try:
            os.kill(self.process_id(), signal.SIGKILL)
            killed = True
        except (GLib.Error, ProcessLookupError):
            killed = False
        self.wait_gone()
        return killed


# --- contacts and launch requests ---------------------------------------------------------------


def contacts():
    """All phone numbers of the contacts store: dictionaries with number_id, name, number, joined."""
    return json.loads(run("contacts-tool", "list", "--json"))


def add_contact(name, number, joined=False):
    """Adds a contact and returns the id of its number."""
    run("contacts-tool", "add", "--name", name, "--number", number, *(["--joined"] if joined else []))
    return max(c["number_id"] for c in contacts() if c["name"] == name)


def launch(operation, *options, app=APP):
    """Sends a launch request and returns what app-launch printed."""
    return run("app-launch", "--app", app, "--operation", f"appcontrol/operation/{operation}", *options)


def recipients_option(number_ids):
    return [word for number_id in number_ids
            for word in ("--extra-array", f"appcontrol/data/to={number_id}")]


def share(paths, number_ids):
    """Hands files over as a gallery would: one file as a share, several as a multi share."""
    if len(paths) == 1:
        return launch("share", "--uri", f"file://{paths[0]}", *recipients_option(number_ids))
    files = [word for path in paths for word in ("--extra-array", f"appcontrol/data/path={path}")]
    return launch("multi_share", *files, *recipients_option(number_ids))


def share_text(text, number_ids):
    return launch("share_text", "--extra", f"appcontrol/data/text={text}", *recipients_option(number_ids))


def notifications():
    """The notifications that the keeper holds now."""
    return json.loads(run("quickpanel-tool", "list", "--json"))


def put_banners_away():
    """Takes the desktop's notifications off the screen, where they would lie above a window's controls."""
    run("dunstctl", "close-all")


# --- what a recipient does --------------------------------------------------------------------------


class _Links(html.parser.HTMLParser):
    def __init__(self):
        super().__init__()
        self.targets = []

    def handle_starttag(self, tag, attributes):
        target = dict(attributes).get("href")
        if tag == "a" and target:
            self.targets.append(target)


def link_in(text):
    """The link of an SMS."""
    found = LINK.search(text)
    if not found:
        raise WorldError(f"the message has no link: {text}")
    return found.group(0)


def download_all(link):
    """Opens a link as a browser would and fetches every single file of its page: {name: bytes}."""
    with urllib.request.urlopen(link, timeout=LIMIT) as answer:
        page = _Links()
        page.feed(answer.read().decode("utf-8"))
    files = {}
    for target in dict.fromkeys(page.targets):
        address = urllib.parse.urljoin(link, target)
        if not re.search(r"/s/[A-Za-z0-9_-]{22}/\d+$", urllib.parse.urlsplit(address).path):
            continue
        with urllib.request.urlopen(address, timeout=LIMIT) as answer:
            files[_attachment_name(answer.headers["Content-Disposition"])] = answer.read()
    return files


def _attachment_name(disposition):
    encoded = re.search(r"filename\*=UTF-8''([^;\s]+)", disposition)
    if encoded:
        return urllib.parse.unquote(encoded.group(1))
    return re.search(r'filename="((?:[^"\\]|\\.)*)"', disposition).group(1)


def sha256(data):
    return hashlib.sha256(data).hexdigest()


def sha256_of_file(path):
    with open(path, "rb") as file:
        return sha256(file.read())


# --- the upload service -----------------------------------------------------------------------------


def service(method, arguments=None):
    """Calls the background service and returns what it answered."""
    bus = Gio.bus_get_sync(Gio.BusType.SESSION)
    return bus.call_sync(SERVICE, "/com/velmora/pelliko/Service", "com.velmora.pelliko.Service1", method,
                         arguments, None, Gio.DBusCallFlags.NONE, int(LIMIT * 1000)).unpack()


def requests():
    """The service's queue and history, oldest first."""
    return service("ListRequests")[0]


def stop_service():
    """Ends the background service; the next call starts it with the environment of then."""
    running = BusName(SERVICE)
    if running.here():
        os.kill(running.process_id(), signal.SIGTERM)
        running.wait_gone()


def activation_environment(**values):
    """Sets environment variables that programs get which the bus starts from now on."""
    bus = Gio.bus_get_sync(Gio.BusType.SESSION)
    bus.call_sync("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                  "UpdateActivationEnvironment", GLib.Variant("(a{ss})", (values,)), None,
                  Gio.DBusCallFlags.NONE, 5000)


# --- the share server -------------------------------------------------------------------------------

_SERVER_PID = os.path.join(os.environ.get("XDG_RUNTIME_DIR", ""), "pelliko-server.pid")


def kill_server():
    """Kills the share server as a crash would and returns once it is gone."""
    with open(_SERVER_PID, encoding="ascii") as file:
        process = int(file.read())
    handle = os.pidfd_open(process)
    try:
        os.kill(process, signal.SIGKILL)
        if not select.select([handle], [], [], LIMIT)[0]:
            raise WorldError("the share server does not die")
    finally:
        os.close(handle)


def start_server():
    """Starts the share server on the world's data and address; returns once it accepts connections."""
    state = os.environ["PELLIKO_STATE"]
    address = urllib.parse.urlsplit(os.environ["PELLIKO_SERVER_URL"]).netloc
    ready, tell = os.pipe()
    with open(os.path.join(state, "log", "pelliko-server.log"), "ab") as log:
        server = subprocess.Popen(["pelliko-server", "serve", "--listen", address, "--data",
                                   os.path.join(state, "server"), "--ready-fd", str(tell)],
                                  pass_fds=[tell], stdout=log, stderr=log)
    os.close(tell)
    with os.fdopen(ready) as line:
        if not line.readline():
            raise WorldError("the share server did not start again")
    with open(_SERVER_PID, "w", encoding="ascii") as file:
        file.write(f"{server.pid}\n")
