"""The real ModemManager on the private system bus, with one simulated modem behind its generic plugin.

    /usr/bin/python3 real_modemmanager.py IMSI OUTBOX

Says "ready" on standard output once the modem is registered with its network. What the network takes is appended to
OUTBOX as JSON lines. Takes one command per line from standard input and answers "ok": what the network does from now
on (accept, refuse, silent), whether users may send (allow, deny), kill (of the service), wait-message (until a message
has reached the modem since the network was told what to do). Ends with everything it started when standard input ends.
"""

import asyncio
import os
import subprocess
import sys
import threading

from gi.repository import Gio, GLib

sys.dont_write_bytecode = True
sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), '..', '..', '..', 'scripts', 'lib'))

import phonesim  # noqa: E402

BUS_NAME = 'org.freedesktop.ModemManager1'
MAIN_OBJ = '/org/freedesktop/ModemManager1'
POLICY = 'org.freedesktop.PolicyKit1'
# The name is the one that the service gives to a port that is no device.
PORT = 'abstract:pelliko-modem'
PATIENCE = 30


class Modem(phonesim.Modem):
    """Answers, beyond the simulated modem, what this service wants to know before it takes a modem."""

    ANSWERS = {
        '+GCAP': '+GCAP: +CGSM',
        '+CPMS?': '+CPMS: "SM",0,20,"SM",0,20,"SM",0,20',
        # The SIM's file that says how long the network code is.
        '+CRSM=176,28589,0,0,4': '+CRSM: 144,0,"00000002"',
    }

    async def command(self, line, reader):
        answer = self.ANSWERS.get(line[2:])
        if answer:
            self.say(answer, 'OK')
        else:
            await super().command(line, reader)


class Line:
    """The modem's end of the port, on a thread with a loop of its own."""

    def __init__(self, modem):
        self.modem, self.loop, self.up = modem, asyncio.new_event_loop(), threading.Event()
        threading.Thread(target=self._run, daemon=True).start()
        self.up.wait(PATIENCE)

    def _run(self):
        asyncio.set_event_loop(self.loop)
        self.loop.run_until_complete(asyncio.start_unix_server(self.modem.serve, path='\0' + PORT))
        self.up.set()
        self.loop.run_forever()

    def set_network(self, network):
        self.modem.network, self.parts_before = network, self.modem.parts

    def wait_for_message(self):
        asyncio.run_coroutine_threadsafe(self._message(), self.loop).result(PATIENCE)

    async def _message(self):
        async with self.modem.handed:
            await self.modem.handed.wait_for(lambda: self.modem.parts > self.parts_before)


def call(name, path, interface, method, arguments=None):
    return Gio.bus_get_sync(Gio.BusType.SYSTEM).call_sync(
        name, path, interface, method, arguments, None, Gio.DBusCallFlags.NONE, PATIENCE * 1000)


def wait_for(name):
    subprocess.run(['gdbus', 'wait', '--system', '--timeout', str(PATIENCE), name], check=True)


def start(name, *words):
    process = subprocess.Popen(words, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
    wait_for(name)
    return process


def allow(users_may):
    call(POLICY, '/org/freedesktop/PolicyKit1/Authority', 'org.freedesktop.DBus.Mock', 'AllowUnknown',
         GLib.Variant('(b)', (users_may,)))


def bring_up_modem():
    call(BUS_NAME, MAIN_OBJ, BUS_NAME + '.Test', 'SetProfile', GLib.Variant('(ssas)', ('one', 'generic', [PORT])))
    manager = Gio.DBusObjectManagerClient.new_for_bus_sync(
        Gio.BusType.SYSTEM, Gio.DBusObjectManagerClientFlags.NONE, BUS_NAME, MAIN_OBJ, None, None, None)
    late = []
    GLib.timeout_add_seconds(PATIENCE, lambda: late.append(True) or True)
    while not manager.get_objects():
        if late:
            sys.exit('real_modemmanager: the service did not take the modem')
        GLib.MainContext.default().iteration(True)
    path = manager.get_objects()[0].get_object_path()
    call(BUS_NAME, path, BUS_NAME + '.Modem', 'Enable', GLib.Variant('(b)', (True,)))


def obey(command, line, service):
    if command in ('accept', 'refuse', 'silent'):
        line.set_network(command)
    elif command in ('allow', 'deny'):
        allow(command == 'allow')
    elif command == 'kill':
        service.kill()
        service.wait()
    elif command == 'wait-message':
        line.wait_for_message()
    else:
        return f'no such command: {command}'
    return 'ok'


def main():
    imsi, outbox = sys.argv[1:]
    line = Line(Modem(1, imsi, phonesim.Outbox(outbox).append))
    children = [start(POLICY, sys.executable, '-m', 'dbusmock', '--template', 'polkitd')]
    try:
        allow(True)
        service = start(BUS_NAME, 'ModemManager', '--test-enable', '--test-no-udev', '--test-no-qrtr',
                        '--test-no-suspend-resume', '--no-auto-scan')
        children.append(service)
        bring_up_modem()
        print('ready', flush=True)
        for command in sys.stdin:
            print(obey(command.strip(), line, service), flush=True)
    finally:
        for child in children:
            child.kill()
            child.wait()


main()
