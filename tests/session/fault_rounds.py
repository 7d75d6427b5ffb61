"""Rounds of the application under a fault plan: a fresh process, a share or a push through it to its end, and
what was seen of it."""

import os
import re
import signal
import subprocess

import Xlib.display
import Xlib.ext.xtest
import Xlib.X

import share_case  # first: it knows where the next two are
import screen
import world

from gi.repository import Gio, GLib

LIMIT = float(os.environ.get("PELLIKO_ROUND_LIMIT", "20"))  # seconds for each step of a round
PROGRAM = os.path.join(os.environ["PELLIKO_BUILD"], "libexec", "pelliko")
LATE = 2000  # milliseconds after which the button is looked for where it was not drawn
OURS = re.compile(r"/(src|platform|service)/[\w/-]+\.(cpp|h)")
OPERATION = "http://tizen.org/appcontrol/operation/"


class Stage:
    """The world as the rounds need it, and the processes that play on it."""

    def __init__(self):
        self.folder = os.path.join(os.environ["PELLIKO_STATE"], "rounds")
        os.makedirs(self.folder)
        screen.announce_reader()
        self.log = world.Follower(world.APP_LOG)
        self.panel = share_case.ShareCase._watch_panel()
        self.outbox = world.Follower(os.environ["PELLIKO_SMS_OUTBOX"])
        self.application = world.BusName(world.APP)
        self.bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        # Waiting for the end of a request is looked at again when the service tells of a change.
        self.changes = self.bus.signal_subscribe(world.SERVICE, "com.velmora.pelliko.Shares1", "Changed", None, None,
                                                 Gio.DBusSignalFlags.NONE, lambda *_: None)
        self.display = Xlib.display.Display()
        self.button = None

    def close(self):
        self.bus.signal_unsubscribe(self.changes)
        self.panel.close()
        self.display.close()

    # --- what an actor does ---

    def launch(self, operation, uri=None, **extras):
        """Sends a launch request; the list that is returned gets the answer once it was dealt with."""
        request = {"operation": GLib.Variant("s", OPERATION + operation), "extras": GLib.Variant("a{sv}", {
            key: GLib.Variant("as" if isinstance(value, list) else "s", value) for key, value in extras.items()})}
        if uri:
            request["uri"] = GLib.Variant("s", uri)
        answers = []
        self.bus.call(world.APP, "/com/velmora/pelliko", "com.velmora.Platform.Application1", "Launch",
                      GLib.Variant("(a{sv}b)", (request, False)), None, Gio.DBusCallFlags.NO_AUTO_START, -1, None,
                      lambda bus, result: answers.append(self._answer(bus, result)))
        return answers

    @staticmethod
    def _answer(bus, result):
        try:
            return bus.call_finish(result)
        except GLib.Error as error:
            return error

    def click(self, place):
        Xlib.ext.xtest.fake_input(self.display, Xlib.X.MotionNotify, x=place[0], y=place[1])
        for event in (Xlib.X.ButtonPress, Xlib.X.ButtonRelease):
            Xlib.ext.xtest.fake_input(self.display, event, 1)
        self.display.sync()

    @staticmethod
    def place_of(label):
        extents = screen.at_rest(label, "button")
        return extents and (extents.x + extents.width // 2, extents.y + extents.height // 2)

    def learn_button(self):
        """Waits for the popup once, slowly; later rounds know where its button is drawn."""
        screen.wait_for_control("Share", "button")
        self.button = self.place_of("Share")


class Round:
    """One process under a plan. Afterwards: `status` (exit), `stayed` (it had to be ended), `said` (the log),
    `posted` (title, tag), `messages` (SMS), `requests` (states), `report` (sanitizers), `trace`, `hit`."""

    def __init__(self, stage, scene, plan="", leaks=False, stays=None):
        """`stays(lines)`, if given, says that the log has come to where the process will do nothing more."""
        self.stage, self.plan, self.stayed = stage, plan, False
        self.stays = stays or (lambda _lines: False)
        self._begin()
        self._start(leaks)
        try:
            scene(self)
            self.wait(lambda: self.over(), "the application to leave")
            if not self.ended:
                self._end()
        except world.WorldError as error:
            self.stopped = str(error)
            self._end()
        self._finish()

    def over(self):
        return self.ended or self.stays(self.lines())

    def wait(self, condition, what):
        world.wait_for(lambda: self.over() or condition(), what, LIMIT)

    def lines(self):
        return [line.split(") > ", 1)[-1] for line in self.stage.log.read()]

    # --- scenes ---

    def launch(self, operation, **options):
        answers = self.stage.launch(operation, **options)
        self.wait(lambda: answers, "the launch request to be dealt with")

    def press_share(self):
        """Presses Share as soon as it is drawn, or whatever button there is when it does not come."""
        def pressed():
            return any(line.startswith(("Action type is ", "share-fail")) for line in self.lines())
        if not self.stage.button:
            self.stage.learn_button()
        late = []
        timer = GLib.timeout_add(LATE, lambda: late.append(True) or True)
        drawing = screen.Drawing(lambda: self.stage.click(self.stage.button))
        try:
            self.stage.click(self.stage.button)
            self.wait(lambda: pressed() or late, "the popup")
            while not self.over() and not pressed():
                place = self.stage.place_of("Share") or self.stage.place_of("Cancel")
                if place:
                    self.stage.click(place)
                else:
                    screen.key("Escape")  # the back key, for whoever has no button
                turns = len(late)
                self.wait(lambda: pressed() or len(late) > turns, "the button to be pressed")
                if len(late) > 5:
                    raise world.WorldError("there is no button to press")
        finally:
            GLib.source_remove(timer)
            drawing.close()

    # --- its parts ---

    def _begin(self):
        self.stage.application.wait_gone()
        if os.path.exists(world.APP_LOG):
            os.remove(world.APP_LOG)
        self.stage.log.position, self.stage.log.rest, self.stage.log.lines = 0, b"", []
        self.panel_before = len(self.stage.panel.items)
        self.outbox_before = len(self.stage.outbox.read())
        self.requests_before = {request["id"] for request in world.requests()}
        for file in os.listdir(self.stage.folder):
            if not file.endswith(".jpg"):
                os.remove(os.path.join(self.stage.folder, file))

    def _start(self, leaks):
        report = os.path.join(self.stage.folder, "report")
        environment = dict(
            os.environ, DBUS_STARTER_BUS_TYPE="session", PELLIKO_FAULTS=self.plan,
            PELLIKO_FAULTS_TRACE=os.path.join(self.stage.folder, "trace"),
            ASAN_OPTIONS=f"detect_leaks={int(leaks)}:log_path={report}:handle_abort=1:exitcode=99:malloc_context_size=14",
            LSAN_OPTIONS="exitcode=0", UBSAN_OPTIONS=f"print_stacktrace=1:halt_on_error=1:log_path={report}")
        with open(os.path.join(self.stage.folder, "errors"), "wb") as errors:
            self.process = subprocess.Popen([PROGRAM], env=environment, stdin=subprocess.DEVNULL, stdout=errors, stderr=errors)
        self.ended = []
        GLib.child_watch_add(GLib.PRIORITY_DEFAULT, self.process.pid, lambda _pid, status: self.ended.append(status))
        world.wait_for(lambda: self.ended or self.stage.application.here(), "the application to start", LIMIT)

    def _end(self):
        """Ends a process that stays, as the session's end would."""
        self.stayed = True
        if not self.ended:
            self.process.send_signal(signal.SIGTERM)
        try:
            world.wait_for(lambda: self.ended, "the application to end", LIMIT)
        except world.WorldError:
            self.process.kill()
            world.wait_for(lambda: self.ended, "the application to die")

    def _finish(self):
        self.process.returncode = 0  # the loop has waited for it already
        self.status = os.waitstatus_to_exitcode(self.ended[0])
        self.said = self.lines()
        # The service may bring up another one, which this plan has no part in.
        world.wait_for(lambda: self._all_ended() and not self.stage.application.here(),
                       "the request to end and the application to be gone", LIMIT)
        self.posted = [(item.get("title") or item.get("text", ""), item.get("tag", ""))
                       for item in self.stage.panel.items[self.panel_before:]
                       if item.get("app") == world.APP and item["event"] == "post"]
        self.messages = len(self.stage.outbox.read()) - self.outbox_before
        self.requests = self._states()
        self.report = self._read("report.")
        self.errors = self._read("errors")
        self.trace = self._read("trace").splitlines()
        self.hit = any(line.endswith(" failed") for line in self.trace)

    def _states(self):
        return [request["state"] for request in world.requests() if request["id"] not in self.requests_before]

    def _all_ended(self):
        """Messages that could not be sent are asked for once more, which changes what became of a share."""
        return all(state in ("shared", "failed", "cancelled") for state in self._states())

    def _read(self, beginning):
        text = ""
        for name in sorted(os.listdir(self.stage.folder)):
            if name.startswith(beginning):
                with open(os.path.join(self.stage.folder, name), encoding="utf-8", errors="replace") as file:
                    text += file.read()
        return text

    # --- what is asked of it ---

    def crashes(self):
        """What the sanitizers found that is no leak."""
        return re.findall(r"ERROR: AddressSanitizer.*|.*runtime error:.*", self.report)

    def leaks(self):
        """Leaks of memory that code of this project asked for, each as the files through which it was asked."""
        return {" < ".join(dict.fromkeys(OURS.search(line)[0] for line in block.splitlines() if OURS.search(line)))
                for block in self.report.split("\n\n") if " leak of " in block and OURS.search(block)}
