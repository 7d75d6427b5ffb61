#!/usr/bin/python3
"""A simulated phone: one or two modems that speak AT over TCP, and the real ofonod that drives them.

  phonesim.py run --imsi IMSI[,IMSI2] --state DIR --outbox FILE --control SOCKET [--ready-fd N]
  phonesim.py tell SOCKET COMMAND [ARGUMENT...]

Messages that the network takes are appended to FILE as JSON lines (to, text, sim, time), put together from
their parts. Commands, sent as one line to SOCKET and answered by one line once they are done ("ok", or what
failed); SLOT counts from 1:

  refuse SLOT        the network refuses every message       accept SLOT   and takes them again
  silent SLOT        messages are never answered             drop SLOT     the modem closes its line
  sim SLOT unreadable|locked|ready|IMSI                      the SIM, as it is when the modem is next powered
                     (ofonod does not live through a modem that reports no SIM or an empty number)
  power SLOT on|off  switches the modem as the phone's shell does
  enter-pin SLOT PIN                                         unlocks the SIM (the PIN is 1234)
  service start|stop|kill|hang                               the modem service
  wait-message SLOT N                                        answers when the modem was handed N parts since the reset
  reset              everything as at the start, with a new modem service

The outer process ends its ofonod when it ends.
"""

import argparse
import asyncio
import json
import os
import re
import shutil
import signal
import socket
import sys
import time

sys.path.insert(0, os.path.dirname(os.path.abspath(__file__)))
sys.dont_write_bytecode = True

from sms_pdu import Assembler, decode_submit  # noqa: E402

PIN = "1234"
LIMIT = 30
STORE = "/var/lib/ofono"
# What a modem of this kind answers where no state is involved.
FIXED = {
    "+CGMI": "Pelliko", "+CGMM": "Simulated", "+CGMR": "1.0", "+CGSN": "356938035643809",
    "+CSCS=?": '+CSCS: ("GSM","UTF-8")', "+CSCS?": '+CSCS: "GSM"',
    "+CSMS=?": "+CSMS: (0,1)", "+CSMS?": "+CSMS: 1,1,1,1", "+CSMS=1": "+CSMS: 1,1,1",
    "+CMGF=?": "+CMGF: (0,1)", "+CPMS=?": '+CPMS: ("SM","ME"),("SM","ME"),("SM","ME")',
    "+CNMI=?": "+CNMI: (0-2),(0-3),(0-3),(0-2),(0,1)", "+CSCA?": '+CSCA: "+491710760000",145',
    "+CPIN=?": None, "+CPWD=?": '+CPWD: ("SC",8)', "+CREG=?": "+CREG: (0-2)", "+CREG?": '+CREG: 2,1,"0001","0001"',
    "+COPS?": '+COPS: 0,2,"26201"', "+CSQ": "+CSQ: 20,99", "+CIND=?": '+CIND: ("signal",(0-5))', "+CIND?": "+CIND: 4",
    "+CFUN?": "+CFUN: 1", "+CBC": "+CBC: 0,100", "+CNUM": None, "+CCWA=?": "+CCWA: (0,1)",
}


class Modem:
    """One modem: its SIM, what the network does, and its line to the modem service."""

    def __init__(self, slot, imsi, deliver):
        self.slot, self.first_imsi, self.deliver = slot, imsi, deliver
        self.writer = None
        self.handed = asyncio.Condition()
        self.reset()

    def reset(self):
        self.imsi = self.first_imsi
        self.sim = "ready"
        self.network = "accept"
        self.assembler = Assembler()
        self.reference = 0
        self.parts = 0

    async def serve(self, reader, writer):
        self.writer = writer
        try:
            while True:
                line = (await reader.readuntil(b"\r")).decode("ascii", "replace").strip()
                if line:
                    await self.command(line, reader)
        except (asyncio.IncompleteReadError, ConnectionError):
            pass
        finally:
            writer.close()

    def say(self, *lines):
        for line in lines:
            self.writer.write(f"\r\n{line}\r\n".encode("ascii"))

    async def command(self, line, reader):
        if os.environ.get("PELLIKO_PHONESIM_DEBUG"):
            print(f"phonesim: modem {self.slot}: {line}", file=sys.stderr)
        command = line[2:] if line.upper().startswith("AT") else line
        if command.startswith("+CMGS="):
            await self.submit(int(command[6:]), reader)
        elif command.startswith("+CPIN"):
            self.pin(command)
        elif command.startswith("+CIMI"):
            self.answer_with_sim(self.imsi)
        elif command.startswith("+CRSM"):
            self.answer_with_sim("+CRSM: 106,130")  # no such file
        elif command in FIXED:
            self.say(*[text for text in (FIXED[command],) if text], "OK")
        elif command.endswith("?"):
            self.say("ERROR")
        else:
            self.say("OK")

    def insert(self, sim):
        if sim in ("unreadable", "locked", "ready"):
            self.sim = sim
        else:
            self.sim, self.imsi = "ready", sim

    def answer_with_sim(self, text):
        if self.sim == "ready":
            self.say(*[line for line in (text,) if line], "OK")
        else:
            self.say("+CME ERROR: 11")  # PIN required

    def pin(self, command):
        entered = re.match(r'\+CPIN="?([^",]*)"?', command)
        if self.sim == "unreadable":
            return  # a modem that goes on trying to read a card
        if command == "+CPIN?":
            self.say("+CPIN: SIM PIN" if self.sim == "locked" else "+CPIN: READY", "OK")
        elif entered and entered[1] == PIN:
            self.sim = "ready"
            self.say("OK")
        else:
            self.say("+CME ERROR: 16")

    async def submit(self, length, reader):
        self.writer.write(b"\r\n> ")
        data = bytes.fromhex((await reader.readuntil(b"\x1a"))[:-1].decode("ascii").strip())
        async with self.handed:
            self.parts += 1
            self.handed.notify_all()
        if self.network == "silent":
            return
        if self.network == "refuse":
            self.say("+CMS ERROR: 38")  # network out of order
            return
        centre = data[0] + 1
        if len(data) - centre != length:
            self.say("+CMS ERROR: 304")  # invalid PDU
            return
        whole = self.assembler.add(decode_submit(data[centre:]))
        if whole:
            self.deliver(self.slot, *whole)
        self.reference = (self.reference + 1) % 256
        self.say(f"+CMGS: {self.reference}", "OK")


class Outbox:
    def __init__(self, path):
        self.path = path

    def append(self, slot, to, text):
        record = {"to": to, "text": text, "sim": slot, "time": time.strftime("%Y-%m-%dT%H:%M:%SZ", time.gmtime())}
        with open(self.path, "a", encoding="utf-8") as file:
            file.write(json.dumps(record, ensure_ascii=False) + "\n")
            file.flush()
            os.fsync(file.fileno())


class Service:
    """The modem service: the real ofonod, with the modems as its only devices."""

    def __init__(self, state, ports):
        from gi.repository import Gio, GLib
        self.gio, self.glib = Gio, GLib
        self.log = os.path.join(state, "ofonod.log")
        self.config = os.path.join(state, "phonesim.conf")
        with open(self.config, "w", encoding="ascii") as file:
            for slot, port in enumerate(ports, 1):
                file.write(f"[phonesim{slot}]\nAddress=127.0.0.1\nPort={port}\n")
        self.slots = len(ports)
        self.process = None

    def _call(self, path, interface, method, arguments=None, service="org.ofono"):
        bus = self.gio.bus_get_sync(self.gio.BusType.SYSTEM)
        return bus.call_sync(service, path, interface, method, arguments, None, self.gio.DBusCallFlags.NO_AUTO_START,
                             LIMIT * 1000)

    async def call(self, *arguments):
        return await asyncio.to_thread(self._call, *arguments)

    async def start(self):
        if self.process and self.process.returncode is None:
            return
        with open(self.log, "ab") as log:
            self.process = await asyncio.create_subprocess_exec(
                "ofonod", "-n", "-d", "-p", "phonesim,atmodem,udev_none", stdout=log, stderr=log,
                env={**os.environ, "OFONO_PHONESIM_CONFIG": self.config})
        await asyncio.to_thread(self._until, lambda: self._properties(1, "org.ofono.Modem"), "ofonod")

    def _until(self, condition, what):
        """Waits until condition() holds; it is looked at after whatever oFono announces."""
        context = self.glib.MainContext.new()
        context.push_thread_default()
        late = []
        bus = self.gio.bus_get_sync(self.gio.BusType.SYSTEM)
        heard = bus.signal_subscribe("org.ofono", None, None, None, None, self.gio.DBusSignalFlags.NONE,
                                     lambda *_: None)
        watch = self.gio.bus_watch_name(self.gio.BusType.SYSTEM, "org.ofono", self.gio.BusNameWatcherFlags.NONE,
                                        None, None)
        timer = self.glib.timeout_source_new_seconds(LIMIT // 2)
        timer.set_callback(lambda *_: late.append(True) or True)
        timer.attach(context)
        try:
            while not condition():
                if late:
                    raise RuntimeError(f"waited in vain for {what}")
                context.iteration(True)
        finally:
            timer.destroy()
            bus.signal_unsubscribe(heard)
            self.gio.bus_unwatch_name(watch)
            context.pop_thread_default()

    def _properties(self, slot, interface):
        try:
            return self._call(f"/phonesim{slot}", interface, "GetProperties").unpack()[0]
        except self.glib.Error:
            return {}

    def _sim_is_read(self, slot):
        return bool(self._properties(slot, "org.ofono.SimManager").get("SubscriberIdentity"))

    def _asks_for_pin(self, slot):
        return self._properties(slot, "org.ofono.SimManager").get("PinRequired", "none") != "none"

    async def wait_locked(self, slot):
        """oFono sees that there is a card before it sees that the card is locked."""
        await asyncio.to_thread(self._until, lambda: self._asks_for_pin(slot), "oFono to ask for the PIN")

    @staticmethod
    def forget():
        """Messages that oFono had not got rid of would be sent when it runs again."""
        for folder in os.listdir(STORE):
            shutil.rmtree(os.path.join(STORE, folder))

    async def end(self, number):
        if self.process and self.process.returncode is None:
            self.process.send_signal(number)
            await self.process.wait()

    async def set(self, slot, name, value):
        await self.call(f"/phonesim{slot}", "org.ofono.Modem", "SetProperty",
                        self.glib.Variant("(sv)", (name, self.glib.Variant("b", value))))

    async def go_online(self, slot):
        """oFono does not survive being sent online before it has read the SIM."""
        await asyncio.to_thread(self._until, lambda: self._sim_is_read(slot), "the SIM to be read")
        await self.set(slot, "Online", True)
        await asyncio.to_thread(self._until, lambda: "org.ofono.MessageManager" in self._properties(
            slot, "org.ofono.Modem").get("Interfaces", []), "the modem to take messages")

    async def enter_pin(self, slot, pin):
        await self.call(f"/phonesim{slot}", "org.ofono.SimManager", "EnterPin",
                        self.glib.Variant("(ss)", ("pin", pin)))
        # This driver hears of no notice that the card is usable now; it finds out when it starts again.
        await self.set(slot, "Powered", False)
        await self.set(slot, "Powered", True)
        await self.go_online(slot)


class Phone:
    def __init__(self, modems, service):
        self.modems, self.service = modems, service

    async def control(self, reader, writer):
        try:
            while line := await reader.readline():
                try:
                    await asyncio.wait_for(self.obey(line.decode().split()), LIMIT)
                    writer.write(b"ok\n")
                except Exception as error:  # the other side is told whatever went wrong
                    writer.write(f"failed: {error!r}\n".encode())
                await writer.drain()
        except ConnectionError:
            pass
        finally:
            writer.close()

    async def obey(self, words):
        command, *rest = words
        if command == "service":
            await self.obey_service(rest[0])
            return
        if command == "reset":
            await self.service.end(signal.SIGKILL)
            for modem in self.modems:
                modem.reset()
            self.service.forget()
            await self.start()
            return
        modem = self.modems[int(rest[0]) - 1]
        if command in ("refuse", "accept", "silent"):
            modem.network = command
        elif command == "drop":
            modem.writer.close()
        elif command == "sim":
            modem.insert(rest[1])
        elif command == "power":
            await self.power(modem, rest[1] == "on")
        elif command == "enter-pin":
            await self.service.enter_pin(modem.slot, rest[1])
        elif command == "wait-message":
            async with modem.handed:
                await modem.handed.wait_for(lambda: modem.parts >= int(rest[1]))
        else:
            raise ValueError(f"unknown command {command}")

    async def power(self, modem, on):
        await self.service.set(modem.slot, "Powered", on)
        if on and modem.sim == "ready":
            await self.service.go_online(modem.slot)
        elif on and modem.sim == "locked":
            await self.service.wait_locked(modem.slot)

    async def start(self):
        await self.service.start()
        for modem in self.modems:
            await self.power(modem, True)

    async def obey_service(self, what):
        if what == "start":
            await self.start()
        elif what == "hang":
            self.service.process.send_signal(signal.SIGSTOP)
        else:
            await self.service.end(signal.SIGKILL if what == "kill" else signal.SIGTERM)


async def run(options):
    outbox = Outbox(options.outbox)
    modems = [Modem(slot, imsi, outbox.append) for slot, imsi in enumerate(options.imsi.split(","), 1)]
    ports = []
    for modem in modems:
        server = await asyncio.start_server(modem.serve, "127.0.0.1", 0)
        ports.append(server.sockets[0].getsockname()[1])
    service = Service(options.state, ports)
    phone = Phone(modems, service)
    ending = asyncio.Event()
    for number in (signal.SIGTERM, signal.SIGINT):
        asyncio.get_running_loop().add_signal_handler(number, ending.set)
    try:
        await phone.start()
        await asyncio.start_unix_server(phone.control, options.control)
        if options.ready_fd is not None:
            with os.fdopen(options.ready_fd, "w") as tell:
                tell.write("ready\n")
        await ending.wait()
    finally:
        await service.end(signal.SIGTERM)


def tell(options):
    with socket.socket(socket.AF_UNIX) as line:
        line.connect(options.control)
        line.sendall((" ".join(options.command) + "\n").encode())
        answer = line.makefile().readline().strip()
    if answer != "ok":
        print(f"phonesim: {answer or 'no answer'}", file=sys.stderr)
        return 1
    return 0


def main():
    parser = argparse.ArgumentParser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    commands = parser.add_subparsers(required=True)
    running = commands.add_parser("run")
    running.add_argument("--imsi", required=True)
    running.add_argument("--state", required=True)
    running.add_argument("--outbox", required=True)
    running.add_argument("--control", required=True)
    running.add_argument("--ready-fd", type=int)
    running.set_defaults(do=lambda options: asyncio.run(run(options)))
    telling = commands.add_parser("tell")
    telling.add_argument("control")
    telling.add_argument("command", nargs="+")
    telling.set_defaults(do=tell)
    options = parser.parse_args()
    return options.do(options) or 0


if __name__ == "__main__":
    sys.exit(main())
