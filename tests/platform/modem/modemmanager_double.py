"""A modem service that behaves as a test tells it to: org.freedesktop.ModemManager1 on a private system bus.

    /usr/bin/python3 -m dbusmock --template modemmanager_double.py

For the ways of a modem that a real one cannot be steered into. It answers with the service's own names, values and
errors; what it is to do comes by the methods of org.freedesktop.DBus.Mock below, on the service's main object.
"""

import os

import dbus
import dbus.service

from dbusmock import MOCK_IFACE
from dbusmock.mockobject import DBusMockObject, objects

BUS_NAME = 'org.freedesktop.ModemManager1'
MAIN_OBJ = '/org/freedesktop/ModemManager1'
MAIN_IFACE = 'org.freedesktop.ModemManager1'
SYSTEM_BUS = True
IS_OBJECT_MANAGER = True

MODEM = MAIN_IFACE + '.Modem'
MESSAGING = MODEM + '.Messaging'
SIM = MAIN_IFACE + '.Sim'
SMS = MAIN_IFACE + '.Sms'
BEARER = MAIN_IFACE + '.Bearer'
OBJECT_MANAGER = 'org.freedesktop.DBus.ObjectManager'

NONE = dbus.ObjectPath('/')
UNLOCKED = 1
STATE_FAILED, STATE_LOCKED, STATE_REGISTERED, STATE_CONNECTED = -1, 2, 8, 11
SIM_MISSING = 2
SMS_STATE_UNKNOWN, SMS_STATE_SENDING, SMS_STATE_SENT = 0, 4, 5


def load(mock, _parameters):
    mock.AddProperty(MAIN_IFACE, 'Version', '1.20.4')
    # Only modems are listed: the real service keeps SIMs, bearers and messages out of it too.
    mock.AddMethod(OBJECT_MANAGER, 'GetManagedObjects', '', 'a{oa{sa{sv}}}',
                   'ret = {dbus.ObjectPath(k): v.props for k, v in objects.items() if "/Modem/" in k}')
    mock.serial = 0
    mock.sending = 'succeed'
    mock.attempts = []
    mock.unanswered = []


def main_object():
    return objects[MAIN_OBJ]


def next_path(kind):
    main_object().serial += 1
    return dbus.ObjectPath(f'{MAIN_OBJ}/{kind}/{main_object().serial}')


def add_object(path, interface, properties):
    main = main_object()
    made = DBusMockObject(main.bus_name, path, interface, properties)
    made.logfile, made.is_logfile_owner, made.object_manager = main.logfile, False, main
    objects[path] = made
    return made


def change(changed, interface, properties):
    changed.props[interface].update(properties)
    changed.EmitSignal(dbus.PROPERTIES_IFACE, 'PropertiesChanged', 'sa{sv}as', [
        interface, dbus.Dictionary(properties, signature='sv'), dbus.Array([], signature='s')])


def error(name, text):
    return dbus.exceptions.DBusException(text, name=f'{MAIN_IFACE}.Error.{name}')


def add_sim(imsi, operator):
    path = next_path('SIM')
    add_object(path, SIM, {'Active': dbus.Boolean(True), 'Imsi': dbus.String(imsi),
                           'OperatorIdentifier': dbus.String(operator), 'OperatorName': dbus.String(''),
                           'SimIdentifier': dbus.String('8944')})
    return path


def forget_sim(modem):
    sim = modem.props[MODEM]['Sim']
    if sim != NONE:
        main_object().RemoveObject(sim)


@dbus.service.method(MOCK_IFACE, in_signature='usss', out_signature='o')
def AddModem(_self, slot, device, imsi, operator):
    """A modem with an unlocked SIM, registered with its network; slot 0 is a modem that does not say."""
    path = next_path('Modem')
    modem = add_object(path, MODEM, {
        'Sim': add_sim(imsi, operator), 'PrimarySimSlot': dbus.UInt32(slot), 'UnlockRequired': dbus.UInt32(UNLOCKED),
        'State': dbus.Int32(STATE_REGISTERED), 'StateFailedReason': dbus.UInt32(0),
        'Bearers': dbus.Array([], signature='o'), 'Model': dbus.String('Double'),
        'Manufacturer': dbus.String('Test'), 'Device': dbus.String(device),
        'SignalQuality': dbus.Struct((dbus.UInt32(50), dbus.Boolean(True)), signature='ub')})
    modem.AddProperty(MESSAGING, 'Messages', dbus.Array([], signature='o'))
    modem.object_manager_emit_added(path)
    return path


@dbus.service.method(MOCK_IFACE, in_signature='o', out_signature='')
def RemoveModem(self, path):
    objects[path].object_manager_emit_removed(path)
    forget_sim(objects[path])
    self.RemoveObject(path)


@dbus.service.method(MOCK_IFACE, in_signature='o', out_signature='')
def TakeSim(_self, path):
    modem = objects[path]
    forget_sim(modem)
    change(modem, MODEM, {'Sim': NONE, 'State': dbus.Int32(STATE_FAILED),
                          'StateFailedReason': dbus.UInt32(SIM_MISSING)})


@dbus.service.method(MOCK_IFACE, in_signature='oss', out_signature='')
def InsertSim(_self, path, imsi, operator):
    change(objects[path], MODEM, {'Sim': add_sim(imsi, operator), 'State': dbus.Int32(STATE_REGISTERED),
                                  'StateFailedReason': dbus.UInt32(0), 'UnlockRequired': dbus.UInt32(UNLOCKED)})


@dbus.service.method(MOCK_IFACE, in_signature='oss', out_signature='')
def ReadSim(_self, path, imsi, operator):
    """The SIM that is in tells its IMSI only now, as after the PIN was typed."""
    change(objects[objects[path].props[MODEM]['Sim']], SIM, {
        'Imsi': dbus.String(imsi), 'OperatorIdentifier': dbus.String(operator)})


@dbus.service.method(MOCK_IFACE, in_signature='ou', out_signature='')
def Lock(_self, path, lock):
    state = STATE_REGISTERED if lock == UNLOCKED else STATE_LOCKED
    change(objects[path], MODEM, {'UnlockRequired': dbus.UInt32(lock), 'State': dbus.Int32(state)})


@dbus.service.method(MOCK_IFACE, in_signature='ob', out_signature='')
def Connect(_self, path, connected):
    """Data goes through this modem, or no longer does."""
    modem = objects[path]
    bearers = [add_object(next_path('Bearer'), BEARER, {'Connected': dbus.Boolean(True)}).path] if connected else []
    change(modem, MODEM, {
        'Bearers': dbus.Array([dbus.ObjectPath(bearer) for bearer in bearers], signature='o'),
        'State': dbus.Int32(STATE_CONNECTED if connected else STATE_REGISTERED)})


@dbus.service.method(MOCK_IFACE, in_signature='oiu', out_signature='')
def SetState(_self, path, state, reason):
    change(objects[path], MODEM, {'State': dbus.Int32(state), 'StateFailedReason': dbus.UInt32(reason)})


@dbus.service.method(MOCK_IFACE, in_signature='ou', out_signature='')
def SetSignal(_self, path, percent):
    change(objects[path], MODEM, {
        'SignalQuality': dbus.Struct((dbus.UInt32(percent), dbus.Boolean(True)), signature='ub', variant_level=1)})


@dbus.service.method(MOCK_IFACE, in_signature='s', out_signature='')
def SetSending(self, how):
    """How messages fare from now on: succeed, refuse-create, refuse, silent or die. What was left
    unanswered until then is answered."""
    self.sending = str(how)
    for answer, fail in self.unanswered:
        if how == 'succeed':
            answer()
        else:
            fail(error('Message.NetworkTimeout', 'Network timeout'))
    self.unanswered = []


@dbus.service.method(MOCK_IFACE, in_signature='', out_signature='a(oss)')
def Attempts(self):
    """Every message that was to be sent: modem, number, text."""
    return dbus.Array(self.attempts, signature='(oss)')


@dbus.service.method(MOCK_IFACE, in_signature='o', out_signature='ao')
def Stored(_self, path):
    """The messages that take up room in the modem's store."""
    return objects[path].props[MESSAGING]['Messages']


def keep(modem, messages):
    change(modem, MESSAGING, {'Messages': dbus.Array(messages, signature='o')})


@dbus.service.method(MESSAGING, in_signature='a{sv}', out_signature='o')
def Create(self, properties):
    if main_object().sending == 'refuse-create':
        raise error('MobileEquipment.MemoryFull', 'Memory full')
    path = next_path('SMS')
    made = add_object(path, SMS, {'Number': properties['number'], 'Text': properties['text'],
                                  'State': dbus.UInt32(SMS_STATE_UNKNOWN)})
    made.modem = self
    keep(self, list(self.props[MESSAGING]['Messages']) + [path])
    return path


@dbus.service.method(MESSAGING, in_signature='o', out_signature='')
def Delete(self, path):
    left = [message for message in self.props[MESSAGING]['Messages'] if message != path]
    if len(left) == len(self.props[MESSAGING]['Messages']):
        raise error('Core.NotFound', 'no such message')
    main_object().RemoveObject(path)
    keep(self, left)


@dbus.service.method(SMS, in_signature='', out_signature='', async_callbacks=('answer', 'fail'))
def Send(self, answer, fail):
    main = main_object()
    main.attempts.append((dbus.ObjectPath(self.modem.path), self.props[SMS]['Number'], self.props[SMS]['Text']))
    if main.sending == 'die':
        os._exit(0)
    if main.sending == 'refuse':
        fail(error('Message.NetworkTimeout', 'Network timeout'))
        return
    if main.sending == 'silent':
        change(self, SMS, {'State': dbus.UInt32(SMS_STATE_SENDING)})
        main.unanswered.append((answer, fail))
        return
    change(self, SMS, {'State': dbus.UInt32(SMS_STATE_SENT)})
    answer()
